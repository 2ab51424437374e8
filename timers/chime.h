// timers/chime.h: the alarm chime's sound, computed afresh each time it is
// needed: a steady chord of 32 sine partials on quarter-octave steps from
// 220 Hz, even partials on the left, odd on the right, no envelope, 262 144
// frames (5.461 s), scaled to the volume setting and truncated to 16 bits.
// Portable; the Windows side that plays it is timers/chime_win.cpp.
#pragma once
#include <cstdint>

constexpr int32_t ChimePartialCount = 32;
constexpr int32_t ChimeFrames = 262144;
constexpr int32_t ChimeBufferCount = 32;                           // queued at once, never refilled
constexpr int32_t ChimeBufferFrames = ChimeFrames / ChimeBufferCount;  // 8192, one block each

extern float ChimePartials[2 * ChimePartialCount];  // 0..31 frequencies in Hz, 32..63 amplitudes
extern float ChimeSamples[2 * ChimeFrames];         // the summed chord, left then right per frame
extern int16_t ChimePcm[2 * ChimeFrames];           // the chord as played

// Frequencies 220 * 2^(i/4) Hz; amplitudes 1, 1, then 1/(i+1).
void MakeChimePartials(float* partials);

// Sums the chord into samples (2 * 262144 floats, zeroed first): partial 2k
// on the left, 2k+1 on the right, each from phase 0 at frame 0, added in
// partial order and rounded to float after each addition; equal to a sin per
// frame apart from rare rounding.
void SynthesizeChime(const float* partials, float* samples);

// The chime's peak for a volume setting 1..255: the rain's output gain law,
// 327.66 at 1 to 32766 at 255.
float ChimePeakFor(int32_t attenuator);

// Scales samples so that its largest magnitude becomes peak and truncates
// each into pcm (same layout).
void ScaleChime(float* samples, float peak, int16_t* pcm);

// The whole chime for a volume setting into ChimePcm; returns its peak.
float MakeChime(int32_t attenuator);
