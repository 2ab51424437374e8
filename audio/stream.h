// audio/stream.h: the rain's playback stream on the default wave-out device.
//
// 48 000 Hz, 16-bit, two channels, in a ring of three 8192-frame slots used
// in the order 0, 1, 2, 0, ...: Play queues two blocks, then every
// MM_WOM_DONE (posted to the main window: CALLBACK_WINDOW, so nothing runs
// on another thread) releases one slot and queues one new block. Every
// failing device call shows its code box, then the device's own text, and
// the operation goes on with its next step. All on the window thread.
#pragma once
#include <cstdint>
#include <windows.h>

// The format of both devices: 48 000 Hz, 16-bit, two channels, PCM.
void FillStreamFormat(WAVEFORMATEX* format);

// Opens the device with `receiver` getting its notifications; slots to 0.
// A failure is reported and the caller goes on as if it were open.
void OpenStream(HWND receiver);

// Copies one block (8192 stereo frames) into the next slot and queues it.
// Does nothing unless IsPlaying is 1 (a refill that hit the stop time).
void WriteBlock(const int16_t* block);

// Unprepares the slot the device handed back (buffers come back in order).
void ReleaseDoneBlock();

// Stops and closes the device, clears IsPlaying, enables the controls Play
// disabled and empties the meter. Does nothing unless IsPlaying is 1. The
// buffers the device still held are counted into HandedBack: their
// notifications are still to come and are no refills.
void StopStream();

// True while a stream error box is on screen. Its modal loop dispatches
// messages, so a done-notification handled then would refill in the middle
// of the operation that failed, before its slot index moved on: the window
// holds such notifications back (DeferredRefills) instead.
bool StreamBoxIsOpen();
