#include "timers/chime.h"

#include <cmath>

float ChimePartials[2 * ChimePartialCount];
float ChimeSamples[2 * ChimeFrames];
int16_t ChimePcm[2 * ChimeFrames];

namespace {
constexpr float RadiansPerSampleHz = 0.0001308997f;  // 2 pi / 48000, single precision
}

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
        const double leftStep = partials[2 * k] * w;
        const double rightStep = partials[2 * k + 1] * w;
        const double leftAmplitude = partials[ChimePartialCount + 2 * k];
        const double rightAmplitude = partials[ChimePartialCount + 2 * k + 1];
        for (int32_t n = 0; n < ChimeFrames; ++n) {
            samples[2 * n] = static_cast<float>(samples[2 * n] + std::sin(n * leftStep) * leftAmplitude);
            samples[2 * n + 1] = static_cast<float>(samples[2 * n + 1] + std::sin(n * rightStep) * rightAmplitude);
        }
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
