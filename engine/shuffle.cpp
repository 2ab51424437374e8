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

// The order of a block depends on its index alone: the value at i ends at
// C[i], C the composition of the tables that the set bits select, bit 0's
// applied first. Consecutive indices share their high bits, so composites
// are kept as a stack:
//
//   Composite[0]          tables of bits 8..19 (rebuilt every 256 blocks)
//   Composite[1..Depth]   then each set bit of 1..7, highest first:
//                         Composite[d][i] = Composite[d-1][T[i]]
//
// Going to the next index pops the levels of the bits that the carry
// cleared and pushes the one bit it set: one composition. Bit 0 (table 20)
// is never stored: odd blocks look it up while scattering.
namespace {

constexpr int32_t StackBits = 7;  // bits 1..7 of the index
int16_t Composite[StackBits + 1][BlockFrames];
int32_t LevelBit[StackBits + 1];  // bit of the index that level d added
int32_t Depth = 0;                // levels in use above Composite[0]
int32_t HighBits = -1;            // index >> 8 that Composite[0] was made for; -1 none yet
int32_t LowBits = 0;              // bits 1..7 of the index the levels were made for
float SignedValues[BlockFrames];  // the drop table with the sign rule applied

const int16_t* TableOfBit(int32_t bit) { return PermutationTable[20 - bit]; }

void Compose(const int16_t* outer, const int16_t* inner, int16_t* result) {
    for (int32_t i = 0; i < BlockFrames; ++i) result[i] = outer[inner[i]];
}

void MakeHighComposite(int32_t high) {
    int16_t* base = Composite[0];
    for (int32_t i = 0; i < BlockFrames; ++i) base[i] = static_cast<int16_t>(i);
    for (int32_t bit = 19; bit >= 8; --bit) {
        if (((high >> (bit - 8)) & 1) == 0) continue;
        Compose(base, TableOfBit(bit), Composite[1]);
        for (int32_t i = 0; i < BlockFrames; ++i) base[i] = Composite[1][i];
    }
    HighBits = high;
    Depth = 0;
    LowBits = 0;
}

void SyncComposites(int32_t n) {
    if ((n >> 8) != HighBits) MakeHighComposite(n >> 8);
    const int32_t low = (n >> 1) & ((1 << StackBits) - 1);
    if (low == LowBits) return;
    int32_t top = StackBits;  // highest bit (of n) where the new low bits differ
    while ((((low ^ LowBits) << 1) >> top & 1) == 0) --top;
    while (Depth > 0 && LevelBit[Depth] <= top) --Depth;
    for (int32_t bit = top; bit >= 1; --bit) {
        if (((low << 1) >> bit & 1) == 0) continue;
        Compose(Composite[Depth], TableOfBit(bit), Composite[Depth + 1]);
        Depth += 1;
        LevelBit[Depth] = bit;
    }
    LowBits = low;
}

}  // namespace

void SetExcitationValues(const float* dropTable) {
    for (int32_t i = 0; i < BlockFrames; ++i) {
        const int32_t whole = static_cast<int32_t>(dropTable[i]);
        SignedValues[i] = (whole & 1) == 0 ? -dropTable[i] : dropTable[i];
    }
}

void MakeExcitation(float* values, int32_t* blockIndex) {
    if (*blockIndex > LastBlockIndex) *blockIndex = 0;
    const int32_t n = *blockIndex;
    SyncComposites(n);
    const int16_t* order = Composite[Depth];
    if (n & 1) {
        const int16_t* first = TableOfBit(0);
        for (int32_t i = 0; i < BlockFrames; ++i) values[order[first[i]]] = SignedValues[i];
    } else {
        for (int32_t i = 0; i < BlockFrames; ++i) values[order[i]] = SignedValues[i];
    }
}
