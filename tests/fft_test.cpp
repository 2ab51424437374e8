// The transform against a direct DFT computed in double precision.
#include <gtest/gtest.h>

#include <cmath>
#include <complex>
#include <cstdint>
#include <vector>

#include "engine/fft.h"

namespace {

constexpr double kPi = 3.14159265358979323846;

// Single-precision radix-2 error grows about as log2(N) roundings of the
// signal's norm; 2e-7 * log2(N) of the L2 norm leaves a margin of ~10x over
// what the transform shows and still catches a wrong twiddle or sign, which
// errs by the order of the norm itself.
double FftTolerance(int32_t order, double norm) { return 2e-7 * order * norm + 1e-30; }

struct Signal {
    std::vector<float> Re, Im;
};

// A fixed pseudo-random signal in [-1, 1): the test must not depend on luck.
Signal MakeSignal(int32_t n, uint32_t seed) {
    Signal s{std::vector<float>(n), std::vector<float>(n)};
    uint32_t x = seed;
    for (int32_t i = 0; i < n; ++i) {
        x = x * 1664525u + 1013904223u;
        s.Re[i] = static_cast<float>((x >> 8) * (1.0 / 8388608.0) - 1.0);
        x = x * 1664525u + 1013904223u;
        s.Im[i] = static_cast<float>((x >> 8) * (1.0 / 8388608.0) - 1.0);
    }
    return s;
}

std::complex<double> DirectDft(const Signal& s, int32_t k, double sign) {
    const int32_t n = static_cast<int32_t>(s.Re.size());
    std::complex<double> sum = 0.0;
    for (int32_t i = 0; i < n; ++i) {
        const double angle = sign * 2.0 * kPi * static_cast<double>((static_cast<int64_t>(i) * k) % n) / n;
        sum += std::complex<double>(s.Re[i], s.Im[i]) * std::polar(1.0, angle);
    }
    return sum;
}

double Norm(const Signal& s) {
    double e = 0.0;
    for (size_t i = 0; i < s.Re.size(); ++i) e += double(s.Re[i]) * s.Re[i] + double(s.Im[i]) * s.Im[i];
    return std::sqrt(e);
}

}  // namespace

TEST(Fft, ForwardMatchesDirectDftWithNegativeExponentUnscaled) {
    for (int32_t order : {1, 3, 7, 10, 14}) {
        const int32_t n = 1 << order;
        Signal input = MakeSignal(n, 17u + order);
        Signal out = input;
        FftForward(out.Re.data(), out.Im.data(), order);
        const double tolerance = FftTolerance(order, Norm(input));
        // Every bin for small orders; a spread of bins for 16384 points.
        const int32_t step = order <= 10 ? 1 : 251;
        for (int32_t k = 0; k < n; k += step) {
            const std::complex<double> ref = DirectDft(input, k, -1.0);
            ASSERT_NEAR(out.Re[k], ref.real(), tolerance) << "FftForward order " << order << " bin " << k;
            ASSERT_NEAR(out.Im[k], ref.imag(), tolerance) << "FftForward order " << order << " bin " << k;
        }
    }
}

TEST(Fft, InverseMatchesDirectDftWithPositiveExponentAndOneOverN) {
    for (int32_t order : {2, 5, 9, 14}) {
        const int32_t n = 1 << order;
        Signal input = MakeSignal(n, 99u + order);
        Signal out = input;
        FftInverse(out.Re.data(), out.Im.data(), order);
        const double tolerance = FftTolerance(order, Norm(input)) / n;
        const int32_t step = order <= 9 ? 1 : 509;
        for (int32_t k = 0; k < n; k += step) {
            const std::complex<double> ref = DirectDft(input, k, +1.0) / double(n);
            ASSERT_NEAR(out.Re[k], ref.real(), tolerance) << "FftInverse order " << order << " sample " << k;
            ASSERT_NEAR(out.Im[k], ref.imag(), tolerance) << "FftInverse order " << order << " sample " << k;
        }
    }
}

TEST(Fft, ConventionsOnImpulseConstantAndUnitRotation) {
    const int32_t order = 14, n = 1 << order;
    std::vector<float> re(n, 0.0f), im(n, 0.0f);

    re[0] = 1.0f;
    FftForward(re.data(), im.data(), order);
    for (int32_t k = 0; k < n; ++k) {
        ASSERT_EQ(re[k], 1.0f) << "impulse at 0: bin " << k;
        ASSERT_EQ(im[k], 0.0f) << "impulse at 0: bin " << k;
    }

    std::fill(re.begin(), re.end(), 1.0f);
    std::fill(im.begin(), im.end(), 0.0f);
    FftForward(re.data(), im.data(), order);
    EXPECT_EQ(re[0], float(n)) << "constant 1.0: bin 0 holds N";
    for (int32_t k = 1; k < n; ++k) ASSERT_NEAR(std::hypot(re[k], im[k]), 0.0, 1e-9) << "constant: bin " << k;
    FftInverse(re.data(), im.data(), order);
    for (int32_t i = 0; i < n; ++i) ASSERT_EQ(re[i], 1.0f) << "inverse of N in bin 0: sample " << i;

    // e^(+2 pi i n / N) is the first positive frequency: N in bin 1 only.
    for (int32_t i = 0; i < n; ++i) {
        re[i] = static_cast<float>(std::cos(2.0 * kPi * i / n));
        im[i] = static_cast<float>(std::sin(2.0 * kPi * i / n));
    }
    FftForward(re.data(), im.data(), order);
    EXPECT_NEAR(re[1], n, 0.05) << "unit rotation lands in bin 1";
    EXPECT_NEAR(im[1], 0.0, 0.05);
    EXPECT_NEAR(std::hypot(re[n - 1], im[n - 1]), 0.0, 0.05) << "and not in bin N-1 (sign convention)";
    FftInverse(re.data(), im.data(), order);
    for (int32_t i = 0; i < n; i += 97) {
        ASSERT_NEAR(re[i], std::cos(2.0 * kPi * i / n), 1e-5) << "sample " << i;
        ASSERT_NEAR(im[i], std::sin(2.0 * kPi * i / n), 1e-5) << "sample " << i;
    }
}

TEST(Fft, RoundTripGivesBackTheSignal) {
    const int32_t order = 14, n = 1 << order;
    Signal input = MakeSignal(n, 5u);
    Signal s = input;
    FftForward(s.Re.data(), s.Im.data(), order);
    FftInverse(s.Re.data(), s.Im.data(), order);
    // Two transforms of rounding on values of size ~1: a few 1e-7 each.
    constexpr double kRoundTripTolerance = 5e-6;
    for (int32_t i = 0; i < n; ++i) {
        ASSERT_NEAR(s.Re[i], input.Re[i], kRoundTripTolerance) << "sample " << i;
        ASSERT_NEAR(s.Im[i], input.Im[i], kRoundTripTolerance) << "sample " << i;
    }
}

TEST(Fft, OrdersOutsideOneToFifteenLeaveTheArraysAlone) {
    float re[4] = {1, 2, 3, 4}, im[4] = {0, 0, 0, 0};
    FftForward(re, im, 0);
    FftInverse(re, im, 16);
    FftForward(re, im, -3);
    EXPECT_EQ(re[0], 1.0f);
    EXPECT_EQ(re[3], 4.0f);
}

TEST(Fft, AlternatingOrdersKeepTheirOwnTwiddles) {
    // The tables are kept per order; switching order must remake them.
    const int32_t n = 8;
    Signal a = MakeSignal(n, 3u);
    Signal ref = a;
    FftForward(ref.Re.data(), ref.Im.data(), 3);
    std::vector<float> big(1 << 12, 1.0f), bigIm(1 << 12, 0.0f);
    FftForward(big.data(), bigIm.data(), 12);
    FftForward(a.Re.data(), a.Im.data(), 3);
    for (int32_t k = 0; k < n; ++k) {
        EXPECT_EQ(a.Re[k], ref.Re[k]) << "bin " << k;
        EXPECT_EQ(a.Im[k], ref.Im[k]) << "bin " << k;
    }
}
