// The timers: the stop time's block arithmetic from the clock, the start
// ramp and the fades frame by frame against their laws, the stop check, and
// the alarm chime.
#include <gtest/gtest.h>
#include <algorithm>
#include <cmath>
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

void Set(std::initializer_list<std::pair<int32_t, int32_t>> fields) {
    for (const auto& f : fields) ControlSettings.Value[f.first] = f.second;
}

}  // namespace

TEST(StopTime, TheClockAndTheTwelveHourDialGiveTheStopAndFadeBlocks) {
    const struct { int32_t Target[2], Now[2], Minutes; } dial[] = {
        {{10, 5}, {10, 0}, 5}, {{10, 0}, {10, 0}, 0}, {{0, 15}, {23, 30}, 45}, {{9, 59}, {10, 0}, 1439}, {{23, 59}, {0, 0}, 1439}, {{12, 0}, {11, 1}, 59}};
    for (const auto& d : dial) {
        const TimePair t = MinutesUntil({d.Target[0], d.Target[1]}, {d.Now[0], d.Now[1]});
        EXPECT_TRUE(t.Hours * 60 + t.Minutes == d.Minutes && t.Minutes < 60) << d.Target[0] << ":" << d.Target[1] << " from " << d.Now[0] << ":" << d.Now[1];
    }
    ResetProgramState();
    const struct { int32_t Hour, Am, Pm, Hour24; } hours[] = {{12, 1, 0, 0}, {12, 0, 1, 12}, {11, 0, 1, 23}, {1, 1, 0, 1}, {7, 0, 0, 7}, {12, 0, 0, 12}};
    for (const auto& h : hours) {
        Set({{Alarm_Hr, h.Hour}, {Alarm_AM, h.Am}, {Alarm_PM, h.Pm}});
        EXPECT_EQ(TargetTime(&ControlSettings).Hours, h.Hour24) << h.Hour << (h.Am ? " AM" : h.Pm ? " PM" : "");
    }
    // Switches s(top time), a(larm), o (fade out); the stop time on a 24-hour dial.
    const struct { const char* On; int32_t At[2], Now[2], FadeOut; int64_t Stop, FadeStart, FadeLength; } plans[] = {
        {"s", {10, 6}, {10, 5}, 0, 351, 351, 0},                {"so", {22, 30}, {22, 0}, 5, 10546, 8789, 5 * 2880000},
        {"ao", {22, 4}, {22, 0}, 10, 1406, 1406, 10 * 2880000}, {"s", {10, 5}, {10, 0}, 0, 1757, 1757, 0},
        {"", {10, 5}, {10, 0}, 5, 0, 0, 0},                      {"o", {0, 30}, {0, 0}, 15, 10546, 5273, 15 * 2880000},
        {"s", {23, 30}, {23, 30}, 0, 0, 0, 0}};
    for (const auto& p : plans) {
        ResetProgramState();
        Set({{PlayUntilOn, std::strchr(p.On, 's') != nullptr}, {AlarmOn, std::strchr(p.On, 'a') != nullptr}, {FadeOutOn, std::strchr(p.On, 'o') != nullptr},
             {FadeOutTime, p.FadeOut}, {Alarm_AM, 0}, {Alarm_PM, 0}, {Alarm_Hr, p.At[0]}, {Alarm_Min, p.At[1]}});
        Platform.ClockHour = p.Now[0];
        Platform.ClockMinute = p.Now[1];
        SetUpTimers(&ControlSettings, &SynthState);
        EXPECT_TRUE(SynthState.StopBlock == p.Stop && SynthState.FadeOutStartBlock == p.FadeStart && SynthState.FadeOutLength == p.FadeLength &&
                    SynthState.FadeOutCount == 0 && (p.FadeLength == 0 || SynthState.FadeOutSlopeDb == static_cast<float>(-20.0 / p.FadeLength)))
            << "\"" << p.On << "\" at " << p.At[0] << ":" << p.At[1] << ": stop " << SynthState.StopBlock << ", fade from "
            << SynthState.FadeOutStartBlock << " over " << SynthState.FadeOutLength;
    }
}

TEST(Ramps, TheStartRampTheFadeInAndTheFadeOutFollowTheirLawsFrameByFrame) {
    ResetProgramState();
    PrepareForPlay(&ControlSettings, &SynthState);
    const auto start = [](int64_t n) { return (n * double(20.0f / 16384) - 20.0) * 0.05; };
    ExpectBlock(0, start, 0, "start ramp");
    ExpectBlock(1, start, 8192, "start ramp");  // its last frame exactly 1
    ExpectBlock(2, nullptr, 0, "after the start ramp");
    ExpectBlock(0, nullptr, 0, "a wrap to block 0 does not ramp again");

    ResetProgramState();
    Set({{FadeInOn, 1}, {FadeInTime, 1}});
    PrepareForPlay(&ControlSettings, &SynthState);
    SynthState.StartRampCount = StartRampFrames;
    static double slope;
    slope = SynthState.FadeInSlopeDb;
    EXPECT_TRUE(SynthState.FadeInLength == 2880000 && slope == static_cast<float>(20.0 / 2880000));
    for (int32_t b = 0; b <= 351; ++b) ExpectBlock(b, [](int64_t n) { return (n * slope - 20.0) * 0.05; }, 8192 * b, "fade-in of one minute");
    EXPECT_EQ(SynthState.FadeInCount, 2883584) << "the last fade-in block runs to its end";
    ExpectBlock(352, nullptr, 0, "past the fade-in");

    ResetProgramState();  // a short fade-out: it falls, reaches -20 dB and holds
    Set({{FadeOutOn, 1}});
    SynthState.StartRampCount = StartRampFrames;
    SynthState.FadeOutStartBlock = 3;
    SynthState.FadeOutLength = 10000;
    SynthState.FadeOutSlopeDb = slope = static_cast<float>(-20.0 / 10000);
    ExpectBlock(3, nullptr, 0, "the block at FadeOutStartBlock");
    ExpectBlock(4, [](int64_t n) { return std::min<int64_t>(n, 10000) * slope * 0.05; }, 0, "fade-out");
    ExpectBlock(5, [](int64_t n) { return std::min<int64_t>(n, 10000) * slope * 0.05; }, 8192, "fade-out reaching -20 dB");
    ExpectBlock(6, [](int64_t n) { return std::min<int64_t>(n, 10000) * slope * 0.05; }, 16384, "fade-out holding -20 dB");
    SynthState.FadeOutLength = 0;  // Fade Out checked with no minutes set: nothing, not a division by 0
    ExpectBlock(7, nullptr, 0, "fade-out of length 0");
}

TEST(Ramps, AFiveMinuteFadeOutEndsJustAboveMinus20DbAtTheStop) {
    ResetProgramState();
    Set({{FadeOutOn, 1}, {PlayUntilOn, 1}, {FadeOutTime, 5}, {Alarm_Hr, 0}, {Alarm_Min, 30}, {Alarm_AM, 0}, {Alarm_PM, 0}});
    SetUpTimers(&ControlSettings, &SynthState);
    SynthState.StartRampCount = StartRampFrames;
    std::vector<float> right(BlockFrames), left(BlockFrames);
    for (int32_t b = 8790; b <= 10547; ++b) {
        std::fill(right.begin(), right.end(), 1000.0f);
        ApplyTimerGains(right.data(), left.data(), b);
        EXPECT_TRUE(b != 10546 || std::fabs(20 * std::log10(right[8191] / 1000.0) + 19.99) < 0.005) << "the last block played ends at "
                                                                                                     << 20 * std::log10(right[8191] / 1000.0) << " dB";
        EXPECT_EQ(Platform.Stops, b == 10547) << "block " << b;
    }
    EXPECT_EQ(SynthState.FadeOutCount, SynthState.FadeOutLength) << "the count reaches the length in the stopping block";
}

TEST(StopCheck, StopsAfterStopBlockWithStopTimeOrAlarmAndTheAlarmChimes) {
    const struct { int32_t Until, Alarm, Block, Stops, Chimes; } cases[] = {
        {0, 0, 352, 0, 0}, {1, 0, 351, 0, 0}, {1, 0, 352, 1, 0}, {0, 1, 351, 0, 0}, {0, 1, 352, 1, 1}, {1, 1, 400, 1, 1}};
    for (const auto& c : cases) {
        ResetProgramState();
        Set({{PlayUntilOn, c.Until}, {AlarmOn, c.Alarm}});
        SynthState.StopBlock = 351;
        ExpectBlock(c.Block, nullptr, 0, "stop check");
        EXPECT_TRUE(Platform.Stops == c.Stops && Platform.Chimes == c.Chimes) << "Stop Time " << c.Until << ", Alarm " << c.Alarm << ", block " << c.Block;
    }
    for (int32_t ahead : {0, 1}) {  // the current minute stops in the second priming block; a minute ahead in block 352
        ResetProgramState();
        Set({{AlarmOn, 1}, {Alarm_Hr, 11}, {Alarm_Min, 30 + ahead}, {Alarm_PM, 1}, {Alarm_AM, 0}});
        Platform.ClockHour = 23;
        Platform.ClockMinute = 30;
        SetUpTimers(&ControlSettings, &SynthState);
        PrepareForPlay(&ControlSettings, &SynthState);
        int32_t block = 0;
        for (; block < 400 && Platform.Stops == 0; ++block) ProcessBlock(&ControlSettings, &CachedSettings, &SynthState);
        EXPECT_TRUE(block - 1 == (ahead ? 352 : 1) && Platform.Chimes == 1) << ahead << " minutes ahead: stopped in block " << block - 1;
    }
}

TEST(Chime, QuarterOctavesFrom220EvenLeftOddRightAsLoudAsTheVolumeAndWithinOneLsbOfASinPerFrame) {
    float p[2 * ChimePartialCount];
    MakeChimePartials(p);
    EXPECT_TRUE(p[0] == 220.0f && std::fabs(p[1] - 261.6) < 0.05 && std::fabs(p[4] - 440) < 1e-4 && std::fabs(p[31] - 47359) < 1);
    EXPECT_TRUE(p[32] == 1.0f && p[33] == 1.0f && p[34] == static_cast<float>(1.0 / 3) && p[63] == 1.0f / 32);
    static float reference[2 * ChimeFrames];
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
