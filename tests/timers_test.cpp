// The timers: the stop and fade-out blocks from the clock and the alarm's
// dial, the start ramp and the fades frame by frame against their laws, the
// stop check, and the alarm chime.
#include <gtest/gtest.h>
#include <algorithm>
#include <cmath>
#include <cstdio>
#include <cstring>
#include <vector>
#include "app/core_state.h"
#include "engine/block.h"
#include "timers/chime.h"
#include "timers/timer_gains.h"
#include "tests/test_platform.h"

namespace {

// Each gain is 10^x to ~1e-13 (a geometric sequence anchored with pow),
// rounded into a float product: the sample's float rounding (6e-8 relative)
// is all that may differ from the law.
constexpr double kGainTolerance = 1.2e-7;

// Runs the gain stage on a block of 1000s (right) and -500s (left) and
// checks every frame against 10^law(count), count = first + frame + 1.
void ExpectBlock(int32_t index, double (*law)(int64_t), int64_t first, const char* what) {
    std::vector<float> right(BlockFrames, 1000.0f), left(BlockFrames, -500.0f);
    ApplyTimerGains(right.data(), left.data(), index);
    for (int32_t i = 0; i < BlockFrames; ++i) {
        const double g = law ? std::pow(10.0, law(first + i + 1)) : 1.0;
        ASSERT_NEAR(right[i], 1000 * g, 1000 * g * kGainTolerance) << what << ", block " << index << ", frame " << i;
        ASSERT_NEAR(left[i], -500 * g, 500 * g * kGainTolerance) << what << ", block " << index << ", frame " << i;
    }
}

void Set(std::initializer_list<std::pair<int32_t, int32_t>> fields) { for (const auto& f : fields) ControlSettings.Value[f.first] = f.second; }

}  // namespace

TEST(StopTime, TheClockAndTheAlarmsDialGiveTheStopAndFadeOutBlocksAndTheStopComesAfterTheStopBlock) {
    // Switches s(top time), a(larm), o (fade out); the alarm's time on the
    // twelve-hour dial with AM or PM, else on the 24-hour one. A block is
    // 8192 of the 2880000 frames in a minute: whole minutes * 351.5625, down.
    // The block after the stop block stops Play with Stop Time or Alarm on,
    // and the alarm chimes.
    const struct { const char* On; const char* At; int32_t Now[2], FadeOut; int64_t Stop, FadeStart; } plans[] = {
        {"s", "10:06", {10, 5}, 0, 351, 351},        {"so", "22:30", {22, 0}, 5, 10546, 8789},     {"ao", "22:04", {22, 0}, 10, 1406, 1406},
        {"sa", "10:05", {10, 0}, 0, 1757, 1757},     {"", "10:05", {10, 0}, 5, 0, 0},              {"o", "0:30", {0, 0}, 15, 10546, 5273},
        {"s", "23:30", {23, 30}, 0, 0, 0},           {"s", "0:15", {23, 30}, 0, 15820, 15820},     {"s", "9:59", {10, 0}, 0, 505898, 505898},
        {"s", "23:59", {0, 0}, 0, 505898, 505898},   {"s", "12:00", {11, 1}, 0, 20742, 20742},     {"s", "12:00", {11, 0}, 0, 21093, 21093},
        {"s", "12:00 AM", {23, 0}, 0, 21093, 21093}, {"s", "12:00 PM", {11, 0}, 0, 21093, 21093}, {"s", "11:00 PM", {22, 0}, 0, 21093, 21093},
        {"s", "1:00 AM", {0, 0}, 0, 21093, 21093}};
    for (const auto& p : plans) {
        int32_t hour = 0, minute = 0;
        char half[3] = "";
        std::sscanf(p.At, "%d:%d %2s", &hour, &minute, half);
        ResetProgramState();
        Set({{PlayUntilOn, std::strchr(p.On, 's') != nullptr}, {AlarmOn, std::strchr(p.On, 'a') != nullptr}, {FadeOutOn, std::strchr(p.On, 'o') != nullptr},
             {FadeOutTime, p.FadeOut}, {Alarm_AM, std::strcmp(half, "AM") == 0}, {Alarm_PM, std::strcmp(half, "PM") == 0}, {Alarm_Hr, hour}, {Alarm_Min, minute}});
        Platform.ClockHour = p.Now[0], Platform.ClockMinute = p.Now[1];
        SetUpTimers(&ControlSettings, &SynthState);
        const int64_t length = std::strchr(p.On, 'o') ? p.FadeOut * FramesPerMinute : 0;
        EXPECT_TRUE(SynthState.StopBlock == p.Stop && SynthState.FadeOutStartBlock == p.FadeStart && SynthState.FadeOutLength == length &&
                    SynthState.FadeOutCount == 0 && (length == 0 || SynthState.FadeOutSlopeDb == static_cast<float>(-20.0 / length)))
            << "\"" << p.On << "\" at " << p.At << " from " << p.Now[0] << ":" << p.Now[1] << ": stop " << SynthState.StopBlock << ", fade from "
            << SynthState.FadeOutStartBlock << " over " << SynthState.FadeOutLength << "; expected " << p.Stop << ", " << p.FadeStart << ", " << length;
        const bool stops = std::strpbrk(p.On, "sa") != nullptr, chimes = std::strchr(p.On, 'a') != nullptr;
        std::vector<float> right(BlockFrames), left(BlockFrames);
        for (int64_t b : {p.Stop, p.Stop + 1}) {
            ApplyTimerGains(right.data(), left.data(), static_cast<int32_t>(b));
            EXPECT_TRUE(Platform.Stops == (stops && b > p.Stop) && Platform.Chimes == (chimes && b > p.Stop))
                << "\"" << p.On << "\", block " << b << ": " << Platform.Stops << " stops, " << Platform.Chimes << " chimes";
        }
    }
}

TEST(Ramps, TheStartRampTheFadeInAndTheFadeOutFollowTheirLawsFrameByFrame) {
    ResetProgramState();
    PrepareForPlay(&ControlSettings, &SynthState);
    double (*start)(int64_t) = [](int64_t n) { return (n * double(20.0f / 16384) - 20.0) * 0.05; };
    for (int32_t b = 0; b <= 2; ++b) ExpectBlock(b, b < 2 ? start : nullptr, 8192 * b, "start ramp");  // its last frame exactly 1
    ExpectBlock(0, nullptr, 0, "a wrap to block 0 does not ramp again");

    ResetProgramState();  // the last fade-in block runs the law to its end, past 0 dB
    Set({{FadeInOn, 1}, {FadeInTime, 1}});
    PrepareForPlay(&ControlSettings, &SynthState);
    SynthState.StartRampCount = StartRampFrames;
    double (*in)(int64_t) = [](int64_t n) { return (n * double(static_cast<float>(20.0 / FramesPerMinute)) - 20.0) * 0.05; };
    for (int32_t b = 0; b <= 352; ++b) ExpectBlock(b, b < 352 ? in : nullptr, 8192 * b, "fade-in of one minute");

    // Five minutes to a stop at 0:30 from 0:00: the fade-out starts after
    // block 8789 (FadeOutStartBlock), ends the last block played (10546) just
    // above -20 dB, and reaches -20 dB and holds it within the stopping block.
    ResetProgramState();
    Set({{FadeOutOn, 1}, {PlayUntilOn, 1}, {FadeOutTime, 5}, {Alarm_Hr, 0}, {Alarm_Min, 30}, {Alarm_AM, 0}, {Alarm_PM, 0}});
    SetUpTimers(&ControlSettings, &SynthState);
    SynthState.StartRampCount = StartRampFrames;
    double (*out)(int64_t) = [](int64_t n) { return std::min<int64_t>(n, 5 * FramesPerMinute) * double(static_cast<float>(-20.0 / (5 * FramesPerMinute))) * 0.05; };
    for (int32_t b = 8789; b <= 10547; ++b) ExpectBlock(b, b > 8789 ? out : nullptr, 8192 * (b - 8790), "fade-out of five minutes");
    SynthState.FadeOutLength = 0;  // Fade Out checked with no minutes set: nothing, not a division by 0
    ExpectBlock(8790, nullptr, 0, "fade-out of length 0");
}

TEST(Chime, QuarterOctavesFrom220EvenLeftOddRightAsLoudAsTheVolumeAndWithinOneLsbOfASinPerFrame) {
    float p[2 * ChimePartialCount];
    MakeChimePartials(p);
    EXPECT_TRUE(p[0] == 220.0f && std::fabs(p[1] - 261.6) < 0.05 && std::fabs(p[4] - 440) < 1e-4 && std::fabs(p[31] - 47359) < 1);
    EXPECT_TRUE(p[32] == 1.0f && p[33] == 1.0f && p[34] == static_cast<float>(1.0 / 3) && p[63] == 1.0f / 32);
    static float reference[2 * ChimeFrames];  // static: too large for the stack
    static int16_t pcm[2 * ChimeFrames];
    for (int32_t k = 0; k < ChimePartialCount; ++k) {  // a sin per frame and partial, float sums in partial order
        const double step = p[k] * double(0.0001308997f), amplitude = p[32 + k];
        for (int32_t n = 0; n < ChimeFrames; ++n)
            reference[2 * n + k % 2] = static_cast<float>(reference[2 * n + k % 2] + std::sin(n * step) * amplitude);
    }
    for (const auto& v : {std::make_pair(255, 32766), std::make_pair(128, 3276), std::make_pair(1, 327)}) {
        const float peak = MakeChime(v.first);
        std::vector<float> scaled(reference, reference + 2 * ChimeFrames);
        ScaleChime(scaled.data(), peak, pcm);
        int32_t worst = 0, loudest = 0;
        for (int32_t i = 0; i < 2 * ChimeFrames; ++i) {
            worst = std::max(worst, std::abs(pcm[i] - ChimePcm[i]));
            loudest = std::max(loudest, std::abs(int32_t{ChimePcm[i]}));
        }
        EXPECT_TRUE(worst <= 1 && loudest == v.second && static_cast<int32_t>(peak) == v.second && ChimePcm[2 * ChimeFrames - 2] != 0)
            << "volume " << v.first << ": " << worst << " LSB from the reference, loudest " << loudest;
    }
}
