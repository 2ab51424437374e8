#include "shaping/profiles.h"

#include <cmath>

#include "app/control_settings.h"
#include "engine/vector_ops.h"

namespace {

// One resonance: centre C in Hz, numerator Q (A) and denominator Q (B).
// At C the section's gain is B / A: A < B boosts, A > B cuts.
struct PeakSection {
    float Frequency;
    float ZeroQ;
    float PoleQ;
};

const PeakSection TalkingSections[] = {
    {91.41763f, 0.046f, 0.5791057f},
    {20000.0f, 1.708083f, 0.068f},
    {97.95576f, 0.3358082f, 0.15f},
};
const PeakSection MusicSections[] = {
    {45.8f, 0.05f, 1.119f},
    {30.27f, 0.6497673f, 0.046f},
    {389.9689f, 0.1309f, 0.104f},
    {8147.6f, 0.265253f, 0.026f},
    {20000.0f, 3.895375f, 0.174f},
    {21.43f, 4.42f, 0.176f},
};
const PeakSection TrafficSections[] = {
    {60.399f, 0.044f, 1.1523f},
    {1352.166f, 0.196f, 0.9823269f},
    {16256.61f, 2.149779f, 0.054f},
    {5023.772f, 0.7116859f, 0.142f},
    {21.43039f, 1.415892f, 0.2f},
    {389.9689f, 0.2980443f, 0.084f},
};
const PeakSection DogsSections[] = {
    {833.7387f, 0.008f, 0.8976148f},
    {10023.0f, 0.8884993f, 0.158f},
    {12.4683f, 0.024f, 0.478863f},
};

// Power-law colour: amplitude 10^(slope * log2(1e6 / b)), so every octave
// multiplies it by 10^-slope: Pink 0.15 (-3 dB/octave), Red 0.30 (-6 dB),
// Brown 0.45 (-9 dB).
void BuildColour(double slope, SynthRecord* state) {
    const float l = static_cast<float>(std::log10(2.0));
    const double d = 1.0 / l;
    const double s = std::pow(10.0, d * (6.0 * slope));
    const double e = -slope * d;
    for (int32_t b = FirstAudibleBin; b <= LastAudibleBin; ++b)
        state->ProfileResponse[b] = static_cast<float>(std::pow(static_cast<double>(b), e) * s);
}

void LoadSections(const PeakSection* sections, int32_t count, SynthRecord* state) {
    state->ProfilePeakCount = count;
    for (int32_t j = 0; j < count; ++j) {
        state->ProfileFrequency[j] = sections[j].Frequency;
        state->ProfileZeroQ[j] = sections[j].ZeroQ;
        state->ProfilePoleQ[j] = sections[j].PoleQ;
    }
}

}  // namespace

void BuildPeakResponse(SynthRecord* state) {
    float* response = state->ProfileResponse;
    FillFloats(response + FirstAudibleBin, 1.0f, AudibleBinCount);
    for (int32_t j = 0; j < state->ProfilePeakCount; ++j) {
        const float w0 = static_cast<float>(static_cast<double>(state->ProfileFrequency[j]) * 6.2831855f);
        const float a = static_cast<float>(1.0 / state->ProfileZeroQ[j]);
        const float bq = static_cast<float>(1.0 / state->ProfilePoleQ[j]);
        const double w0Squared = static_cast<double>(w0) * w0;
        for (int32_t b = FirstAudibleBin; b <= LastAudibleBin; ++b) {
            const double w = static_cast<float>(b * static_cast<double>(18.40777f));
            const double p = (w0Squared - w * w) * (w0Squared - w * w);
            const double zero = w * a * w0;
            const double pole = w * bq * w0;
            const double numerator = p + zero * zero;
            const double denominator = p + pole * pole;
            response[b] = static_cast<float>(response[b] * std::sqrt(numerator / denominator));
        }
    }
}

void BuildProfileResponse(int32_t profile, SynthRecord* state) {
    switch (profile) {
    case ProfileWhite:
        FillFloats(state->ProfileResponse + FirstAudibleBin, 1.0f, AudibleBinCount);
        break;
    case ProfilePink:  BuildColour(0.15, state); break;
    case ProfileRed:   BuildColour(0.30, state); break;
    case ProfileBrown: BuildColour(0.45, state); break;
    case ProfileTalking:
        LoadSections(TalkingSections, 3, state);
        BuildPeakResponse(state);
        break;
    case ProfileMusic:
        LoadSections(MusicSections, 6, state);
        BuildPeakResponse(state);
        break;
    case ProfileTraffic:
        LoadSections(TrafficSections, 6, state);
        BuildPeakResponse(state);
        break;
    case ProfileDogs:
        LoadSections(DogsSections, 3, state);
        BuildPeakResponse(state);
        break;
    default:
        break;  // a damaged value changes nothing
    }
}
