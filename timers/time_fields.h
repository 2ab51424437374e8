// timers/time_fields.h: the stop-time, alarm and fade controls of the window.
//
// The four edit fields hold free text until Play, which checks the fields of
// the features that are on. FieldValid (app/globals.h) remembers which field
// failed, to paint it red until it is next touched.
#pragma once
#include <cstdint>
#include <windows.h>

// Enables the "Fade Out" check box and its field exactly when Stop Time or
// Alarm is on; leaves the check mark and FadeOutOn as they are.
void EnableFadeOutControls();

// Shows the chime test button while Alarm is on, hides it otherwise.
void ShowChimeButton();

// Play's check: parses and rewrites the fields of the features that are on,
// stores them in ControlSettings, shows one box per bad field and moves the
// focus there. 1 lets Play proceed, 0 stops it.
int32_t ValidateTimeFields();

// WM_CTLCOLOREDIT: the red or white brush for a time field, nullptr for any
// other edit control (the default colours apply).
HBRUSH TimeFieldBrush(HWND field);
