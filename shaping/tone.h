// shaping/tone.h: the Bass, Sub Bass and Treble tone curves.
// Each writes all 16384 elements of its array: a line in dB over log10 of
// the bin number from 0 dB at the inner anchor to gainDb at the outer one,
// exactly 1.0 outside the shaped bins. gainDb within +-20.
#pragma once

void BuildBassResponse(float* response, float gainDb);     // bins 6..169, outer 6, inner 170
void BuildSubBassResponse(float* response, float gainDb);  // bins 6..33, outer 6, inner 34
void BuildTrebleResponse(float* response, float gainDb);   // bins 682..6825, inner 682, outer 6826
