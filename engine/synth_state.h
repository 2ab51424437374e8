// engine/synth_state.h: the engine's one state record and its sizes.
//
// Everything the engine keeps from one block to the next lives in SynthRecord:
// the block counter, the ramp, fade and stop fields of the timers, the level
// and hardness parameters, the drop table, the masking profile's sections, the
// six response arrays (linear amplitude per transform bin, bin b is
// b * 48000 / 16384 Hz) and the finished 16-bit block.
#pragma once
#include <cstdint>

constexpr int32_t BlockFrames = 8192;         // frames per block, 170.67 ms at 48 kHz
constexpr int32_t FrameLength = 16384;        // transform length: 4096 zeros, excitation, 4096 zeros
constexpr int32_t FftOrder = 14;              // log2(FrameLength)
constexpr int32_t OverlapLength = 12288;      // overlap-add accumulator: what later blocks still need
constexpr int32_t SampleRate = 48000;
constexpr int32_t FirstAudibleBin = 6;        // 17.58 Hz
constexpr int32_t LastAudibleBin = 6825;      // 19 995.1 Hz
constexpr int32_t AudibleBinCount = 6820;
constexpr int32_t LastBlockIndex = 524288;    // the excitation's order repeats after 524 289 blocks
constexpr int64_t FramesPerMinute = 2880000;
constexpr int32_t StartRampFrames = 16384;    // start ramp spans blocks 0 and 1
constexpr int32_t MaxProfileSections = 20;

struct SynthRecord {
    int32_t BlockIndex;            // index of the block to be generated next
    int64_t StopBlock;             // the stream stops in the first block with a greater index
    int64_t FadeOutStartBlock;     // the fade-out runs in every block with a greater index
    int64_t FadeInLength;          // fade-in length in frames
    int64_t FadeOutLength;         // fade-out length in frames
    float RampDepthDb;             // depth of the start ramp and the fades, 20 dB
    float FadeInSlopeDb;           // dB per frame of the fade-in
    int64_t FadeInCount;           // frames of fade-in applied so far
    float FadeOutSlopeDb;          // dB per frame of the fade-out (negative)
    int64_t FadeOutCount;          // frames of fade-out applied so far, at most FadeOutLength
    float StartRampSlopeDb;        // dB per frame of the start ramp
    int64_t StartRampCount;        // frames of start ramp applied since Play
    float OutputGain;              // peak of the drop table, from Attenuator
    float ChimePeak;               // target peak amplitude of the alarm chime
    float DropWidth;               // drop table's bell width in percent of 8192, from Hardness
    float EqBandLevelDb[31];       // equaliser band levels in dB, lowest band first
    float EqBandFrequency[31];     // equaliser band centres in Hz
    int32_t ProfilePeakCount;      // sections in use by the current masking profile
    float ProfileZeroQ[MaxProfileSections];     // per section, Q of the numerator
    float ProfilePoleQ[MaxProfileSections];     // per section, Q of the denominator
    float ProfileFrequency[MaxProfileSections]; // per section, centre frequency in Hz
    float DropTable[BlockFrames];          // the excitation's 8192 magnitudes, shuffled by table 0
    float EqResponse[FrameLength];         // equaliser gain per bin
    float ProfileResponse[FrameLength];    // noise colour or masking profile gain per bin
    float BassResponse[FrameLength];       // Bass gain per bin
    float SubBassResponse[FrameLength];    // Sub Bass gain per bin
    float TrebleResponse[FrameLength];     // Treble gain per bin
    float TotalResponse[FrameLength];      // the block filter: normalised product of the five
    float DirectChannel[FrameLength];      // excitation in, right channel out (first 8192 used)
    float ReversedChannel[FrameLength];    // left channel (first 8192 used)
    int16_t PcmBlock[BlockFrames * 2];     // the finished block, left then right per frame
};
