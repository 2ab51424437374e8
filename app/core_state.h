// app/core_state.h: the process-wide state that the portable core reaches.
// Windows-only state (handles, flags of the window and the devices) is in
// app/globals.h.
#pragma once
#include <cstdint>
#include "app/control_settings.h"
#include "engine/synth_state.h"

extern ControlRecord ControlSettings;  // the value of every control, written by the window procedure
extern ControlRecord CachedSettings;   // what the block processor last applied
extern SynthRecord SynthState;         // the engine's one state record
extern int32_t EqChanged;              // 1: band levels changed since the equaliser response was built
extern int32_t EqMemories[3][31];      // equaliser memories M1, M2, M3, 31 band levels each
