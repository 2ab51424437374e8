#include "timers/timer_gains.h"

#include <cmath>

#include "app/core_state.h"
#include "engine/platform.h"

namespace {

constexpr int32_t MinutesPerDay = 1440;

// Blocks in `minutes` of sound, rounded down: minutes * 351.5625, exact in double.
int64_t BlocksIn(int32_t minutes) {
    return static_cast<int64_t>(minutes * static_cast<double>(FramesPerMinute) * (1.0 / BlockFrames));
}

// Multiplies both channels by 10^x(n) frame by frame, the same gain for both.
// `count` advances once per frame before x is taken from it.
template <typename GainExponent>
void ApplyRamp(float* direct, float* reversed, int64_t* count, GainExponent exponent) {
    for (int32_t i = 0; i < BlockFrames; ++i) {
        *count += 1;
        const double g = std::pow(10.0, exponent(*count));
        direct[i] = static_cast<float>(g * direct[i]);
        reversed[i] = static_cast<float>(g * reversed[i]);
    }
}

}  // namespace

TimePair MinutesUntil(TimePair target, TimePair current) {
    int32_t d = (target.Hours - current.Hours) * 60 - current.Minutes + target.Minutes;
    if (d < 0) d += MinutesPerDay;
    return TimePair{d / 60, d % 60};
}

TimePair TargetTime(const ControlRecord* settings) {
    TimePair target{settings->Value[Alarm_Hr], settings->Value[Alarm_Min]};
    if (settings->Value[Alarm_PM] == 1 && target.Hours < 12) target.Hours += 12;
    if (settings->Value[Alarm_AM] == 1 && target.Hours == 12) target.Hours = 0;
    return target;
}

void SetUpTimersAt(TimePair now, const ControlRecord* settings, SynthRecord* state) {
    const int32_t* v = settings->Value;
    state->StopBlock = 0;
    state->FadeOutStartBlock = 0;
    state->FadeOutLength = 0;
    state->FadeOutCount = 0;
    if (v[FadeOutOn] == 1 || v[AlarmOn] == 1 || v[PlayUntilOn] == 1) {
        const TimePair until = MinutesUntil(TargetTime(settings), now);
        const int32_t total = until.Hours * 60 + until.Minutes;
        int32_t start = total - v[FadeOutTime];
        if (start < 0) start = total;  // no room for the whole fade: it does not start early
        state->FadeOutStartBlock = BlocksIn(start);
        state->StopBlock = BlocksIn(total);
    }
    if (v[FadeOutOn] == 1) {
        state->FadeOutLength = static_cast<int64_t>(v[FadeOutTime]) * FramesPerMinute;
        state->FadeOutSlopeDb = static_cast<float>(-static_cast<double>(state->RampDepthDb) /
                                                   static_cast<double>(state->FadeOutLength));
    }
}

void SetUpTimers(const ControlRecord* settings, SynthRecord* state) {
    TimePair now{0, 0};
    ReadLocalClock(&now.Hours, &now.Minutes);
    SetUpTimersAt(now, settings, state);
}

void ApplyTimerGains(float* direct, float* reversed, int32_t blockIndex) {
    SynthRecord* s = &SynthState;
    const int32_t* v = ControlSettings.Value;
    const double depth = s->RampDepthDb;

    // Start ramp: -20 dB to 0 dB over the 16384 frames of blocks 0 and 1;
    // a later wrap of the block index to 0 finds the count complete.
    if ((blockIndex == 0 || blockIndex == 1) && s->StartRampCount < StartRampFrames) {
        const double slope = s->StartRampSlopeDb;
        ApplyRamp(direct, reversed, &s->StartRampCount,
                  [&](int64_t n) { return (n * slope - depth) * 0.05; });
    }
    // Fade-in: tested once per block, so the last fade-in block runs the
    // same law to its end, slightly past 0 dB.
    if (v[FadeInOn] == 1 && s->FadeInCount < s->FadeInLength) {
        const double slope = s->FadeInSlopeDb;
        ApplyRamp(direct, reversed, &s->FadeInCount,
                  [&](int64_t n) { return (n * slope - depth) * 0.05; });
    }
    // Fade-out: falls to -20 dB and holds there. A zero length (Fade Out
    // checked with no minutes set) would make the slope infinite and the
    // gain NaN, so it fades nothing.
    if (v[FadeOutOn] == 1 && static_cast<int64_t>(blockIndex) > s->FadeOutStartBlock &&
        s->FadeOutLength > 0) {
        const double slope = s->FadeOutSlopeDb;
        const int64_t length = s->FadeOutLength;
        for (int32_t i = 0; i < BlockFrames; ++i) {
            s->FadeOutCount += 1;
            if (s->FadeOutCount > length) s->FadeOutCount = length;
            const double g = std::pow(10.0, s->FadeOutCount * slope * 0.05);
            direct[i] = static_cast<float>(g * direct[i]);
            reversed[i] = static_cast<float>(g * reversed[i]);
        }
    }
    if ((v[PlayUntilOn] == 1 || v[AlarmOn] == 1) && static_cast<int64_t>(blockIndex) > s->StopBlock) {
        StopPlayback();
        if (v[AlarmOn] == 1) StartChime();
    }
}
