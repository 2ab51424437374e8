// engine/block_filter.h: the block path's filter. A real frame (the
// excitation between two runs of 4096 zeros) is filtered by a real response
// and only the real part is kept, so one 8192-point complex transform pair in
// double precision does the work of the 16384-point float pair:
//
//   frame x   | 4096 zeros |  excitation (8192)  | 4096 zeros |   16384 reals
//   packed z  |    0...    |  z[m] = x[2m] + i x[2m+1]  | 0... |   8192 complex
//   Z  = FFT8192(z); Z'[k] = a_k Z[k] + i b_k conj(Z[8192 - k])
//   z' = IFFT8192(Z') unscaled; y[2m] = Re z'[m], y[2m+1] = Im z'[m]
//
// with a_k, b_k made from the response once per change of it (the 1/16384
// scaling included). y equals Re(FftInverse(response . FftForward(x))) apart
// from rounding. Runs on the window thread only; allocates nothing.
#pragma once
#include <cstdint>

// Derives the filter's coefficients from response (16384 floats, the gain of
// each bin). Must be called whenever the response changes, before the next
// FilterFrame; until the first call the filter passes nothing (all zero).
void SetFilterResponse(const float* response);

// frame[n] = float(y[n]) * window[n], n = 0..16383: excitation (8192 floats,
// frame positions 4096..12287) filtered by the response last set. frame and
// window are 16384 floats; frame may not overlap the excitation.
void FilterFrame(const float* excitation, const float* window, float* frame);

// Which code path FilterFrame takes: AVX2 where the processor has it, else
// the SSE2 baseline. Both give the same bytes; tests force the baseline to
// prove it. Returns 1 when the AVX2 path is in use.
int32_t FilterUsesAvx2();
void ForceBaselineFilter(bool baseline);
