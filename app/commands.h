// app/commands.h: what the main window does for each command, slider step
// and device notification. Each runs on the window thread and writes
// ControlSettings or calls the stream; the engine notices changed fields at
// its next block.
#pragma once
#include <cstdint>
#include <windows.h>

// WM_COMMAND, keyed by the control id; false for ids the window does not
// handle (they go to the default procedure).
bool RunCommand(HWND window, int32_t id);

// The Play sequence: check the time fields, set the timers, disable the
// timer controls, open the stream and queue two blocks. Refused while
// either sound plays.
void PlaySequence(HWND window);

// Help: the about box, then the manual from the program's own directory.
void HelpSequence();

// A step of one of the five main sliders (WM_HSCROLL): the field first,
// then the thumb. Works in every state, also while playing.
void StepMainSlider(HWND slider, int32_t code, int32_t position);

// MM_WOM_DONE from either device: refill the main stream while playing,
// count the chime's buffers while it chimes, ignore anything else.
void OnBufferDone(HWAVEOUT device);

// The controls refused while playing: Play disables them; the stream's stop
// enables them again, the Fade Out pair by the Stop Time / Alarm rule.
void DisableTimerControls();
void EnableTimerControls();
