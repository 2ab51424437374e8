#include "engine/generator.h"

#include <cmath>

#include "engine/fft.h"
#include "engine/vector_ops.h"
#include "timers/timer_gains.h"

float FftReal[FrameLength];
float FftImag[FrameLength];
float ReversedFrame[FrameLength];
float SynthesisWindow[FrameLength];
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

void GenerateBlock(float* direct, float* reversed, const float* response, int32_t blockIndex) {
    ZeroFloats(FftReal, FrameLength);
    ZeroFloats(FftImag, FrameLength);
    CopyFloats(direct, FftReal + EdgeLength, BlockFrames);

    FftForward(FftReal, FftImag, FftOrder);
    MultiplyFloats(FftReal, response, FrameLength);
    MultiplyFloats(FftImag, response, FrameLength);
    FftInverse(FftReal, FftImag, FftOrder);
    MultiplyFloats(FftReal, SynthesisWindow, FrameLength);

    // Circular time reversal: index k goes to (16384 - k) mod 16384.
    ReversedFrame[0] = FftReal[0];
    for (int32_t k = 1; k < FrameLength; ++k) ReversedFrame[FrameLength - k] = FftReal[k];

    if (blockIndex == 0) {
        // A fresh stream: nothing of an earlier Play may be heard.
        ZeroFloats(OverlapDirect, OverlapLength);
        ZeroFloats(OverlapReversed, OverlapLength);
        CopyFloats(FftReal + EdgeLength, OverlapDirect, FrameLength - EdgeLength);
        CopyFloats(ReversedFrame + EdgeLength, OverlapReversed, FrameLength - EdgeLength);
        CopyFloats(OverlapDirect, direct, BlockFrames);
        CopyFloats(OverlapReversed, reversed, BlockFrames);
    } else {
        //  accumulator: | 0 .. 4095 | 4096 ....... 20479 |
        //                 tail        + this frame (16384)
        // emit 0..8191, then shift down by one block.
        for (int32_t i = 0; i < FrameLength; ++i) {
            OverlapDirect[EdgeLength + i] += FftReal[i];
            OverlapReversed[EdgeLength + i] += ReversedFrame[i];
        }
        CopyFloats(OverlapDirect, direct, BlockFrames);
        CopyFloats(OverlapReversed, reversed, BlockFrames);
        CopyFloats(OverlapDirect + BlockFrames, OverlapDirect, OverlapLength - BlockFrames);
        CopyFloats(OverlapReversed + BlockFrames, OverlapReversed, OverlapLength - BlockFrames);
        ZeroFloats(OverlapDirect + OverlapLength - BlockFrames, BlockFrames);
        ZeroFloats(OverlapReversed + OverlapLength - BlockFrames, BlockFrames);
    }

    ApplyTimerGains(direct, reversed, blockIndex);
}
