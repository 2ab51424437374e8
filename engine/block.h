// engine/block.h: the block processor, from control values to a finished
// 16-bit stereo block.
#pragma once
#include <cstdint>
#include "app/control_settings.h"
#include "engine/synth_state.h"

// Slider laws; v is a slider value 1..255, single-precision constants,
// double arithmetic, results rounded to float.
float OutputGainFor(int32_t attenuator);   // 327.66 at 1, 3276.6 at 128, 32766.01 at 255
float DropWidthFor(int32_t hardness);      // 15 (14.999998) at 1, 45 at 128, 75 at 255
float ToneGainDbFor(int32_t value);        // -20 dB at 1, 0 at 128, +20 dB at 255

// Engine start values, once before any block: flat responses, an empty drop
// table, the synthesis window, ramp depth and slope, the equaliser band grid.
// Also sets the process-wide CachedSettings to a value no control holds and
// EqChanged to 1, so the first block rebuilds every curve and the drop table
// whatever settings were loaded.
void InitEngine(SynthRecord* state);

// Engine part of Play: fade-in length and slope from FadeInTime, counters
// and BlockIndex to 0. The stop-time set-up is SetUpTimers (timers/).
void PrepareForPlay(const ControlRecord* settings, SynthRecord* state);

// Makes one block into state->PcmBlock: rebuilds what changed since the
// last block (as cached), makes the excitation, generates, reports peaks,
// clips to +-32000, truncates to 16 bits and advances BlockIndex.
// Reads and clears the process-wide EqChanged.
void ProcessBlock(const ControlRecord* settings, ControlRecord* cached, SynthRecord* state);

// The two finishing steps, exposed for the tests: clip both channels to
// +-32000 and convert into pcm (left = reversed, right = direct), truncating.
void ClipAndConvert(float* direct, float* reversed, int16_t* pcm);

// Rebuilds TotalResponse: product of the five responses over bins 6..6825,
// normalised to a mean square of 1; 1e-22 elsewhere. Hands it to the block
// filter (SetFilterResponse).
void BuildTotalResponse(SynthRecord* state);
