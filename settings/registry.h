// settings/registry.h: the settings kept between runs in the registry key
// "Software\Sombrel", 109 REG_DWORD values in the stored form of
// settings/value_codec.h. The key below HKEY_LOCAL_MACHINE is the first
// choice; a user who may not write there keeps the same key below
// HKEY_CURRENT_USER, which a start then reads instead.
#pragma once

// Once, after the first layout of the window with all its controls: reads
// the per-user key if there is one, else the machine's, and applies every
// accepted value to its field, memory and control; a value not accepted
// keeps its start value. After a load "EQ Lock" is checked, the Fade Out
// pair follows Stop Time and Alarm and the chime test button follows Alarm.
// Without either key (a first start) nothing changes and nothing is shown.
void LoadSettings();

// At WM_DESTROY, only after a run in which Play was used: writes the 109
// values to the machine's key and removes the user's own copy, or, when the
// machine's key cannot take them, to the per-user key without a word. One
// "Registry Creation Error" box, with the code of the step that failed, when
// neither key can be written.
void SaveSettings();
