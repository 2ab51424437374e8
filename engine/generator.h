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
// the accumulators keep only what the next blocks still need:
//
//   after block b   | 0 .. 4095          | 4096 .. 8191   | 8192 .. 12287   |
//   accumulator     | F(b-1) + F(b) tail | F(b) middle    | F(b) last 4096  |
//                     complete             + F(b+1) start   + F(b+1) middle
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
