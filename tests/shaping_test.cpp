// Profile, tone and equaliser curves against their closed forms in double
// precision and the figures the program's documentation quotes.
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

// Curves are computed in double and stored as float, from single-precision
// constants: 1e-6 relative covers the float rounding of the constants and
// the result; an error in a law or an anchor is orders of magnitude larger.
constexpr double kCurveTolerance = 1e-6;

double Db(double amplitude) { return 20.0 * std::log10(amplitude); }

struct Section {
    double C, A, B;
};

// The analogue second-order section's magnitude at f, in double.
double SectionGain(const Section& s, double f) {
    const double x = f / s.C;
    const double p = (1 - x * x) * (1 - x * x);
    return std::sqrt((p + (x / s.A) * (x / s.A)) / (p + (x / s.B) * (x / s.B)));
}

}  // namespace

TEST(ProfileResponse, WhiteIsExactlyFlat) {
    ResetProgramState();
    BuildProfileResponse(ProfileWhite, &SynthState);
    for (int b = 6; b <= 6825; ++b) ASSERT_EQ(SynthState.ProfileResponse[b], 1.0f) << "bin " << b;
}

TEST(ProfileResponse, ColoursFallThreeSixAndNineDbPerOctave) {
    struct Colour {
        int32_t Profile;
        double Slope, At6, At6825;
    };
    const Colour colours[] = {{ProfilePink, 0.15, 399.94, 12.00},
                              {ProfileRed, 0.30, 159949, 144.04},
                              {ProfileBrown, 0.45, 6.397e7, 1728.7}};
    for (const Colour& c : colours) {
        ResetProgramState();
        BuildProfileResponse(c.Profile, &SynthState);
        const float* r = SynthState.ProfileResponse;
        EXPECT_NEAR(r[6], c.At6, c.At6 * 2e-4) << "profile " << c.Profile << " bin 6";
        EXPECT_NEAR(r[6825], c.At6825, c.At6825 * 5e-4) << "profile " << c.Profile << " bin 6825";
        EXPECT_NEAR(Db(r[12] / r[6]), -20.0 * c.Slope, 1e-4) << "profile " << c.Profile << " per octave";
        for (int b = 6; b <= 6825; b += 13) {
            const double ref = std::pow(10.0, c.Slope * std::log2(1e6 / b));
            ASSERT_NEAR(r[b], ref, ref * kCurveTolerance) << "profile " << c.Profile << " bin " << b;
        }
    }
}

TEST(ProfileResponse, MaskingProfilesAreProductsOfTheirSections) {
    struct Profile {
        int32_t Value;
        std::vector<Section> Sections;
    };
    const Profile profiles[] = {
        {ProfileTalking, {{91.41763, 0.046, 0.5791057}, {20000, 1.708083, 0.068}, {97.95576, 0.3358082, 0.15}}},
        {ProfileMusic, {{45.8, 0.05, 1.119}, {30.27, 0.6497673, 0.046}, {389.9689, 0.1309, 0.104},
                        {8147.6, 0.265253, 0.026}, {20000, 3.895375, 0.174}, {21.43, 4.42, 0.176}}},
        {ProfileTraffic, {{60.399, 0.044, 1.1523}, {1352.166, 0.196, 0.9823269}, {16256.61, 2.149779, 0.054},
                          {5023.772, 0.7116859, 0.142}, {21.43039, 1.415892, 0.2}, {389.9689, 0.2980443, 0.084}}},
        {ProfileDogs, {{833.7387, 0.008, 0.8976148}, {10023, 0.8884993, 0.158}, {12.4683, 0.024, 0.478863}}},
    };
    // The sections use single-precision angular frequencies; near the
    // steepest skirts that moves the curve by up to ~2e-5 relative.
    constexpr double kSectionTolerance = 5e-5;
    for (const Profile& p : profiles) {
        ResetProgramState();
        BuildProfileResponse(p.Value, &SynthState);
        EXPECT_EQ(SynthState.ProfilePeakCount, static_cast<int32_t>(p.Sections.size())) << "profile " << p.Value;
        for (int b = 6; b <= 6825; b += 7) {
            double ref = 1.0;
            for (const Section& s : p.Sections) ref *= SectionGain(s, b * 2.9296875);
            ASSERT_NEAR(SynthState.ProfileResponse[b], ref, ref * kSectionTolerance) << "profile " << p.Value << " bin " << b;
        }
        for (const Section& s : p.Sections)
            EXPECT_NEAR(SectionGain(s, s.C), s.B / s.A, 1e-12) << "a section at its centre gives B / A";
    }
}

TEST(ProfileResponse, TalkingAndDogsPeakWhereTheyShould) {
    ResetProgramState();
    BuildProfileResponse(ProfileTalking, &SynthState);
    int best = 6;
    for (int b = 6; b <= 6825; ++b)
        if (SynthState.ProfileResponse[b] > SynthState.ProfileResponse[best]) best = b;
    EXPECT_NEAR(best * 2.9296875, 88.0, 3.0) << "Talking / TV maximum";
    EXPECT_NEAR(Db(SynthState.ProfileResponse[best]), 15.0, 0.5);
    EXPECT_NEAR(Db(SynthState.ProfileResponse[6825]), -28.0, 0.5) << "Talking / TV at bin 6825";

    BuildProfileResponse(ProfileDogs, &SynthState);
    best = 6;
    for (int b = 6; b <= 6825; ++b)
        if (SynthState.ProfileResponse[b] > SynthState.ProfileResponse[best]) best = b;
    EXPECT_NEAR(best * 2.9296875, 703.0, 5.0) << "Dogs maximum";
    EXPECT_NEAR(Db(SynthState.ProfileResponse[best]), 41.7, 0.2);
}

TEST(ProfileResponse, UnknownValueChangesNothingAndStaleSectionsAreIgnored) {
    ResetProgramState();
    BuildProfileResponse(ProfileDogs, &SynthState);
    const std::vector<float> dogs(SynthState.ProfileResponse, SynthState.ProfileResponse + FrameLength);
    for (int32_t bad : {0, 99, 108, -104}) {
        BuildProfileResponse(bad, &SynthState);
        EXPECT_EQ(std::vector<float>(SynthState.ProfileResponse, SynthState.ProfileResponse + FrameLength), dogs)
            << "BuildProfileResponse(" << bad << ") changed the curve";
        EXPECT_EQ(SynthState.ProfilePeakCount, 3) << "BuildProfileResponse(" << bad << ") changed the sections";
    }
    BuildProfileResponse(ProfileMusic, &SynthState);
    BuildProfileResponse(ProfilePink, &SynthState);
    EXPECT_EQ(SynthState.ProfilePeakCount, 6) << "a colour leaves the section table alone";
    BuildProfileResponse(ProfileDogs, &SynthState);
    EXPECT_EQ(std::vector<float>(SynthState.ProfileResponse, SynthState.ProfileResponse + FrameLength), dogs)
        << "Dogs after Music must not read Music's sections 3..5";
}

TEST(ToneResponse, NeutralSliderIsExactlyFlat) {
    std::vector<float> r(FrameLength);
    const float zero = ToneGainDbFor(128);
    EXPECT_EQ(zero, 0.0f) << "ToneGainDbFor(128)";
    for (auto build : {BuildBassResponse, BuildSubBassResponse, BuildTrebleResponse}) {
        build(r.data(), zero);
        for (int i = 0; i < FrameLength; ++i) ASSERT_EQ(r[i], 1.0f) << "element " << i;
    }
}

TEST(ToneResponse, AnchorsAndEndsMatchTheirLaws) {
    std::vector<float> r(FrameLength);
    const float up = ToneGainDbFor(255), down = ToneGainDbFor(1);
    EXPECT_NEAR(up, 20.0, 1e-5);
    EXPECT_NEAR(down, -20.0, 1e-5);

    BuildBassResponse(r.data(), up);
    EXPECT_NEAR(r[6], 10.0, 1e-5);
    EXPECT_NEAR(r[169], 1.0041, 1e-4);
    EXPECT_EQ(r[170], 1.0f);
    EXPECT_EQ(r[5], 1.0f);
    for (int i = 6; i <= 169; ++i) {
        const double ref = std::pow(i / 170.0, std::log10(10.0) / std::log10(6.0 / 170.0));
        ASSERT_NEAR(r[i], ref, ref * kCurveTolerance * 4) << "Bass +20 dB bin " << i;
    }
    BuildBassResponse(r.data(), down);
    EXPECT_NEAR(r[6], 0.1, 1e-6);
    EXPECT_NEAR(r[169], 0.9959, 1e-4);

    BuildSubBassResponse(r.data(), up);
    EXPECT_NEAR(r[6], 10.0, 1e-5);
    EXPECT_NEAR(r[33], 1.0404, 1e-4);
    EXPECT_EQ(r[34], 1.0f);

    BuildTrebleResponse(r.data(), up);
    EXPECT_EQ(r[681], 1.0f);
    EXPECT_NEAR(r[682], 0.9999998, 1e-6);
    EXPECT_NEAR(r[6825], 9.9985, 1e-3);
    EXPECT_EQ(r[6826], 1.0f);
}

TEST(SliderLaws, VolumeHardnessAndToneEnds) {
    EXPECT_NEAR(OutputGainFor(1), 327.66, 0.01);
    EXPECT_NEAR(OutputGainFor(128), 3276.60, 0.01);
    EXPECT_NEAR(OutputGainFor(255), 32766.01, 0.01);
    EXPECT_EQ(DropWidthFor(1), 14.999998f) << "Hardness 1 is not exactly 15";
    EXPECT_NEAR(DropWidthFor(128), 45.0, 1e-5);
    EXPECT_NEAR(DropWidthFor(255), 75.0, 1e-5);
    for (int v = 1; v < 255; ++v) {
        ASSERT_LT(OutputGainFor(v), OutputGainFor(v + 1)) << "Volume rises at " << v;
        ASSERT_NEAR(Db(OutputGainFor(v + 1) / OutputGainFor(v)), 40.0 / 254, 1e-4) << "Volume step at " << v;
    }
}

TEST(EqResponse, BandGridAndReadouts) {
    const int readout[31] = {20, 25, 31, 39, 50, 63, 79, 100, 126, 158, 200, 251, 316, 399, 502, 632,
                             796, 1002, 1261, 1588, 2000, 2517, 3169, 3990, 5023, 6324, 7962, 10024, 12619, 15887, 20000};
    const int bin[31] = {6, 8, 10, 13, 17, 21, 27, 34, 43, 54, 68, 85, 108, 136, 171, 215,
                         271, 342, 430, 542, 682, 859, 1081, 1362, 1714, 2158, 2717, 3421, 4307, 5422, 6826};
    for (int k = 0; k < 31; ++k) {
        EXPECT_EQ(static_cast<int>(EqBandCentre(k)), readout[k]) << "band " << k << " readout";
        EXPECT_EQ(static_cast<int>(static_cast<double>(EqBandCentre(k)) * 0.34133333f), bin[k]) << "band " << k << " bin";
    }
    EXPECT_NEAR(EqBandCentre(30), 20000.91, 0.01);
    EXPECT_EQ(EqLevelDbFor(128), 0.0f);
    EXPECT_NEAR(EqLevelDbFor(1), 20.0, 1e-5) << "slider at the top raises the band";
    EXPECT_NEAR(EqLevelDbFor(255), -20.0, 1e-5);
}

TEST(EqResponse, FlatLevelsGiveExactlyOne) {
    ResetProgramState();
    BuildEqResponse(&SynthState, &ControlSettings);
    for (int i = 0; i < FrameLength; ++i) ASSERT_EQ(SynthState.EqResponse[i], 1.0f) << "element " << i;
}

TEST(EqResponse, SingleBandsInterpolateInDbOverLogFrequency) {
    ResetProgramState();
    const float* r = SynthState.EqResponse;

    ControlSettings.Value[EqBandFirst + 10] = 1;  // 200 Hz, +20 dB
    BuildEqResponse(&SynthState, &ControlSettings);
    EXPECT_NEAR(r[68], 10.0, 1e-5);
    EXPECT_NEAR(r[61], 3.379, 1e-3);
    EXPECT_NEAR(r[55], 1.201, 1e-3);
    // The line's offset is kept in single precision (about -17 for this
    // steep pair), so the anchors land within ~3e-6 of 1, not exactly.
    constexpr double kAnchorTolerance = 1e-5;
    EXPECT_NEAR(r[54], 1.0, kAnchorTolerance);
    EXPECT_NEAR(r[85], 1.0, kAnchorTolerance);
    EXPECT_EQ(r[53], 1.0f);
    EXPECT_EQ(r[86], 1.0f);

    SetControlStartValues(&ControlSettings);
    ControlSettings.Value[EqBandFirst + 0] = 1;
    BuildEqResponse(&SynthState, &ControlSettings);
    EXPECT_NEAR(r[6], 10.0, 1e-5);
    EXPECT_NEAR(r[7], 2.912, 1e-3);
    EXPECT_NEAR(r[8], 1.0, kAnchorTolerance);
    for (int i = 0; i < 6; ++i) EXPECT_EQ(r[i], 1.0f) << "below band 0, element " << i;

    SetControlStartValues(&ControlSettings);
    ControlSettings.Value[EqBandFirst + 30] = 255;
    BuildEqResponse(&SynthState, &ControlSettings);
    EXPECT_NEAR(r[6826], 0.1, 1e-6);
    EXPECT_NEAR(r[6825], 0.1001, 1e-4);
    EXPECT_NEAR(r[6000], 0.3632, 1e-4);
    EXPECT_NEAR(r[5421], 1.0, kAnchorTolerance);
    EXPECT_EQ(r[6827], 1.0f);
    EXPECT_NEAR(SynthState.EqBandLevelDb[30], -20.0, 1e-5);
}
