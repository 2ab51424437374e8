// tests/test_platform.h: the tests' side of the engine's platform seam.
// Each call is counted so a test can see what the core asked for.
#pragma once
#include <cstdint>

struct PlatformCalls {
    int32_t Stops;          // StopPlayback calls
    int32_t Chimes;         // StartChime calls
    int32_t PeakUpdates;    // UpdatePeaks calls
    int32_t PeakRight;      // peaks of the last UpdatePeaks, truncated
    int32_t PeakLeft;
    int32_t ClockHour;      // what ReadLocalClock answers
    int32_t ClockMinute;
};

extern PlatformCalls Platform;

// Start values for the engine and the control record, as at program start,
// and a cleared call record.
void ResetProgramState();
