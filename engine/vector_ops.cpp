#include "engine/vector_ops.h"

void CopyFloats(const float* source, float* destination, int32_t n) {
    for (int32_t i = 0; i < n; ++i) destination[i] = source[i];
}

void FillFloats(float* destination, float value, int32_t n) {
    for (int32_t i = 0; i < n; ++i) destination[i] = value;
}

void ZeroFloats(float* destination, int32_t n) {
    FillFloats(destination, 0.0f, n);
}

void MultiplyFloats(float* a, const float* b, int32_t n) {
    for (int32_t i = 0; i < n; ++i) a[i] *= b[i];
}

int32_t PeakMagnitude(const float* values, int32_t n) {
    float peak = 0.0f;
    for (int32_t i = 0; i < n; ++i) {
        float magnitude = values[i] < 0.0f ? -values[i] : values[i];
        if (magnitude > peak) peak = magnitude;
    }
    return static_cast<int32_t>(peak);
}
