#include "app/core_state.h"

// Static storage: zero-filled before the program starts and never freed.
ControlRecord ControlSettings;
ControlRecord CachedSettings;
SynthRecord SynthState;
int32_t EqChanged;
int32_t EqMemories[3][31];
