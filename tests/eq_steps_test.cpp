// The equaliser panel's arithmetic: the band slider's step rule and what the
// readouts show.
#include <gtest/gtest.h>

#include "shaping/eq_response.h"
#include "shaping/eq_steps.h"

TEST(BandStep, StaysWithinTheSlidersRange) {
    const struct {
        int32_t Level, Request, Thumb, Expected;
    } cases[] = {{3, BandLineUp, 0, 1},        {6, BandLineUp, 0, 1},      {7, BandLineUp, 0, 2},
                 {128, BandLineUp, 0, 123},    {128, BandLineDown, 0, 133}, {253, BandLineDown, 0, 255},
                 {20, BandPageUp, 0, 1},       {26, BandPageUp, 0, 1},     {27, BandPageUp, 0, 2},
                 {240, BandPageDown, 0, 255},  {230, BandPageDown, 0, 255}, {229, BandPageDown, 0, 254},
                 {128, BandThumbPosition, 77, 77}, {128, BandThumbTrack, 200, 200},
                 {128, BandThumbTrack, 0, 1},  {128, BandThumbTrack, 300, 255},
                 {77, 6 /* top */, 0, 77},     {77, 7 /* bottom */, 0, 77}, {77, 8 /* end */, 0, 77}};
    for (const auto& c : cases)
        EXPECT_EQ(c.Expected, SteppedBandLevel(c.Level, c.Request, c.Thumb))
            << "SteppedBandLevel(" << c.Level << ", " << c.Request << ", " << c.Thumb << ")";
}

TEST(BandStep, OnlyIds5To35AreBands) {
    EXPECT_FALSE(IsEqBandId(4)) << "IsEqBandId(4)";
    EXPECT_TRUE(IsEqBandId(5)) << "IsEqBandId(5)";
    EXPECT_TRUE(IsEqBandId(35)) << "IsEqBandId(35)";
    EXPECT_FALSE(IsEqBandId(36)) << "IsEqBandId(36)";
    EXPECT_FALSE(IsEqBandId(-1)) << "IsEqBandId(-1)";
}

TEST(Readout, ShowsWholeDecibelsCutTowardZero) {
    const struct {
        int32_t Slider, Shown;
    } cases[] = {{1, 20}, {2, 19}, {127, 0}, {128, 0}, {129, 0}, {130, 0}, {135, -1}, {254, -19}, {255, -20}};
    for (const auto& c : cases)
        EXPECT_EQ(c.Shown, ReadoutNumber(EqLevelDbFor(c.Slider)))
            << "ReadoutNumber(EqLevelDbFor(" << c.Slider << ") = " << EqLevelDbFor(c.Slider) << ")";
    EXPECT_NEAR(19.84, EqLevelDbFor(2), 0.01) << "slider 2 is +19.84 dB";
    EXPECT_NEAR(0.157, EqLevelDbFor(127), 0.001) << "slider 127 is +0.157 dB";
    EXPECT_NEAR(-0.157, EqLevelDbFor(129), 0.001) << "slider 129 is -0.157 dB";
}

TEST(Readout, ShowsBandCentresCutTowardZero) {
    const int32_t shown[31] = {20,   25,   31,   39,   50,   63,   79,    100,   126,   158,   200,
                               251,  316,  399,  502,  632,  796,  1002,  1261,  1588,  2000,  2517,
                               3169, 3990, 5023, 6324, 7962, 10024, 12619, 15887, 20000};
    for (int32_t k = 0; k < 31; ++k)
        EXPECT_EQ(shown[k], ReadoutNumber(EqBandCentre(k))) << "ReadoutNumber(EqBandCentre(" << k << "))";
}
