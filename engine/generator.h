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
// reversal. Runs on the window thread only; not re-entrant.
#pragma once
#include <cstdint>
#include "engine/synth_state.h"

extern float FftReal[FrameLength];          // transform frame, real part; first half doubles as shuffle scratch
extern float FftImag[FrameLength];          // transform frame, imaginary part
extern float ReversedFrame[FrameLength];    // circular time reversal of the direct frame
extern float SynthesisWindow[FrameLength];  // flat-top window, built once at start-up
extern float OverlapDirect[OverlapLength];  // overlap-add accumulator, right channel
extern float OverlapReversed[OverlapLength];// overlap-add accumulator, left channel

// values[i] = single(gain * exp(q * (i - 4096)^2)), q = -1 / (2 W^2),
// W = width * 81.92 samples; 8192 floats out.
void FillBell(float* values, float width, float gain);

// Builds SynthesisWindow (Gaussian edges of width 11 %, flat middle); once.
void BuildSynthesisWindow();

// Filters the excitation in direct (8192 floats, in and out) with response
// (16384 floats), overlap-adds, writes the right channel to direct and the
// left to reversed (8192 floats), then runs the timer gain stage on both.
// blockIndex 0 clears the accumulators and starts a fresh stream.
void GenerateBlock(float* direct, float* reversed, const float* response, int32_t blockIndex);
