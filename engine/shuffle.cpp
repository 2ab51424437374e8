#include "engine/shuffle.h"

#include "engine/generator.h"

void PermuteByTable(float* values, const int16_t* table) {
    // FftReal's first half is free while the excitation is being made: the
    // transform frame is rebuilt from scratch afterwards.
    float* scratch = FftReal;
    for (int32_t i = 0; i < BlockFrames; ++i) scratch[table[i]] = values[i];
    for (int32_t i = 0; i < BlockFrames; ++i) values[i] = scratch[i];
}

void ShuffleExcitation(float* values, int32_t* blockIndex) {
    if (*blockIndex > LastBlockIndex) *blockIndex = 0;
    const int32_t n = *blockIndex;
    for (int32_t bit = 0; bit < 20; ++bit) {
        if ((n >> bit) & 1) PermuteByTable(values, PermutationTable[20 - bit]);
    }
    // The sign depends on the value alone, so a block's 8192 signed values
    // stay the same set until the drop table is rebuilt.
    for (int32_t i = 0; i < BlockFrames; ++i) {
        const int32_t whole = static_cast<int32_t>(values[i]);
        if ((whole & 1) == 0) values[i] = -values[i];
    }
}
