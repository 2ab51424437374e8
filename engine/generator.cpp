#include "engine/generator.h"

#include <cmath>

#include "engine/block_filter.h"
#include "engine/vector_ops.h"
#include "timers/timer_gains.h"

alignas(64) float FftReal[FrameLength];
alignas(64) float SynthesisWindow[FrameLength];
float OverlapDirect[OverlapLength];
float OverlapReversed[OverlapLength];

namespace {
constexpr int32_t EdgeLength = 4096;        // zeros before and after the excitation
constexpr float WindowBellWidth = 11.0f;    // percent of 8192: the window edges' spread
}

void FillBell(float* values, float width, float gain) {
    const float w = static_cast<float>(static_cast<double>(width) * 8192.0 * 0.01);
    const float q = static_cast<float>(-1.0 / (2.0 * static_cast<double>(w) * w));
    for (int32_t i = 0; i < BlockFrames; ++i) {
        const double x = i - 4096;
        values[i] = static_cast<float>(gain * std::exp(q * x * x));
    }
}

void BuildSynthesisWindow() {
    FillBell(SynthesisWindow, WindowBellWidth, 1.0f);
    CopyFloats(SynthesisWindow + EdgeLength, SynthesisWindow + 3 * EdgeLength, EdgeLength);
    FillFloats(SynthesisWindow + EdgeLength, 1.0f, BlockFrames);
}

namespace {

typedef float Float4 __attribute__((vector_size(16)));

Float4 Load4(const float* p) {
    Float4 v;
    __builtin_memcpy(&v, p, sizeof v);
    return v;
}

void Store4(float* p, Float4 v) { __builtin_memcpy(p, &v, sizeof v); }

// p[0], p[-1], p[-2], p[-3]: four samples of the reversed frame.
Float4 Load4Reversed(const float* p) { return __builtin_shufflevector(Load4(p - 3), Load4(p - 3), 3, 2, 1, 0); }

}  // namespace

void GenerateBlock(float* direct, float* reversed, int32_t blockIndex) {
    const float* frame = FftReal;
    FilterFrame(direct, SynthesisWindow, FftReal);
    // The reversed frame is read in place: its sample k is frame[(16384 - k) mod 16384].
    const float* mirror = frame + FrameLength;  // mirror[-k] = frame[16384 - k], k = 1 .. 16383

    if (blockIndex == 0) {
        // A fresh stream: the middle of this frame alone, and its second half kept.
        for (int32_t i = 0; i < OverlapLength; i += 4) {
            Store4(OverlapDirect + i, Load4(frame + EdgeLength + i));
            Store4(OverlapReversed + i, Load4Reversed(mirror - EdgeLength - i));
        }
        CopyFloats(OverlapDirect, direct, BlockFrames);
        CopyFloats(OverlapReversed, reversed, BlockFrames);
    } else {
        // Each sample is the sum of two frames, added in one float addition
        // (as a running accumulator starting from zero would add them).
        CopyFloats(OverlapDirect, direct, EdgeLength);
        CopyFloats(OverlapReversed, reversed, EdgeLength);
        for (int32_t i = EdgeLength; i < BlockFrames; i += 4)
            Store4(direct + i, Load4(OverlapDirect + i) + Load4(frame + i - EdgeLength));
        reversed[EdgeLength] = OverlapReversed[EdgeLength] + frame[0];
        for (int32_t i = EdgeLength + 1; i < EdgeLength + 4; ++i) reversed[i] = OverlapReversed[i] + mirror[EdgeLength - i];
        for (int32_t i = EdgeLength + 4; i < BlockFrames; i += 4)
            Store4(reversed + i, Load4(OverlapReversed + i) + Load4Reversed(mirror + EdgeLength - i));
        for (int32_t i = 0; i < EdgeLength; i += 4) {
            Store4(OverlapDirect + i, Load4(OverlapDirect + BlockFrames + i) + Load4(frame + EdgeLength + i));
            Store4(OverlapReversed + i, Load4(OverlapReversed + BlockFrames + i) + Load4Reversed(mirror - EdgeLength - i));
        }
        for (int32_t i = EdgeLength; i < OverlapLength; i += 4) {
            Store4(OverlapDirect + i, Load4(frame + EdgeLength + i));
            Store4(OverlapReversed + i, Load4Reversed(mirror - EdgeLength - i));
        }
    }

    ApplyTimerGains(direct, reversed, blockIndex);
}
