// engine/generator.h: the spectral block generator and its buffers.
//
// One block: the 8192-sample excitation sits between two runs of 4096 zeros
// in a 16384-point frame, is filtered by the response in the frequency
// domain, windowed and overlap-added at a hop of 8192:
//
//   frame   |  4096 zeros  |   excitation (8192)   |  4096 zeros  |
//   window  |  rising edge |          1.0          | falling edge |
//
// The right channel takes the frame as it is, the left its circular time
// reversal. Each output sample is the sum of two frames (block 0: one), so
// the accumulators keep only what the next blocks still need; after block b,
// with F(b)[m..n] samples m..n of frame b:
//
//   0 .. 4095       F(b-1)[12288..16383] + F(b)[4096..8191]   complete
//   4096 .. 8191    F(b)[8192..12287]    waits for F(b+1)[0..4095]
//   8192 .. 12287   F(b)[12288..16383]   waits for F(b+1)[4096..8191]
//
// Block b+1 emits 0..8191 and moves 8192..12287 down, its frame added.
//
// Runs on the window thread only; not re-entrant.
#pragma once
#include <cstdint>
#include "engine/synth_state.h"

extern float FftReal[FrameLength];          // the windowed, filtered frame of the block; first half doubles as shuffle scratch
extern float SynthesisWindow[FrameLength];  // flat-top window, built once at start-up
extern float OverlapDirect[OverlapLength];  // overlap-add accumulator, right channel
extern float OverlapReversed[OverlapLength];// overlap-add accumulator, left channel

// values[i] = single(gain * exp(q * (i - 4096)^2)), q = -1 / (2 W^2),
// W = width * 81.92 samples; 8192 floats out.
void FillBell(float* values, float width, float gain);

// Builds SynthesisWindow (Gaussian edges of width 11 %, flat middle); once.
void BuildSynthesisWindow();

// Filters the excitation in direct (8192 floats, in and out) with the
// response last given to SetFilterResponse (engine/block_filter.h),
// overlap-adds, writes the right channel to direct and the left to reversed
// (8192 floats), then runs the timer gain stage on both. blockIndex 0
// starts a fresh stream: nothing of earlier blocks is heard.
void GenerateBlock(float* direct, float* reversed, int32_t blockIndex);
