#include "shaping/tone.h"

#include <cmath>
#include <cstdint>

#include "engine/synth_state.h"
#include "engine/vector_ops.h"

namespace {

// A straight line in dB over log10 of the bin number: 0 dB at bin `inner`,
// gainDb at bin `outer`; bins first..last are written, every other element
// is 1.0. Element i = (i / inner)^s with s = (gainDb / 20) / log10(outer / inner).
void BuildToneRamp(float* response, float gainDb, int32_t inner, int32_t outer,
                   int32_t first, int32_t last) {
    const double la = std::log10(static_cast<double>(inner));
    const double lo = std::log10(static_cast<double>(outer));
    const double g = gainDb * 0.05;
    const double s = g / (lo - la);
    const float slope = static_cast<float>(s);
    const float c = static_cast<float>(-s * la);
    FillFloats(response, 1.0f, FrameLength);
    const double k = std::pow(10.0, static_cast<double>(c));
    for (int32_t i = first; i <= last; ++i)
        response[i] = static_cast<float>(std::pow(static_cast<double>(i), static_cast<double>(slope)) * k);
}

}  // namespace

void BuildBassResponse(float* response, float gainDb) {
    BuildToneRamp(response, gainDb, 170, 6, 6, 169);
}

void BuildSubBassResponse(float* response, float gainDb) {
    BuildToneRamp(response, gainDb, 34, 6, 6, 33);
}

void BuildTrebleResponse(float* response, float gainDb) {
    BuildToneRamp(response, gainDb, 682, 6826, 682, 6825);
}
