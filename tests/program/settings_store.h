// tests/program/settings_store.h: the tests' direct hands on the program's
// registry key "Software\Sombrel" in the throw-away Wine prefix, below
// HKEY_LOCAL_MACHINE (the default) or HKEY_CURRENT_USER: clear it, write raw
// values (also damaged ones), read them back byte for byte, and make the key
// refuse writing.
#pragma once
#include <cstdint>
#include <string>
#include <vector>
#include <windows.h>

// Removes the key in both hives (first undoing DenySettingsKey), so the
// program starts as on its first run. True when no key is left.
bool ForgetStoredSettings();
bool SettingsKeyExists(HKEY hive = HKEY_LOCAL_MACHINE);

// Writes one value with exactly the given type and bytes (the key is made
// when missing).
bool StoreRaw(const char* name, DWORD type, const void* data, DWORD length,
              HKEY hive = HKEY_LOCAL_MACHINE);
// Writes a number as the program does: a REG_DWORD holding the first four
// bytes of its "%d" text.
bool StoreNumber(const char* name, int32_t number, HKEY hive = HKEY_LOCAL_MACHINE);

// One value as stored.
struct RawValue {
    bool Found;
    DWORD Type;
    std::vector<uint8_t> Bytes;
};
RawValue ReadRaw(const char* name, HKEY hive = HKEY_LOCAL_MACHINE);
// The number a stored value's text gives, or `fallback` when it is not a
// REG_DWORD of 4 bytes starting with a number.
int32_t ReadNumber(const char* name, int32_t fallback = -99999, HKEY hive = HKEY_LOCAL_MACHINE);
// The names of all values in the key.
std::vector<std::string> StoredNames();

// Gives the key an empty access list, so the program can neither open it for
// writing nor create it; ForgetStoredSettings undoes it.
bool DenySettingsKey(HKEY hive = HKEY_LOCAL_MACHINE);

// The 109 value names in the order the program writes them.
std::string StoredName(int32_t index);
