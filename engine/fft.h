// engine/fft.h: in-place complex FFT on split float arrays.
//
// A plain radix-2 transform in single precision. The block path has its own
// real-input route (engine/block_filter.h); the tests keep this one as that
// route's reference.
//
// Conventions:
//   forward  X[k] = sum x[n] e^(-2 pi i nk/N), unscaled
//   inverse  x[n] = (1/N) sum X[k] e^(+2 pi i nk/N)
//   natural order in and out; re and im each hold N = 2^order floats;
//   order 1..15 (other orders do nothing). Not re-entrant: the twiddle
//   tables are shared. Allocates nothing.
#pragma once
#include <cstdint>

void FftForward(float* re, float* im, int32_t order);
void FftInverse(float* re, float* im, int32_t order);
