// timers/chime_win.h: the alarm chime on its own wave-out device (Windows).
// StartChime itself is declared in engine/platform.h.
#pragma once
#include <windows.h>

// A done-notification (MM_WOM_DONE) from the chime device: counts it and,
// at the 32nd, ends the chime (IsChiming 0, CloseChime). The window
// procedure calls it only when IsChiming is 1 and device is ChimeDevice.
void OnChimeBufferDone(HWAVEOUT device);

// Resets, unprepares the 32 headers and closes the chime device.
void CloseChime();
