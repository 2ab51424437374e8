#include "timers/timer_gains.h"

#include <algorithm>
#include <cmath>

#include "app/core_state.h"
#include "engine/platform.h"

namespace {

constexpr int32_t MinutesPerDay = 1440;

// A ramp's gains 10^x(n), x linear in the frame count n, form a geometric
// sequence: each is the one before times 10^(dx). pow anchors the sequence
// at the first frame of every run of RampAnchorFrames, so that the drift of
// the products stays near 1e-13 relative and each float sample equals the
// one with a pow per frame, apart from rare rounding. Four frames are in
// flight, each stepping by 10^(4 dx), so the products do not wait on each
// other.
constexpr int32_t RampAnchorFrames = 512;

typedef double Double4 __attribute__((vector_size(32)));
typedef float Float4 __attribute__((vector_size(16)));

// samples[i] = float(g[i] * samples[i]) for four frames.
void Scale4(float* samples, Double4 g) {
    Float4 v;
    __builtin_memcpy(&v, samples, sizeof v);
    v = __builtin_convertvector(g * __builtin_convertvector(v, Double4), Float4);
    __builtin_memcpy(samples, &v, sizeof v);
}

// Multiplies both channels frame by frame by 10^x(count), the same gain for
// both; count advances once per frame before x is taken from it, but not
// past limit, where the gain holds.
template <typename GainExponent>
void ApplyRamp(float* direct, float* reversed, int64_t* count, int64_t limit, double dx, GainExponent exponent) {
    const int32_t running = static_cast<int32_t>(std::min<int64_t>(BlockFrames, std::max<int64_t>(0, limit - *count)));
    const double ratio = std::pow(10.0, dx), ratio4 = std::pow(10.0, 4 * dx);
    const int64_t first = *count + 1;  // the count at frame 0
    for (int32_t start = 0; start < running; start += RampAnchorFrames) {
        const int32_t end = std::min(running, start + RampAnchorFrames);
        Double4 g;
        g[0] = std::pow(10.0, exponent(first + start));
        for (int32_t l = 1; l < 4; ++l) g[l] = g[l - 1] * ratio;
        int32_t i = start;
        for (; i + 4 <= end; i += 4) {
            Scale4(direct + i, g);
            Scale4(reversed + i, g);
            g *= ratio4;
        }
        for (int32_t l = 0; i < end; ++i, ++l) {  // the fade-out reaching its end mid-block
            direct[i] = static_cast<float>(g[l] * direct[i]);
            reversed[i] = static_cast<float>(g[l] * reversed[i]);
        }
    }
    *count += running;
    if (running == BlockFrames) return;
    const double held = std::pow(10.0, exponent(*count));
    for (int32_t i = running; i < BlockFrames; ++i) {
        direct[i] = static_cast<float>(held * direct[i]);
        reversed[i] = static_cast<float>(held * reversed[i]);
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
    constexpr int64_t NoLimit = INT64_MAX;
    if ((blockIndex == 0 || blockIndex == 1) && s->StartRampCount < StartRampFrames) {
        const double slope = s->StartRampSlopeDb;
        ApplyRamp(direct, reversed, &s->StartRampCount, NoLimit, slope * 0.05,
                  [&](int64_t n) { return (n * slope - depth) * 0.05; });
    }
    // Fade-in: tested once per block, so the last fade-in block runs the
    // same law to its end, slightly past 0 dB.
    if (v[FadeInOn] == 1 && s->FadeInCount < s->FadeInLength) {
        const double slope = s->FadeInSlopeDb;
        ApplyRamp(direct, reversed, &s->FadeInCount, NoLimit, slope * 0.05,
                  [&](int64_t n) { return (n * slope - depth) * 0.05; });
    }
    // Fade-out: falls to -20 dB and holds there. A zero length (Fade Out
    // checked with no minutes set) would make the slope infinite and the
    // gain NaN, so it fades nothing.
    if (v[FadeOutOn] == 1 && static_cast<int64_t>(blockIndex) > s->FadeOutStartBlock &&
        s->FadeOutLength > 0) {
        const double slope = s->FadeOutSlopeDb;
        ApplyRamp(direct, reversed, &s->FadeOutCount, s->FadeOutLength, slope * 0.05,
                  [&](int64_t n) { return n * slope * 0.05; });
    }
    if ((v[PlayUntilOn] == 1 || v[AlarmOn] == 1) && static_cast<int64_t>(blockIndex) > s->StopBlock) {
        StopPlayback();
        if (v[AlarmOn] == 1) StartChime();
    }
}
