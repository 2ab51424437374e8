// engine/platform.h: what the portable core needs from whoever hosts it.
//
// The core calls these; it defines none of them. The Windows program defines
// them in audio/, timers/ and app/; the render tool and the tests each link
// their own definitions.
#pragma once
#include <cstdint>

// The stop check fired inside block generation: stop the main stream. The
// block in hand must then not be queued (the render tool ends the render).
void StopPlayback();

// Called right after StopPlayback when Alarm is on: start the alarm chime.
void StartChime();

// Each block's right and left channel, 8192 floats each, after the gain stage
// and before clipping: the level meter takes its peaks from them, unless the
// block stopped the stream (it is never played).
void UpdatePeaks(const float* right, const float* left);

// The local wall clock, hour 0..23 and minute 0..59; read once when Play
// sets up the stop time. Seconds are not wanted.
void ReadLocalClock(int32_t* hour, int32_t* minute);
