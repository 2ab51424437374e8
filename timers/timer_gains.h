// timers/timer_gains.h: start ramp, fade-in, fade-out and the stop rule,
// counted in generated frames. The wall clock is read once, at Play.
#pragma once
#include <cstdint>
#include "app/control_settings.h"
#include "engine/synth_state.h"

// Blocks in `minutes` of sound, rounded down: minutes * 351.5625, exact in
// double. Inline, so the render tool's options need nothing else of the timers.
inline int64_t BlocksIn(int32_t minutes) {
    return static_cast<int64_t>(minutes * static_cast<double>(FramesPerMinute) * (1.0 / BlockFrames));
}

struct TimePair {
    int32_t Hours;
    int32_t Minutes;
};

// Difference from current to target on a 24-hour dial, 0..1439 minutes
// (equal times give 0), as whole hours and remaining minutes.
TimePair MinutesUntil(TimePair target, TimePair current);

// The settings' 12-hour time as a 24-hour pair: PM adds 12 below 12,
// AM turns 12 into 0, neither leaves the hour as it is.
TimePair TargetTime(const ControlRecord* settings);

// Stop block, fade-out start and fade-out length from the clock time
// `now` (seconds ignored). Sets all four to 0 first.
void SetUpTimersAt(TimePair now, const ControlRecord* settings, SynthRecord* state);

// SetUpTimersAt with the local clock (ReadLocalClock).
void SetUpTimers(const ControlRecord* settings, SynthRecord* state);

// Multiplies both channels (8192 floats each) by the start ramp, fade-in
// and fade-out gains (each frame's gain 10^x as pow gives it, apart from
// rare rounding of the float product), then runs the stop check, which may call
// StopPlayback and StartChime. Called once per block by GenerateBlock.
void ApplyTimerGains(float* direct, float* reversed, int32_t blockIndex);
