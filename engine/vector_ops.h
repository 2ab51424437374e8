// engine/vector_ops.h: small loops over arrays of n 32-bit floats.
// Each does nothing when n <= 0.
#pragma once
#include <cstdint>

void CopyFloats(const float* source, float* destination, int32_t n);  // destination[i] = source[i]
void FillFloats(float* destination, float value, int32_t n);          // destination[i] = value
void ZeroFloats(float* destination, int32_t n);                       // destination[i] = 0
void MultiplyFloats(float* a, const float* b, int32_t n);             // a[i] *= b[i]

// Largest absolute value over n floats (0 for n <= 0), truncated toward zero.
int32_t PeakMagnitude(const float* values, int32_t n);
