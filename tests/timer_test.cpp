// Start ramp, fades and the stop rule: the laws frame by frame and the block
// arithmetic of the stop time.
#include <gtest/gtest.h>

#include <cmath>
#include <vector>

#include "app/core_state.h"
#include "engine/block.h"
#include "timers/timer_gains.h"
#include "tests/test_platform.h"

namespace {

// Each gain is 10^x to ~1e-13 (a geometric sequence anchored with pow)
// rounded into a float product: the float rounding of the sample (6e-8
// relative) is all that may differ from the law.
constexpr double kGainTolerance = 1.2e-7;

struct Channels {
    std::vector<float> Direct = std::vector<float>(BlockFrames, 1000.0f);
    std::vector<float> Reversed = std::vector<float>(BlockFrames, -500.0f);
};

// Runs the gain stage on a block of constants and returns the gain seen.
Channels Gains(int32_t blockIndex) {
    Channels c;
    ApplyTimerGains(c.Direct.data(), c.Reversed.data(), blockIndex);
    return c;
}

void ExpectGains(const Channels& c, double (*law)(int64_t), int64_t firstCount, const char* what) {
    for (int i = 0; i < BlockFrames; ++i) {
        const double g = law(firstCount + i);
        ASSERT_NEAR(c.Direct[i], 1000.0 * g, 1000.0 * g * kGainTolerance) << what << ", frame " << i;
        ASSERT_NEAR(c.Reversed[i], -500.0 * g, 500.0 * g * kGainTolerance) << what << ", frame " << i;
    }
}

void SetStopTime(int32_t hour24, int32_t minute) {
    ControlSettings.Value[Alarm_AM] = 0;
    ControlSettings.Value[Alarm_PM] = 0;
    ControlSettings.Value[Alarm_Hr] = hour24;
    ControlSettings.Value[Alarm_Min] = minute;
}

}  // namespace

TEST(MinutesUntil, ForwardOnTheDialWithEqualTimesZero) {
    struct Case {
        TimePair Target, Now;
        int32_t Minutes;
    };
    const Case cases[] = {
        {{10, 5}, {10, 0}, 5},   {{10, 0}, {10, 0}, 0},   {{0, 15}, {23, 30}, 45},
        {{9, 59}, {10, 0}, 1439}, {{23, 59}, {0, 0}, 1439}, {{12, 0}, {11, 1}, 59},
    };
    for (const Case& c : cases) {
        const TimePair d = MinutesUntil(c.Target, c.Now);
        EXPECT_EQ(d.Hours * 60 + d.Minutes, c.Minutes)
            << "MinutesUntil(" << c.Target.Hours << ":" << c.Target.Minutes << ", " << c.Now.Hours << ":" << c.Now.Minutes << ")";
        EXPECT_LT(d.Minutes, 60);
    }
}

TEST(TargetTime, TwelveHourDialToTwentyFourHours) {
    ResetProgramState();
    struct Case {
        int32_t Hour, Am, Pm, Expected;
    };
    const Case cases[] = {{12, 1, 0, 0}, {12, 0, 1, 12}, {11, 0, 1, 23}, {1, 1, 0, 1}, {7, 0, 0, 7}, {12, 0, 0, 12}};
    for (const Case& c : cases) {
        ControlSettings.Value[Alarm_Hr] = c.Hour;
        ControlSettings.Value[Alarm_AM] = c.Am;
        ControlSettings.Value[Alarm_PM] = c.Pm;
        EXPECT_EQ(TargetTime(&ControlSettings).Hours, c.Expected)
            << c.Hour << (c.Am ? " AM" : c.Pm ? " PM" : " (neither)");
    }
}

TEST(SetUpTimers, StopAndFadeBlocksFromTheClock) {
    ResetProgramState();
    ControlSettings.Value[PlayUntilOn] = 1;
    SetStopTime(10, 6);
    SetUpTimersAt({10, 5}, &ControlSettings, &SynthState);
    EXPECT_EQ(SynthState.StopBlock, 351) << "one minute ahead";

    ControlSettings.Value[FadeOutOn] = 1;
    ControlSettings.Value[FadeOutTime] = 5;
    SetStopTime(22, 30);
    SetUpTimersAt({22, 0}, &ControlSettings, &SynthState);
    EXPECT_EQ(SynthState.FadeOutStartBlock, 8789) << "Fade Out 5 with 30 minutes to go";
    EXPECT_EQ(SynthState.StopBlock, 10546);
    EXPECT_EQ(SynthState.FadeOutLength, 5 * 2880000);
    EXPECT_EQ(SynthState.FadeOutSlopeDb, static_cast<float>(-20.0 / (5 * 2880000.0)));
    EXPECT_EQ(SynthState.FadeOutCount, 0);

    ControlSettings.Value[FadeOutTime] = 10;
    SetStopTime(22, 4);
    SetUpTimersAt({22, 0}, &ControlSettings, &SynthState);
    EXPECT_EQ(SynthState.FadeOutStartBlock, SynthState.StopBlock) << "no room for the fade: it does not start early";

    // Seconds are ignored: Play at 10:00:59 for 10:05 plans five minutes.
    Platform.ClockHour = 10;
    Platform.ClockMinute = 0;
    SetStopTime(10, 5);
    ControlSettings.Value[FadeOutOn] = 0;
    SetUpTimers(&ControlSettings, &SynthState);
    EXPECT_EQ(SynthState.StopBlock, 1757) << "floor(5 * 351.5625)";
    EXPECT_EQ(SynthState.FadeOutLength, 0) << "Fade Out off leaves no fade length";

    ControlSettings.Value[PlayUntilOn] = 0;
    SetUpTimers(&ControlSettings, &SynthState);
    EXPECT_EQ(SynthState.StopBlock, 0) << "nothing on: the targets are cleared";
}

TEST(ApplyTimerGains, StartRampRisesFromMinus20DbToExactlyOneOverTwoBlocks) {
    ResetProgramState();
    PrepareForPlay(&ControlSettings, &SynthState);
    ExpectGains(Gains(0), [](int64_t n) { return std::pow(10.0, ((n + 1) * double(20.0f / 16384) - 20.0) * 0.05); }, 0, "block 0");
    const Channels second = Gains(1);
    ExpectGains(second, [](int64_t n) { return std::pow(10.0, ((n + 1) * double(20.0f / 16384) - 20.0) * 0.05); }, 8192, "block 1");
    EXPECT_EQ(second.Direct[8191], 1000.0f) << "the 16384th frame has gain exactly 1";
    EXPECT_EQ(SynthState.StartRampCount, 16384);
    const Channels third = Gains(2);
    EXPECT_EQ(third.Direct, std::vector<float>(BlockFrames, 1000.0f)) << "block 2 has no ramp";
    const Channels wrapped = Gains(0);
    EXPECT_EQ(wrapped.Direct, std::vector<float>(BlockFrames, 1000.0f)) << "a wrap to block 0 does not ramp again";
}

TEST(ApplyTimerGains, FadeInOfOneMinuteCoversBlocks0To351) {
    ResetProgramState();
    ControlSettings.Value[FadeInOn] = 1;
    ControlSettings.Value[FadeInTime] = 1;
    PrepareForPlay(&ControlSettings, &SynthState);
    EXPECT_EQ(SynthState.FadeInLength, 2880000);
    SynthState.StartRampCount = StartRampFrames;  // look at the fade alone
    int64_t count = 0;
    for (int32_t b = 0; b <= 351; ++b) {
        const Channels c = Gains(b);
        if (b == 0 || b == 200 || b == 351) {
            const double slope = SynthState.FadeInSlopeDb;
            for (int i = 0; i < BlockFrames; i += 511) {
                const double g = std::pow(10.0, ((count + i + 1) * slope - 20.0) * 0.05);
                ASSERT_NEAR(c.Direct[i], 1000.0 * g, 1000.0 * g * kGainTolerance) << "fade-in block " << b << " frame " << i;
            }
        }
        count += BlockFrames;
    }
    EXPECT_EQ(SynthState.FadeInCount, 2883584) << "the last fade-in block runs to its end";
    EXPECT_EQ(Gains(352).Direct, std::vector<float>(BlockFrames, 1000.0f)) << "block 352 is past the fade-in";
}

TEST(ApplyTimerGains, FadeOutFallsToMinus20DbAndHolds) {
    ResetProgramState();
    ControlSettings.Value[FadeOutOn] = 1;
    SynthState.StartRampCount = StartRampFrames;
    SynthState.FadeOutStartBlock = 3;
    SynthState.FadeOutLength = 10000;  // a short fade shows the clamp within two blocks
    SynthState.FadeOutSlopeDb = static_cast<float>(-20.0 / 10000);
    EXPECT_EQ(Gains(3).Direct, std::vector<float>(BlockFrames, 1000.0f)) << "block at FadeOutStartBlock is not faded";
    static double slope;
    slope = SynthState.FadeOutSlopeDb;
    ExpectGains(Gains(4), [](int64_t n) { return std::pow(10.0, (n + 1) * slope * 0.05); }, 0, "first fade-out block");
    const Channels held = Gains(5);
    EXPECT_NEAR(held.Direct[1807], 1000.0 * std::pow(10.0, 10000 * slope * 0.05), 1e-3) << "count reaches the length";
    EXPECT_NEAR(held.Direct[8191], 100.0, 1e-3) << "then holds -20 dB";
    EXPECT_EQ(SynthState.FadeOutCount, 10000);
}

TEST(ApplyTimerGains, FadeOutWithFiveMinutesEndsJustAboveMinus20Db) {
    ResetProgramState();
    ControlSettings.Value[FadeOutOn] = 1;
    ControlSettings.Value[PlayUntilOn] = 1;
    ControlSettings.Value[FadeOutTime] = 5;
    SetStopTime(22, 30);
    SetUpTimersAt({22, 0}, &ControlSettings, &SynthState);
    SynthState.StartRampCount = StartRampFrames;
    Channels last;
    for (int32_t b = 8790; b <= 10546; ++b) last = Gains(b);
    const double endDb = 20.0 * std::log10(last.Direct[8191] / 1000.0);
    EXPECT_NEAR(endDb, -19.99, 0.005) << "the last played block ends about 0.01 dB above -20 dB";
    EXPECT_EQ(Platform.Stops, 0);
    Gains(10547);
    EXPECT_EQ(Platform.Stops, 1) << "block 10547 stops";
    EXPECT_EQ(SynthState.FadeOutCount, SynthState.FadeOutLength) << "the count reaches the length in the stopping block";
}

TEST(ApplyTimerGains, FadeOutCheckedWithNoMinutesFadesNothing) {
    // A disabled "Fade Out" keeps its check mark; with no minutes ever set
    // its length is 0 and the law would divide by it.
    ResetProgramState();
    ControlSettings.Value[FadeOutOn] = 1;
    ControlSettings.Value[FadeOutTime] = 0;
    SetUpTimersAt({0, 0}, &ControlSettings, &SynthState);
    SynthState.StartRampCount = StartRampFrames;
    const Channels c = Gains(5);
    EXPECT_EQ(c.Direct, std::vector<float>(BlockFrames, 1000.0f)) << "fade-out of length 0";
}

TEST(ApplyTimerGains, StopCheckStopsAfterStopBlockAndStartsTheChimeWithAlarm) {
    ResetProgramState();
    SynthState.StopBlock = 351;
    Gains(352);
    EXPECT_EQ(Platform.Stops, 0) << "neither Stop Time nor Alarm: no stop";
    ControlSettings.Value[PlayUntilOn] = 1;
    Gains(351);
    EXPECT_EQ(Platform.Stops, 0) << "block 351 is still played";
    Gains(352);
    EXPECT_EQ(Platform.Stops, 1) << "block 352 stops";
    EXPECT_EQ(Platform.Chimes, 0) << "no chime without Alarm";
    ControlSettings.Value[PlayUntilOn] = 0;
    ControlSettings.Value[AlarmOn] = 1;
    Gains(352);
    EXPECT_EQ(Platform.Stops, 2);
    EXPECT_EQ(Platform.Chimes, 1) << "Alarm starts the chime after the stop";
}

TEST(StopTime, TheCurrentMinuteStopsAtTheSecondPrimingBlock) {
    ResetProgramState();
    Platform.ClockHour = 23;
    Platform.ClockMinute = 30;
    ControlSettings.Value[PlayUntilOn] = 1;
    ControlSettings.Value[Alarm_Hr] = 11;
    ControlSettings.Value[Alarm_Min] = 30;
    ControlSettings.Value[Alarm_PM] = 1;
    ControlSettings.Value[Alarm_AM] = 0;
    SetUpTimers(&ControlSettings, &SynthState);
    PrepareForPlay(&ControlSettings, &SynthState);
    EXPECT_EQ(SynthState.StopBlock, 0);
    ProcessBlock(&ControlSettings, &CachedSettings, &SynthState);
    EXPECT_EQ(Platform.Stops, 0) << "the first block is played";
    ProcessBlock(&ControlSettings, &CachedSettings, &SynthState);
    EXPECT_EQ(Platform.Stops, 1) << "the second priming block stops";
}

TEST(StopTime, OneMinuteAheadPlaysBlocks0To351) {
    ResetProgramState();
    Platform.ClockHour = 6;
    Platform.ClockMinute = 59;
    ControlSettings.Value[AlarmOn] = 1;
    ControlSettings.Value[Alarm_Hr] = 7;
    ControlSettings.Value[Alarm_Min] = 0;
    SetUpTimers(&ControlSettings, &SynthState);
    PrepareForPlay(&ControlSettings, &SynthState);
    int32_t stoppedAt = -1;
    for (int32_t b = 0; b < 400 && stoppedAt < 0; ++b) {
        ProcessBlock(&ControlSettings, &CachedSettings, &SynthState);
        if (Platform.Stops > 0) stoppedAt = b;
    }
    EXPECT_EQ(stoppedAt, 352) << "the stop happens while block 352 is made";
    EXPECT_EQ(Platform.Chimes, 1) << "with Alarm the chime follows";
}
