// The block generator: bell, window, filtering path, overlap-add.
#include <gtest/gtest.h>

#include <cmath>
#include <cstdio>
#include <cstring>
#include <vector>

#include "app/core_state.h"
#include "engine/block_filter.h"
#include "engine/generator.h"
#include "engine/vector_ops.h"
#include "tests/test_platform.h"

namespace {

// The frame passes a transform pair and is rounded to float; on values of
// size ~1, 2e-5 is ~10x what the described single-precision pair would err
// and far below any real error.
constexpr double kFrameTolerance = 2e-5;

// Blocks from 2 on: no start ramp touches them. The ramp is the timers'
// business and tested there; here the count is set to its end.
void DisableStartRamp() { SynthState.StartRampCount = StartRampFrames; }

// The left channel's frame: the circular time reversal of FftReal.
float Reversed(int32_t k) { return FftReal[(FrameLength - k) % FrameLength]; }

}  // namespace

TEST(FillBell, PeakAndEdgesFollowTheWidth) {
    std::vector<float> v(BlockFrames);
    FillBell(v.data(), 45.0f, 1.0f);
    EXPECT_EQ(v[4096], 1.0f) << "FillBell(45, 1) element 4096";
    EXPECT_NEAR(v[0], 0.5394, 5e-5) << "FillBell(45, 1) element 0";
    for (int d = 1; d < 4096; ++d) ASSERT_EQ(v[4096 - d], v[4096 + d]) << "symmetric about 4096, d = " << d;
    FillBell(v.data(), 15.0f, 1.0f);
    EXPECT_NEAR(v[0], 0.00387, 2e-5) << "FillBell(15, 1) element 0";
    FillBell(v.data(), 75.0f, 1.0f);
    EXPECT_NEAR(v[0], 0.8007, 5e-5) << "FillBell(75, 1) element 0";
    FillBell(v.data(), 45.0f, 3276.6f);
    EXPECT_EQ(v[4096], 3276.6f) << "the peak is the gain";
    // Against the double-precision curve: single rounding of each element.
    const double w = static_cast<float>(45.0 * 81.92);
    for (int i = 0; i < BlockFrames; i += 7) {
        const double ref = 3276.6f * std::exp(-(i - 4096.0) * (i - 4096.0) / (2 * w * w));
        ASSERT_NEAR(v[i], ref, 1e-6 * ref + 1e-9) << "element " << i;
    }
}

TEST(SynthesisWindow, FlatMiddleGaussianEdgesCircularSymmetry) {
    BuildSynthesisWindow();
    EXPECT_NEAR(SynthesisWindow[0], 3.26e-5, 0.01e-5) << "w[0]";
    for (int i = 4096; i <= 12287; ++i) ASSERT_EQ(SynthesisWindow[i], 1.0f) << "flat middle, i = " << i;
    for (int k = 1; k < FrameLength; ++k)
        ASSERT_EQ(SynthesisWindow[FrameLength - k], SynthesisWindow[k]) << "w[16384 - k] = w[k], k = " << k;
    for (int i = 1; i < 4096; ++i) ASSERT_GT(SynthesisWindow[i], SynthesisWindow[i - 1]) << "rising edge at " << i;
}

TEST(GenerateBlock, ImpulseThroughAnAllPassResponseLandsDirectAndReversed) {
    ResetProgramState();
    DisableStartRamp();
    std::vector<float> flat(FrameLength, 1.0f);
    for (int i : {0, 1, 1000, 4095, 4096, 8191}) {
        std::vector<float> direct(BlockFrames, 0.0f), reversed(BlockFrames, 0.0f);
        direct[i] = 1.0f;
        SetFilterResponse(flat.data());
        GenerateBlock(direct.data(), reversed.data(), 3);
        for (int k = 0; k < FrameLength; ++k) {
            ASSERT_NEAR(FftReal[k], k == 4096 + i ? 1.0 : 0.0, kFrameTolerance) << "direct frame, impulse at " << i << ", sample " << k;
            ASSERT_NEAR(Reversed(k), k == 12288 - i ? 1.0 : 0.0, kFrameTolerance) << "reversed frame, impulse at " << i << ", sample " << k;
        }
    }
}

TEST(GenerateBlock, OneSidedResponseHalvesTheImpulse) {
    ResetProgramState();
    DisableStartRamp();
    std::vector<float> oneSided(FrameLength, 0.0f);
    for (int k = 0; k < FrameLength / 2; ++k) oneSided[k] = 1.0f;
    std::vector<float> direct(BlockFrames, 0.0f), reversed(BlockFrames, 0.0f);
    direct[2000] = 1.0f;
    SetFilterResponse(oneSided.data());
    GenerateBlock(direct.data(), reversed.data(), 3);
    EXPECT_NEAR(FftReal[6096], 0.5, kFrameTolerance) << "the real part keeps half of a one-sided spectrum";
}

TEST(GenerateBlock, SilentResponseGivesSilence) {
    ResetProgramState();
    DisableStartRamp();
    std::vector<float> tiny(FrameLength, 1e-22f);
    std::vector<float> direct(BlockFrames), reversed(BlockFrames);
    for (int i = 0; i < BlockFrames; ++i) direct[i] = (i % 3 - 1) * 30000.0f;
    SetFilterResponse(tiny.data());
    GenerateBlock(direct.data(), reversed.data(), 0);
    for (int i = 0; i < BlockFrames; ++i) {
        ASSERT_LT(std::fabs(direct[i]), 1e-12) << "direct " << i;
        ASSERT_LT(std::fabs(reversed[i]), 1e-12) << "reversed " << i;
    }
}

TEST(GenerateBlock, OverlapAddBlockByBlockEqualsTheFramesSummedAtOnce) {
    // Frames F_b of successive excitations, laid at hop 8192 with the first
    // frame's middle at 0, must come out block after block as their sum.
    ResetProgramState();
    DisableStartRamp();
    std::vector<float> response(FrameLength, 1e-22f);
    for (int k = 6; k <= 6825; ++k) response[k] = 1.0f + 0.5f * std::sin(k * 0.01f);
    SetFilterResponse(response.data());
    const int blocks = 6;
    std::vector<std::vector<float>> directFrames, reversedFrames;
    std::vector<float> outDirect, outReversed;
    for (int b = 0; b < blocks; ++b) {
        std::vector<float> direct(BlockFrames), reversed(BlockFrames);
        for (int i = 0; i < BlockFrames; ++i) direct[i] = std::sin(0.37f * i * (b + 1)) * 1000.0f;
        GenerateBlock(direct.data(), reversed.data(), b);
        directFrames.emplace_back(FftReal, FftReal + FrameLength);
        reversedFrames.emplace_back(FrameLength);
        for (int k = 0; k < FrameLength; ++k) reversedFrames.back()[k] = Reversed(k);
        outDirect.insert(outDirect.end(), direct.begin(), direct.end());
        outReversed.insert(outReversed.end(), reversed.begin(), reversed.end());
    }
    // Block 0 emits the middle of frame 0 alone. From block 1 on, stream
    // sample t holds every frame f at t - 4096 - 8192 f: frame 0's middle is
    // heard again in block 1, and each later frame starts 4096 samples into
    // the block that makes it.
    for (int t = 0; t < blocks * BlockFrames; ++t) {
        double expectDirect = 0.0, expectReversed = 0.0;
        if (t < BlockFrames) {
            expectDirect = directFrames[0][t + 4096];
            expectReversed = reversedFrames[0][t + 4096];
        } else {
            for (int f = 0; f < blocks; ++f) {
                const int offset = t - 4096 - 8192 * f;
                if (offset >= 0 && offset < FrameLength) {
                    expectDirect += directFrames[f][offset];
                    expectReversed += reversedFrames[f][offset];
                }
            }
        }
        ASSERT_NEAR(outDirect[t], expectDirect, 1e-3) << "direct stream sample " << t;
        ASSERT_NEAR(outReversed[t], expectReversed, 1e-3) << "reversed stream sample " << t;
    }
}

TEST(FilterFrame, TheAvx2PathGivesTheBaselineBytes) {
    ResetProgramState();
    std::vector<float> response(FrameLength, 1e-22f), excitation(BlockFrames);
    for (int k = 6; k <= 6825; ++k) response[k] = 1.0f + 0.5f * std::sin(k * 0.01f);
    for (int i = 0; i < BlockFrames; ++i) excitation[i] = std::sin(0.37f * i) * 30000.0f;
    SetFilterResponse(response.data());
    std::vector<float> frames[2];
    for (int baseline : {1, 0}) {
        ForceBaselineFilter(baseline == 1);
        FilterFrame(excitation.data(), SynthesisWindow, FftReal);
        frames[baseline].assign(FftReal, FftReal + FrameLength);
    }
    std::printf("FilterFrame: %s\n", FilterUsesAvx2() ? "AVX2 path checked against the baseline" : "no AVX2 here, baseline only");
    EXPECT_EQ(0, std::memcmp(frames[0].data(), frames[1].data(), sizeof(float) * FrameLength));
}
