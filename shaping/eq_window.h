// shaping/eq_window.h: the "WYSIWYG 31 Band Graphic Equalizer" panel's
// behaviour: its 31 band sliders, the two readouts, the memories M1, M2, M3
// and " EQ Defeat". The panel's controls, their places and its opening and
// closing are in app/controls.cpp; the window procedure calls in here.
//
// Every change of a level sets EqChanged, so the sound follows at the next
// block. The selected memory is the check state of the four buttons M1, M2,
// M3 and EQ Defeat, of which at most one is checked.
#pragma once
#include <cstdint>
#include <windows.h>
#include "app/control_settings.h"
#include "engine/synth_state.h"

// WM_VSCROLL from a band slider: ignored while "EQ Lock" or " EQ Defeat" is
// checked; otherwise steps the level, moves the thumb, updates the readouts,
// stores the level in the selected memory and sets EqChanged. A scroll bar
// that is not a band only reaches UpdateEqReadouts (its "Error 7294").
void ScrollEqBand(HWND slider, int32_t request, int32_t thumb);

// Commands 1065..1068: checks the pressed button alone, sets EqChanged, and
// recalls its memory (M1..M3) or flattens every band to 128 (EQ Defeat).
void SelectEqMemory(int32_t id);

// Recomputes all 31 EqBandLevelDb and shows band (id - 5): its centre in Hz
// and its level in whole dB. An id outside 5..35 shows "Error 7294" and
// empties both readouts, as there is no band to show.
void UpdateEqReadouts(const ControlRecord* settings, SynthRecord* state, int32_t id);

// Loads memory M1, M2 or M3 (by command id) into the bands and their sliders,
// then shows band 0 in the readouts. Any other id does nothing.
void RecallEqMemory(int32_t id);

// Copies the 31 band levels into whichever of M1, M2, M3 is checked.
void StoreEqMemory();
