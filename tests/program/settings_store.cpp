#include "tests/expected_stored_names.h"
#include "tests/program/settings_store.h"

#include <cstdio>
#include <cstdlib>

namespace {
const char KeyName[] = "Software\\Sombrel";

void OpenUp(HKEY hive) {
    // An empty access list still lets the owner change it.
    HKEY key = nullptr;
    if (RegOpenKeyExA(hive, KeyName, 0, WRITE_DAC, &key) != ERROR_SUCCESS) return;
    SECURITY_DESCRIPTOR sd;
    InitializeSecurityDescriptor(&sd, SECURITY_DESCRIPTOR_REVISION);
    SetSecurityDescriptorDacl(&sd, TRUE, nullptr, FALSE);  // no list: everyone may
    RegSetKeySecurity(key, DACL_SECURITY_INFORMATION, &sd);
    RegCloseKey(key);
}
}  // namespace

bool SettingsKeyExists(HKEY hive) {
    HKEY key = nullptr;
    if (RegOpenKeyExA(hive, KeyName, 0, KEY_QUERY_VALUE, &key) != ERROR_SUCCESS) {
        // A denied key exists too.
        if (RegOpenKeyExA(hive, KeyName, 0, WRITE_DAC, &key) != ERROR_SUCCESS) return false;
    }
    RegCloseKey(key);
    return true;
}

bool ForgetStoredSettings() {
    for (HKEY hive : {HKEY_LOCAL_MACHINE, HKEY_CURRENT_USER}) {
        OpenUp(hive);
        RegDeleteKeyA(hive, KeyName);
    }
    return !SettingsKeyExists(HKEY_LOCAL_MACHINE) && !SettingsKeyExists(HKEY_CURRENT_USER);
}

bool StoreRaw(const char* name, DWORD type, const void* data, DWORD length, HKEY hive) {
    HKEY key = nullptr;
    DWORD disposition = 0;
    if (RegCreateKeyExA(hive, KeyName, 0, nullptr, 0, KEY_WRITE, nullptr, &key,
                        &disposition) != ERROR_SUCCESS)
        return false;
    const LONG r = RegSetValueExA(key, name, 0, type, static_cast<const BYTE*>(data), length);
    RegCloseKey(key);
    return r == ERROR_SUCCESS;
}

bool StoreNumber(const char* name, int32_t number, HKEY hive) {
    char text[16] = {};
    std::snprintf(text, sizeof(text), "%d", number);
    uint8_t data[4] = {};
    for (int i = 0; i < 4; ++i) data[i] = static_cast<uint8_t>(text[i]);
    return StoreRaw(name, REG_DWORD, data, 4, hive);
}

RawValue ReadRaw(const char* name, HKEY hive) {
    RawValue value = {false, REG_NONE, {}};
    HKEY key = nullptr;
    if (RegOpenKeyExA(hive, KeyName, 0, KEY_QUERY_VALUE, &key) != ERROR_SUCCESS)
        return value;
    uint8_t data[256];
    DWORD length = sizeof(data);
    if (RegQueryValueExA(key, name, nullptr, &value.Type, data, &length) == ERROR_SUCCESS) {
        value.Found = true;
        value.Bytes.assign(data, data + length);
    }
    RegCloseKey(key);
    return value;
}

int32_t ReadNumber(const char* name, int32_t fallback, HKEY hive) {
    const RawValue value = ReadRaw(name, hive);
    if (!value.Found || value.Type != REG_DWORD || value.Bytes.size() != 4) return fallback;
    char text[5] = {};
    for (int i = 0; i < 4 && value.Bytes[i] != 0; ++i) text[i] = static_cast<char>(value.Bytes[i]);
    if (text[0] == 0) return fallback;
    return std::atoi(text);
}

std::vector<std::string> StoredNames() {
    std::vector<std::string> names;
    HKEY key = nullptr;
    if (RegOpenKeyExA(HKEY_LOCAL_MACHINE, KeyName, 0, KEY_QUERY_VALUE, &key) != ERROR_SUCCESS)
        return names;
    for (DWORD i = 0;; ++i) {
        char name[256];
        DWORD length = sizeof(name);
        if (RegEnumValueA(key, i, name, &length, nullptr, nullptr, nullptr, nullptr) != ERROR_SUCCESS) break;
        names.push_back(name);
    }
    RegCloseKey(key);
    return names;
}

bool DenySettingsKey(HKEY hive) {
    HKEY key = nullptr;
    DWORD disposition = 0;
    if (RegCreateKeyExA(hive, KeyName, 0, nullptr, 0, KEY_ALL_ACCESS, nullptr, &key,
                        &disposition) != ERROR_SUCCESS)
        return false;
    SECURITY_DESCRIPTOR sd;
    InitializeSecurityDescriptor(&sd, SECURITY_DESCRIPTOR_REVISION);
    ACL acl;
    InitializeAcl(&acl, sizeof(acl), ACL_REVISION);
    SetSecurityDescriptorDacl(&sd, TRUE, &acl, FALSE);  // a list without entries: nobody may
    const LONG r = RegSetKeySecurity(key, DACL_SECURITY_INFORMATION, &sd);
    RegCloseKey(key);
    return r == ERROR_SUCCESS;
}

std::string StoredName(int32_t index) { return ExpectedStoredName(index); }
