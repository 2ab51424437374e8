// engine/shuffle.h: the permutation tables and the excitation shuffle.
#pragma once
#include <cstdint>
#include "engine/synth_state.h"

constexpr int32_t PermutationTableCount = 21;

// 21 constant permutations of 0..8191; table 0 shuffles the drop table once,
// tables 1..20 the excitation of each block. Compiled-in constant data.
extern const int16_t PermutationTable[PermutationTableCount][BlockFrames];

// Moves the value at position i to position table[i], for all 8192 i.
// Uses the first half of FftReal as scratch.
void PermuteByTable(float* values, const int16_t* table);

// Wraps *blockIndex to 0 when above 524288, applies table 20 - b for every
// set bit b of it (bit 0 first), then negates every value whose integer
// part is even. values: 8192 floats, in and out. Table by table, as the
// tests' reference; the block path uses MakeExcitation.
void ShuffleExcitation(float* values, int32_t* blockIndex);

// Keeps a copy of the drop table (8192 floats) with the sign rule applied.
// Call whenever the drop table is rebuilt, before the next MakeExcitation.
void SetExcitationValues(const float* dropTable);

// values (8192 floats, out) = ShuffleExcitation of a copy of the drop table
// last given to SetExcitationValues, with the same wrap of *blockIndex.
// Costs one scatter, plus one composition of index tables every other block
// when blocks come in order (every 256th block up to 13 of them).
void MakeExcitation(float* values, int32_t* blockIndex);
