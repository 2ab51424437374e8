// engine/block_filter_tables.h: the buffers and tables that the block filter's
// code paths share (engine/block_filter.cpp makes them; the kernels in
// engine/block_filter_kernel.inc read them). Private to the block filter.
// Only data and constants are shared with the kernels: an inline function
// compiled into the AVX2 kernel could be the copy the linker keeps for all.
//
// Storage order of a transformed frame (FilterData, FilterA, FilterB):
// bit-reversed frequency order, as a decimation-in-frequency transform leaves
// it, except that inside every chunk of 32 the four groups of 8 are stored
// transposed, lanes across groups, because the last three radix-2 levels run
// with one group per vector lane:
//
//   logical (bit-reversed) 32c + 8g + e   is stored at   32c + 4e + g
//   (g = group 0..3, e = element 0..7)
//
// Bit-reversed positions pair k with 8192 - k by reversal inside each octave
// block [2^s, 2^(s+1)); the transposition keeps that for s >= 5, and chunk 0
// (s < 5) pairs through FirstChunkPartner.
#pragma once
#include <cstdint>

constexpr int32_t PackedLength = 8192;  // complex points of the packed transform

// Per radix-4 stage with quarter length Q, for each j = 4i .. 4i + 3 one run
// of 24 doubles: four lanes each of cos and -sin of 2 pi m j / (4Q) for
// m = 1, 2, 3 (the forward twiddles W^j, W^2j, W^3j; the inverse uses their
// conjugates).
constexpr int32_t StageQuarters[5] = {2048, 512, 128, 32, 8};
constexpr int32_t StageOffsets[5] = {0, 6 * 2048, 6 * 2560, 6 * 2688, 6 * 2720};  // into StageTwiddles
constexpr int32_t StageTwiddleLength = 6 * 2728;

extern double StageTwiddles[StageTwiddleLength];

// The packed frame and its transform: real parts at 0, imaginary parts at
// FilterImOffset + 8192. The quarters of a frame lie 16 KiB apart; the extra
// offset keeps the real and imaginary streams out of each other's cache sets.
constexpr int32_t FilterImOffset = 64;
extern double FilterData[2 * PackedLength + FilterImOffset];
extern double FilterA[PackedLength];    // a_k in storage order
extern double FilterB[PackedLength];    // b_k in storage order
extern int32_t FirstChunkPartner[32];   // stored position of the mirror bin, chunk 0
