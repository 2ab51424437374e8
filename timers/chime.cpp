#include "timers/chime.h"

#include <cmath>

float ChimePartials[2 * ChimePartialCount];
float ChimeSamples[2 * ChimeFrames];
int16_t ChimePcm[2 * ChimeFrames];

namespace {
constexpr float RadiansPerSampleHz = 0.0001308997f;  // 2 pi / 48000, single precision

// sin(n step) comes from rotating (cos, sin) by the step instead of a sin per
// frame. sin and cos anchor the rotation every ChimeAnchorFrames, so that its
// drift stays near 1e-13 and the float sums equal those of a sin per frame
// apart from rare rounding. One vector of four doubles holds frames n and
// n + 1 of both channels, as the samples lie in memory (left, right, left,
// right); two vectors are in flight, each rotated by four frames per step.
constexpr int32_t ChimeAnchorFrames = 1024;
typedef double Double4 __attribute__((vector_size(32)));
typedef float Float4 __attribute__((vector_size(16)));

// Adds partials left (2k) and right (2k + 1) to the interleaved samples,
// each addition rounded to float.
void AddPartialPair(float* samples, const double step[2], const double amplitude[2]) {
    double c1[2], s1[2];
    Double4 c4, s4;
    for (int32_t ch = 0; ch < 2; ++ch) {
        c1[ch] = std::cos(step[ch]);
        s1[ch] = std::sin(step[ch]);
        c4[ch] = c4[ch + 2] = std::cos(4 * step[ch]);
        s4[ch] = s4[ch + 2] = std::sin(4 * step[ch]);
    }
    const Double4 gain = {amplitude[0], amplitude[1], amplitude[0], amplitude[1]};
    for (int32_t n0 = 0; n0 < ChimeFrames; n0 += ChimeAnchorFrames) {
        // Lane f * 2 + ch of the pair (a, b) is frame n0 + f, channel ch.
        double c[4][2], s[4][2];
        for (int32_t ch = 0; ch < 2; ++ch) {
            c[0][ch] = std::cos(n0 * step[ch]);
            s[0][ch] = std::sin(n0 * step[ch]);
            for (int32_t f = 1; f < 4; ++f) {
                c[f][ch] = c[f - 1][ch] * c1[ch] - s[f - 1][ch] * s1[ch];
                s[f][ch] = s[f - 1][ch] * c1[ch] + c[f - 1][ch] * s1[ch];
            }
        }
        Double4 ca = {c[0][0], c[0][1], c[1][0], c[1][1]}, sa = {s[0][0], s[0][1], s[1][0], s[1][1]};
        Double4 cb = {c[2][0], c[2][1], c[3][0], c[3][1]}, sb = {s[2][0], s[2][1], s[3][0], s[3][1]};
        for (float* p = samples + 2 * n0; p < samples + 2 * (n0 + ChimeAnchorFrames); p += 8) {
            Float4 lo, hi;
            __builtin_memcpy(&lo, p, sizeof lo);
            __builtin_memcpy(&hi, p + 4, sizeof hi);
            lo = __builtin_convertvector(__builtin_convertvector(lo, Double4) + sa * gain, Float4);
            hi = __builtin_convertvector(__builtin_convertvector(hi, Double4) + sb * gain, Float4);
            __builtin_memcpy(p, &lo, sizeof lo);
            __builtin_memcpy(p + 4, &hi, sizeof hi);
            const Double4 na = ca * c4 - sa * s4, nb = cb * c4 - sb * s4;
            sa = sa * c4 + ca * s4;
            sb = sb * c4 + cb * s4;
            ca = na;
            cb = nb;
        }
    }
}
}  // namespace

void MakeChimePartials(float* partials) {
    for (int32_t i = 0; i < ChimePartialCount; ++i) {
        partials[i] = static_cast<float>(220.0 * std::pow(2.0, i * 0.25));
        partials[ChimePartialCount + i] = i >= 2 ? static_cast<float>(1.0 / (i + 1)) : 1.0f;
    }
}

void SynthesizeChime(const float* partials, float* samples) {
    for (int32_t i = 0; i < 2 * ChimeFrames; ++i) samples[i] = 0.0f;
    const double w = RadiansPerSampleHz;
    for (int32_t k = 0; k < ChimePartialCount / 2; ++k) {
        const double step[2] = {partials[2 * k] * w, partials[2 * k + 1] * w};
        const double amplitude[2] = {partials[ChimePartialCount + 2 * k], partials[ChimePartialCount + 2 * k + 1]};
        AddPartialPair(samples, step, amplitude);
    }
}

float ChimePeakFor(int32_t attenuator) {
    return static_cast<float>(
        std::pow(10.0, (attenuator * static_cast<double>(0.07874016f) - static_cast<double>(20.078739f)) * 0.1) *
        32766.0);
}

void ScaleChime(float* samples, float peak, int16_t* pcm) {
    float largest = 0.0f;
    for (int32_t i = 0; i < 2 * ChimeFrames; ++i) {
        const float magnitude = std::fabs(samples[i]);
        if (magnitude > largest) largest = magnitude;
    }
    const float scale = static_cast<float>(static_cast<double>(peak) / largest);
    for (int32_t i = 0; i < 2 * ChimeFrames; ++i) {
        samples[i] = static_cast<float>(static_cast<double>(samples[i]) * scale);
        pcm[i] = static_cast<int16_t>(samples[i]);
    }
}

float MakeChime(int32_t attenuator) {
    MakeChimePartials(ChimePartials);
    SynthesizeChime(ChimePartials, ChimeSamples);
    const float peak = ChimePeakFor(attenuator);
    ScaleChime(ChimeSamples, peak, ChimePcm);
    return peak;
}
