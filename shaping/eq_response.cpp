#include "shaping/eq_response.h"

#include <cmath>

#include "engine/vector_ops.h"

namespace {
constexpr float BinsPerHz = 0.34133333f;   // 16384 / 48000, single precision
}

float EqBandCentre(int32_t band) {
    return static_cast<float>(20.0 * std::pow(2.0, band * 0.332195));
}

float EqLevelDbFor(int32_t value) {
    return static_cast<float>(-(value * static_cast<double>(0.15748031f) -
                                static_cast<double>(20.15748f)));
}

void InitEqResponse(SynthRecord* state) {
    for (int32_t k = 0; k < EqBandCount; ++k) {
        state->EqBandFrequency[k] = EqBandCentre(k);
        state->EqBandLevelDb[k] = 0.0f;
    }
    FillFloats(state->EqResponse, 1.0f, FrameLength);
}

void BuildEqResponse(SynthRecord* state, const ControlRecord* settings) {
    float* response = state->EqResponse;
    FillFloats(response, 1.0f, FrameLength);
    for (int32_t k = 0; k < EqBandCount; ++k)
        state->EqBandLevelDb[k] = EqLevelDbFor(settings->Value[EqBandFirst + k]);

    // Between neighbouring band centres the gain is a line in dB over log10
    // of the bin number; the shared end bin is written twice, the upper
    // pair's value standing.
    for (int32_t k = 0; k + 1 < EqBandCount; ++k) {
        const int32_t i1 = static_cast<int32_t>(static_cast<double>(state->EqBandFrequency[k]) * BinsPerHz);
        const int32_t i2 = static_cast<int32_t>(static_cast<double>(state->EqBandFrequency[k + 1]) * BinsPerHz);
        const double a = state->EqBandLevelDb[k] * 0.05;
        const double b = state->EqBandLevelDb[k + 1] * 0.05;
        const double log1 = std::log10(static_cast<double>(i1));
        const double s = (a - b) / (log1 - std::log10(static_cast<double>(i2)));
        const float slope = static_cast<float>(s);
        const float c = static_cast<float>(a - s * log1);
        if (i1 <= i2) {
            const double gain = std::pow(10.0, static_cast<double>(c));
            for (int32_t i = i1; i <= i2; ++i)
                response[i] = static_cast<float>(std::pow(static_cast<double>(i), static_cast<double>(slope)) * gain);
        }
    }
}
