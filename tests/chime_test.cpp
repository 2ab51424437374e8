// The alarm chime's sound: partials, channel split, length and loudness.
#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <cstdlib>

#include "timers/chime.h"

namespace {
constexpr double kPi = 3.14159265358979323846;

int32_t LargestMagnitude(const int16_t* pcm, int32_t channel) {
    int32_t m = 0;
    for (int32_t n = 0; n < ChimeFrames; ++n) m = std::max(m, std::abs(int32_t(pcm[2 * n + channel])));
    return m;
}
}  // namespace

TEST(ChimePartials, QuarterOctavesFrom220WithFallingAmplitudes) {
    float p[2 * ChimePartialCount];
    MakeChimePartials(p);
    EXPECT_EQ(p[0], 220.0f);
    EXPECT_NEAR(p[1], 261.6, 0.05);
    EXPECT_NEAR(p[2], 311.1, 0.05);
    EXPECT_NEAR(p[4], 440.0, 1e-4);
    EXPECT_NEAR(p[31], 47359.0, 1.0);
    EXPECT_EQ(p[32 + 0], 1.0f);
    EXPECT_EQ(p[32 + 1], 1.0f) << "partials 0 and 1 both have amplitude 1";
    EXPECT_EQ(p[32 + 2], static_cast<float>(1.0 / 3));
    EXPECT_EQ(p[32 + 31], 1.0f / 32);
}

TEST(SynthesizeChime, LeftCarriesEvenPartialsRightOddFromPhaseZero) {
    MakeChimePartials(ChimePartials);
    SynthesizeChime(ChimePartials, ChimeSamples);
    EXPECT_EQ(ChimeSamples[0], 0.0f) << "every partial starts at phase 0";
    EXPECT_EQ(ChimeSamples[1], 0.0f);
    // Against the sum in double: 16 float additions of values below ~3.
    constexpr double kSumTolerance = 2e-6;
    for (int32_t n : {1, 100, 4097, 99999, ChimeFrames - 1}) {
        double left = 0.0, right = 0.0;
        for (int32_t k = 0; k < 16; ++k) {
            left += std::sin(n * double(ChimePartials[2 * k]) * double(0.0001308997f)) * ChimePartials[32 + 2 * k];
            right += std::sin(n * double(ChimePartials[2 * k + 1]) * double(0.0001308997f)) * ChimePartials[32 + 2 * k + 1];
        }
        EXPECT_NEAR(ChimeSamples[2 * n], left, kSumTolerance) << "left, frame " << n;
        EXPECT_NEAR(ChimeSamples[2 * n + 1], right, kSumTolerance) << "right, frame " << n;
    }
    // The left channel's lowest partial is 220 Hz, the right's 261.6 Hz:
    // correlate each channel with both over one second.
    double left220 = 0, left261 = 0, right220 = 0, right261 = 0;
    for (int32_t n = 0; n < 48000; ++n) {
        const double s220 = std::sin(2 * kPi * 220.0 * n / 48000), s261 = std::sin(2 * kPi * ChimePartials[1] * n / 48000);
        left220 += ChimeSamples[2 * n] * s220;
        left261 += ChimeSamples[2 * n] * s261;
        right220 += ChimeSamples[2 * n + 1] * s220;
        right261 += ChimeSamples[2 * n + 1] * s261;
    }
    EXPECT_GT(std::fabs(left220), 100 * std::fabs(left261)) << "220 Hz belongs to the left";
    EXPECT_GT(std::fabs(right261), 100 * std::fabs(right220)) << "261.6 Hz belongs to the right";
}

TEST(MakeChime, LoudnessFollowsTheVolume) {
    struct Case {
        int32_t Volume, Peak;
    };
    for (const Case& c : {Case{255, 32766}, Case{128, 3276}, Case{1, 327}}) {
        const float peak = MakeChime(c.Volume);
        EXPECT_EQ(static_cast<int32_t>(peak), c.Peak) << "ChimePeakFor(" << c.Volume << ")";
        EXPECT_EQ(std::max(LargestMagnitude(ChimePcm, 0), LargestMagnitude(ChimePcm, 1)), c.Peak)
            << "largest sample at volume " << c.Volume;
    }
    EXPECT_NE(ChimePcm[2 * (ChimeFrames - 1)], 0) << "the chord lasts all 262144 frames, no envelope";
}

TEST(MakeChime, WithinOneLsbOfASinPerFrame) {
    // Reference: a sin per frame and partial, float sums in partial order.
    static float reference[2 * ChimeFrames];
    static int16_t pcm[2 * ChimeFrames];
    const float peak = MakeChime(200);
    std::fill(reference, reference + 2 * ChimeFrames, 0.0f);
    for (int32_t k = 0; k < ChimePartialCount; ++k) {
        const double step = ChimePartials[k] * double(0.0001308997f), amplitude = ChimePartials[32 + k];
        for (int32_t n = 0; n < ChimeFrames; ++n)
            reference[2 * n + k % 2] = static_cast<float>(reference[2 * n + k % 2] + std::sin(n * step) * amplitude);
    }
    ScaleChime(reference, peak, pcm);
    int32_t worst = 0;
    for (int32_t i = 0; i < 2 * ChimeFrames; ++i) worst = std::max(worst, std::abs(pcm[i] - ChimePcm[i]));
    EXPECT_LE(worst, 1);
}
