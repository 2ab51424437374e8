// settings/registry.h: the settings kept between runs in the registry key
// HKEY_LOCAL_MACHINE "Software\Sombrel": 109 REG_DWORD values in the stored
// form of settings/value_codec.h.
#pragma once

// Once, after the first layout of the window with all its controls: reads
// the key and applies every accepted value to its field, memory and control;
// a value not accepted keeps its start value. After a load "EQ Lock" is
// checked, the Fade Out pair follows Stop Time and Alarm and the chime test
// button follows Alarm. Without the key (a first start) nothing changes and
// nothing is shown.
void LoadSettings();

// At WM_DESTROY, only after a run in which Play was used: writes the 109
// values. A key that cannot be opened or created is reported once; each
// value that fails to write gets its own box.
void SaveSettings();
