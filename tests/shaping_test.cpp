// The spectral curves against their closed forms in double precision, over
// every bin, and the figures quoted for them.
#include <gtest/gtest.h>
#include <cmath>
#include <vector>
#include "app/core_state.h"
#include "engine/block.h"
#include "shaping/eq_response.h"
#include "shaping/profiles.h"
#include "shaping/tone.h"
#include "tests/test_platform.h"

namespace {

// The curves are computed in double from single-precision constants and
// stored as float; the masking sections' single-precision angular
// frequencies move the steepest skirts by up to ~2e-5. A wrong law, constant
// or anchor is off by far more.
constexpr double kCurveTolerance = 5e-5;

// Profile 100..107 at bin b: the colours' power law, the masking profiles'
// analogue sections (centre C, numerator Q A, denominator Q B).
double ProfileCurve(int32_t profile, int32_t b) {
    static const std::vector<std::vector<double>> sections[4] = {
        {{91.41763, 0.046, 0.5791057}, {20000, 1.708083, 0.068}, {97.95576, 0.3358082, 0.15}},
        {{45.8, 0.05, 1.119}, {30.27, 0.6497673, 0.046}, {389.9689, 0.1309, 0.104}, {8147.6, 0.265253, 0.026},
         {20000, 3.895375, 0.174}, {21.43, 4.42, 0.176}},
        {{60.399, 0.044, 1.1523}, {1352.166, 0.196, 0.9823269}, {16256.61, 2.149779, 0.054}, {5023.772, 0.7116859, 0.142},
         {21.43039, 1.415892, 0.2}, {389.9689, 0.2980443, 0.084}},
        {{833.7387, 0.008, 0.8976148}, {10023, 0.8884993, 0.158}, {12.4683, 0.024, 0.478863}}};
    if (profile < ProfileTalking) return std::pow(10.0, 0.15 * (profile - ProfileWhite) * std::log2(1e6 / b));
    double gain = 1.0;
    for (const std::vector<double>& s : sections[profile - ProfileTalking]) {
        const double x = b * 2.9296875 / s[0], p = (1 - x * x) * (1 - x * x);
        gain *= std::sqrt((p + x * x / (s[1] * s[1])) / (p + x * x / (s[2] * s[2])));
    }
    return gain;
}

// A line in dB over log10 of the bin from `inner` (0 dB) to `outer` (db).
double ToneCurve(double db, int32_t inner, int32_t outer, int32_t i) {
    return std::pow(10.0, db / 20 * std::log10(static_cast<double>(i) / inner) / std::log10(static_cast<double>(outer) / inner));
}

}  // namespace

TEST(Curves, ProfilesFollowTheirLawsOverTheBandAndTheQuotedFigures) {
    ResetProgramState();
    for (int32_t profile = ProfileWhite; profile <= ProfileDogs; ++profile) {
        BuildProfileResponse(profile, &SynthState);
        for (int32_t b = FirstAudibleBin; b <= LastAudibleBin; ++b)
            ASSERT_NEAR(SynthState.ProfileResponse[b], ProfileCurve(profile, b), ProfileCurve(profile, b) * kCurveTolerance * (profile > 100))
                << "profile " << profile << ", bin " << b;
    }
    const struct { int32_t Profile, Bin; double Value, Tolerance; } quoted[] = {
        {101, 6, 399.94, 0.05}, {101, 6825, 12.00, 0.01}, {102, 6, 159949, 20}, {102, 6825, 144.04, 0.05},
        {103, 6, 6.397e7, 1e4}, {103, 6825, 1728.7, 0.5}, {104, 30, 5.62, 0.1}, {104, 6825, 0.0398, 0.002}, {107, 240, 121.6, 2}};
    for (const auto& q : quoted) {  // Talking / TV about +15 dB near 88 Hz and -28 dB at the top, Dogs +41.7 dB near 703 Hz
        BuildProfileResponse(q.Profile, &SynthState);
        EXPECT_NEAR(SynthState.ProfileResponse[q.Bin], q.Value, q.Tolerance) << "profile " << q.Profile << ", bin " << q.Bin;
    }
    BuildProfileResponse(ProfileDogs, &SynthState);
    const std::vector<float> dogs(SynthState.ProfileResponse, SynthState.ProfileResponse + FrameLength);
    for (std::vector<int32_t> values : {std::vector<int32_t>{0, 99, 108}, std::vector<int32_t>{105, 101, 107}}) {
        for (int32_t value : values) BuildProfileResponse(value, &SynthState);
        EXPECT_TRUE(std::vector<float>(SynthState.ProfileResponse, SynthState.ProfileResponse + FrameLength) == dogs)
            << "damaged values change nothing; Dogs after Music and Pink uses its own three sections alone (after " << values[2] << ")";
    }
}

TEST(Curves, ToneCurvesAreLinesInDbBetweenTheirAnchorsAndExactlyOneOutside) {
    const struct { void (*Build)(float*, float); int32_t Inner, Outer, First, Last; } tones[] = {
        {BuildBassResponse, 170, 6, 6, 169}, {BuildSubBassResponse, 34, 6, 6, 33}, {BuildTrebleResponse, 682, 6826, 682, 6825}};
    std::vector<float> r(FrameLength);
    for (const auto& t : tones) {
        for (int32_t value : {1, 60, 128, 200, 255}) {
            const float db = ToneGainDbFor(value);
            t.Build(r.data(), db);
            for (int32_t i = 0; i < FrameLength; ++i) {
                const double ref = i >= t.First && i <= t.Last ? ToneCurve(db, t.Inner, t.Outer, i) : 1.0;
                const bool exact = value == 128 || i < t.First || i > t.Last;
                ASSERT_NEAR(r[i], ref, exact ? 0 : ref * kCurveTolerance) << "anchors " << t.Inner << ", slider " << value << ", bin " << i;
            }
        }
    }
    const struct { int32_t Tone, Bin; double Value, Tolerance; } quoted[] = {  // bass and treble at 255
        {0, 6, 10, 1e-5}, {0, 169, 1.0041, 1e-4}, {2, 682, 0.9999998, 1e-6}, {2, 6825, 9.9985, 1e-3}};
    for (const auto& q : quoted) {
        tones[q.Tone].Build(r.data(), ToneGainDbFor(255));
        EXPECT_NEAR(r[q.Bin], q.Value, q.Tolerance) << "anchors " << tones[q.Tone].Inner << ", slider 255, bin " << q.Bin;
    }
    const struct { float Got; double Expected; } laws[] = {
        {OutputGainFor(1), 327.66}, {OutputGainFor(128), 3276.60}, {OutputGainFor(255), 32766.01}, {DropWidthFor(1), 14.999998},
        {DropWidthFor(128), 45}, {DropWidthFor(255), 75}, {ToneGainDbFor(1), -20}, {ToneGainDbFor(255), 20}, {EqLevelDbFor(1), 20}};
    for (const auto& law : laws) EXPECT_NEAR(law.Got, law.Expected, 5e-6 * std::fabs(law.Expected) + 1e-4);
}

TEST(Curves, TheEqualiserIsALineInDbOverLogBinBetweenBandCentres) {
    const int32_t readouts[31] = {20, 25, 31, 39, 50, 63, 79, 100, 126, 158, 200, 251, 316, 399, 502, 632,
                                  796, 1002, 1261, 1588, 2000, 2517, 3169, 3990, 5023, 6324, 7962, 10024, 12619, 15887, 20000};
    const int32_t bins[31] = {6, 8, 10, 13, 17, 21, 27, 34, 43, 54, 68, 85, 108, 136, 171, 215,
                              271, 342, 430, 542, 682, 859, 1081, 1362, 1714, 2158, 2717, 3421, 4307, 5422, 6826};
    for (int32_t k = 0; k < 31; ++k) EXPECT_EQ(static_cast<int32_t>(EqBandCentre(k)), readouts[k]) << "band " << k;
    ResetProgramState();
    for (int32_t trial = 0; trial < 4; ++trial) {  // flat, then three sets of levels
        for (int32_t k = 0; k < 31; ++k) ControlSettings.Value[EqBandFirst + k] = trial == 0 ? 128 : 1 + (k * 37 + trial * 91) % 255;
        BuildEqResponse(&SynthState, &ControlSettings);
        for (int32_t i = 0; i < FrameLength; ++i) {
            double ref = 1.0;
            for (int32_t k = 0; k < 30; ++k) {
                const double a = EqLevelDbFor(ControlSettings.Value[EqBandFirst + k]), b = EqLevelDbFor(ControlSettings.Value[EqBandFirst + k + 1]);
                if (i >= bins[k] && i <= bins[k + 1]) ref = std::pow(10.0, a / 20) * ToneCurve(b - a, bins[k], bins[k + 1], i);
            }
            ASSERT_NEAR(SynthState.EqResponse[i], ref, ref * kCurveTolerance * (trial > 0)) << "levels " << trial << ", bin " << i;
        }
    }
    SetControlStartValues(&ControlSettings);
    ControlSettings.Value[EqBandFirst + 10] = 1;  // 200 Hz, bin 68, at +20 dB
    BuildEqResponse(&SynthState, &ControlSettings);
    const float* r = SynthState.EqResponse;
    EXPECT_TRUE(std::fabs(r[68] - 10) < 1e-5 && std::fabs(r[61] - 3.379) < 1e-3 && std::fabs(r[55] - 1.201) < 1e-3 && r[53] == 1.0f && r[86] == 1.0f)
        << "bins 68, 61, 55, 53, 86: " << r[68] << ", " << r[61] << ", " << r[55] << ", " << r[53] << ", " << r[86];
}
