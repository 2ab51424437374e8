#include "tests/test_platform.h"

#include "app/core_state.h"
#include "engine/block.h"
#include "engine/platform.h"
#include "engine/vector_ops.h"

PlatformCalls Platform;

void StopPlayback() { Platform.Stops += 1; }
void StartChime() { Platform.Chimes += 1; }
void UpdatePeaks(const float* right, const float* left) {
    Platform.PeakUpdates += 1;
    Platform.PeakRight = PeakMagnitude(right, BlockFrames);
    Platform.PeakLeft = PeakMagnitude(left, BlockFrames);
}
void ReadLocalClock(int32_t* hour, int32_t* minute) { *hour = Platform.ClockHour, *minute = Platform.ClockMinute; }

void ResetProgramState() {
    Platform = PlatformCalls{};
    SetControlStartValues(&ControlSettings);
    InitEngine(&SynthState);
}
