// shaping/eq_response.h: the 31-band equaliser's response.
#pragma once
#include <cstdint>
#include "app/control_settings.h"
#include "engine/synth_state.h"

// Band centre k in Hz, single(20 * 2^(k * 0.332195)), k = 0..30.
float EqBandCentre(int32_t band);

// Band slider value 1..255 to level in dB: +20 at 1, 0 at 128, -20 at 255.
float EqLevelDbFor(int32_t value);

// Fills EqBandFrequency with the 31 centres; EqBandLevelDb 0; EqResponse 1.0.
void InitEqResponse(SynthRecord* state);

// Recomputes EqBandLevelDb from the band fields of settings and rebuilds
// EqResponse over bins 6..6826 (1.0 elsewhere).
void BuildEqResponse(SynthRecord* state, const ControlRecord* settings);
