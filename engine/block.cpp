#include "engine/block.h"

#include <emmintrin.h>

#include <cmath>

#include "app/core_state.h"
#include "engine/block_filter.h"
#include "engine/generator.h"
#include "engine/platform.h"
#include "engine/shuffle.h"
#include "engine/vector_ops.h"
#include "shaping/eq_response.h"
#include "shaping/profiles.h"
#include "shaping/tone.h"

namespace {
constexpr float OutsideBandResponse = 1.0e-22f;  // not zero: keeps the filter's bins defined
constexpr float ClipLevel = 32000.0f;
}

float OutputGainFor(int32_t attenuator) {
    return static_cast<float>(
        32766.0 * std::pow(10.0, (attenuator * static_cast<double>(0.07874016f) -
                                  static_cast<double>(20.078739f)) * 0.1));
}

float DropWidthFor(int32_t hardness) {
    return static_cast<float>(hardness * static_cast<double>(0.23622048f) +
                              static_cast<double>(14.763778f));
}

float ToneGainDbFor(int32_t value) {
    return static_cast<float>(value * static_cast<double>(0.15748031f) -
                              static_cast<double>(20.15748f));
}

void InitEngine(SynthRecord* state) {
    // Every array the first block reads gets a defined value here, and the
    // caches are set to a value no control can hold, so the first block
    // rebuilds every curve and the drop table even when stored settings hold
    // values (0, or a Profile outside 100..107) that match a zeroed cache.
    FillFloats(state->ProfileResponse, 1.0f, FrameLength);
    FillFloats(state->BassResponse, 1.0f, FrameLength);
    FillFloats(state->SubBassResponse, 1.0f, FrameLength);
    FillFloats(state->TrebleResponse, 1.0f, FrameLength);
    FillFloats(state->TotalResponse, 1.0f, FrameLength);
    ZeroFloats(state->DropTable, BlockFrames);
    InitEqResponse(state);
    BuildSynthesisWindow();
    state->RampDepthDb = 20.0f;
    state->StartRampSlopeDb = state->RampDepthDb / static_cast<float>(StartRampFrames);
    state->BlockIndex = 0;
    state->StopBlock = 0;
    state->FadeInLength = 0;
    state->FadeInSlopeDb = 0.0f;
    state->FadeInCount = 0;
    state->FadeOutStartBlock = 0;
    state->FadeOutLength = 0;
    state->FadeOutSlopeDb = 0.0f;
    state->FadeOutCount = 0;
    state->StartRampCount = 0;
    state->OutputGain = 0.0f;
    state->DropWidth = 0.0f;
    state->ChimePeak = 0.0f;
    state->ProfilePeakCount = 0;
    for (int32_t i = 0; i < ControlFieldCount; ++i) CachedSettings.Value[i] = INT32_MIN;
    EqChanged = 1;
}

void PrepareForPlay(const ControlRecord* settings, SynthRecord* state) {
    state->FadeInLength = static_cast<int64_t>(
        static_cast<double>(settings->Value[FadeInTime]) * static_cast<double>(FramesPerMinute));
    state->FadeInSlopeDb = static_cast<float>(static_cast<double>(state->RampDepthDb) /
                                              static_cast<double>(state->FadeInLength));
    state->FadeInCount = 0;
    state->StartRampCount = 0;
    state->BlockIndex = 0;
}

void BuildTotalResponse(SynthRecord* state) {
    float* total = state->TotalResponse;
    for (int32_t k = FirstAudibleBin; k <= LastAudibleBin; ++k) {
        float t = state->ProfileResponse[k];
        t *= state->EqResponse[k];
        t *= state->BassResponse[k];
        t *= state->SubBassResponse[k];
        t *= state->TrebleResponse[k];
        total[k] = t;
    }
    FillFloats(total, OutsideBandResponse, FirstAudibleBin);
    FillFloats(total + LastAudibleBin + 1, OutsideBandResponse, FrameLength - LastAudibleBin - 1);

    double energy = 0.0;
    for (int32_t k = FirstAudibleBin; k <= LastAudibleBin; ++k)
        energy += static_cast<double>(total[k]) * total[k];
    // A (nearly) silent product is used as it is rather than divided by ~0.
    if (energy > 1e-19) {
        const float e = static_cast<float>(energy);
        const double scale = std::sqrt(static_cast<double>(AudibleBinCount) / e);
        for (int32_t k = FirstAudibleBin; k <= LastAudibleBin; ++k)
            total[k] = static_cast<float>(total[k] * scale);
    }
    SetFilterResponse(total);
}

void ClipAndConvert(float* direct, float* reversed, int16_t* pcm) {
    // Four frames at a time. max(-32000, x) and min(32000, x) clip exactly:
    // below -32000 becomes -32000, above 32000 becomes 32000. The
    // conversion truncates toward zero as a cast does; the saturating pack
    // changes nothing, all values being clipped.
    const __m128 low = _mm_set1_ps(-ClipLevel), high = _mm_set1_ps(ClipLevel);
    for (int32_t i = 0; i < BlockFrames; i += 4) {
        const __m128 right = _mm_min_ps(high, _mm_max_ps(low, _mm_loadu_ps(direct + i)));
        const __m128 left = _mm_min_ps(high, _mm_max_ps(low, _mm_loadu_ps(reversed + i)));
        _mm_storeu_ps(direct + i, right);
        _mm_storeu_ps(reversed + i, left);
        const __m128i r = _mm_cvttps_epi32(right), l = _mm_cvttps_epi32(left);
        _mm_storeu_si128(reinterpret_cast<__m128i*>(pcm + 2 * i),
                         _mm_packs_epi32(_mm_unpacklo_epi32(l, r), _mm_unpackhi_epi32(l, r)));
    }
}

void ProcessBlock(const ControlRecord* settings, ControlRecord* cached, SynthRecord* state) {
    const int32_t* now = settings->Value;
    int32_t* was = cached->Value;
    bool responsesChanged = false;

    if (now[Profile] != was[Profile]) {
        BuildProfileResponse(now[Profile], state);
        was[Profile] = now[Profile];
        responsesChanged = true;
    }
    if (now[Attenuator] != was[Attenuator] || now[Hardness] != was[Hardness]) {
        state->OutputGain = OutputGainFor(now[Attenuator]);
        state->DropWidth = DropWidthFor(now[Hardness]);
        FillBell(state->DropTable, state->DropWidth, state->OutputGain);
        PermuteByTable(state->DropTable, PermutationTable[0]);
        SetExcitationValues(state->DropTable);
        was[Attenuator] = now[Attenuator];
        was[Hardness] = now[Hardness];
    }
    if (now[Bass] != was[Bass]) {
        BuildBassResponse(state->BassResponse, ToneGainDbFor(now[Bass]));
        was[Bass] = now[Bass];
        responsesChanged = true;
    }
    if (now[SubBass] != was[SubBass]) {
        BuildSubBassResponse(state->SubBassResponse, ToneGainDbFor(now[SubBass]));
        was[SubBass] = now[SubBass];
        responsesChanged = true;
    }
    if (now[Treble] != was[Treble]) {
        BuildTrebleResponse(state->TrebleResponse, ToneGainDbFor(now[Treble]));
        was[Treble] = now[Treble];
        responsesChanged = true;
    }
    if (EqChanged == 1) {
        BuildEqResponse(state, settings);
        EqChanged = 0;
        responsesChanged = true;
    }
    if (responsesChanged) BuildTotalResponse(state);

    MakeExcitation(state->DirectChannel, &state->BlockIndex);
    GenerateBlock(state->DirectChannel, state->ReversedChannel, state->BlockIndex);
    UpdatePeaks(state->DirectChannel, state->ReversedChannel);
    ClipAndConvert(state->DirectChannel, state->ReversedChannel, state->PcmBlock);
    state->BlockIndex += 1;
}
