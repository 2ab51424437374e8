#include "engine/vector_ops.h"

#include <cstring>

void CopyFloats(const float* source, float* destination, int32_t n) {
    if (n > 0) std::memmove(destination, source, static_cast<size_t>(n) * sizeof(float));
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
    // Four running maxima side by side: the largest magnitude is the same in
    // any order, and four lanes keep the compare off the critical path.
    typedef float Float4 __attribute__((vector_size(16)));
    Float4 lanes = {0.0f, 0.0f, 0.0f, 0.0f};
    int32_t i = 0;
    for (; i + 4 <= n; i += 4) {
        Float4 v;
        __builtin_memcpy(&v, values + i, sizeof v);
        const Float4 magnitude = v < 0.0f ? -v : v;
        lanes = magnitude > lanes ? magnitude : lanes;
    }
    float peak = 0.0f;
    for (int32_t l = 0; l < 4; ++l)
        if (lanes[l] > peak) peak = lanes[l];
    for (; i < n; ++i) {
        const float magnitude = values[i] < 0.0f ? -values[i] : values[i];
        if (magnitude > peak) peak = magnitude;
    }
    return static_cast<int32_t>(peak);
}
