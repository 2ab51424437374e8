#include "settings/registry.h"

#include "app/core_state.h"
#include "app/globals.h"
#include "timers/time_fields.h"
#include "settings/value_codec.h"

namespace {
const char SettingsKeyName[] = "Software\\Sombrel";

// Profile value of each profile radio button, in id order (1043..1050):
// Dogs (1049) is 107 and Traffic (1050) is 106.
constexpr int32_t ProfileOfButton[ProfileButtonCount] = {
    ProfileWhite, ProfilePink, ProfileRed, ProfileBrown,
    ProfileTalking, ProfileMusic, ProfileDogs, ProfileTraffic};

void RegistryError(int32_t code) {
    wsprintfA(MessageText, "Registry Creation Error %d", code);
    MessageBoxA(MainWindow, MessageText, "Sombrel Player", MB_ICONINFORMATION);
}

void SetCheck(HWND button, int32_t state) {
    SendMessageA(button, BM_SETCHECK, state == 1 ? BST_CHECKED : BST_UNCHECKED, 0);
}

// The edit field that shows a time value, or nullptr for other fields.
HWND TimeFieldOf(int32_t field) {
    switch (field) {
    case Alarm_Hr: return HourField;
    case Alarm_Min: return MinuteField;
    case FadeInTime: return FadeInField;
    case FadeOutTime: return FadeOutField;
    default: return nullptr;
    }
}

// Reads row `index` into the fields and memories; a time value that was
// accepted also puts its stored text into its edit field.
void LoadValue(HKEY key, int32_t index) {
    const StoredValue row = StoredValueAt(index);
    uint8_t data[200] = {};
    DWORD type = REG_NONE;
    DWORD length = sizeof(data);
    const bool found =
        RegQueryValueExA(key, row.Name, nullptr, &type, data, &length) == ERROR_SUCCESS;
    int32_t number = 0;
    // Missing, unreadable or outside the control's range: the start value,
    // never what an earlier read left behind.
    const bool accepted = AcceptStoredData(index, found, type, data, length, &number);
    ApplyStoredNumber(index, accepted ? number : StartValueOf(index), &ControlSettings, EqMemories);
    HWND field = TimeFieldOf(row.Field);
    if (accepted && field != nullptr) {
        char text[5];
        StoredText(data, length, text);
        SetWindowTextA(field, text);
    }
}

// Shows the loaded values in the controls.
void ShowLoadedValues() {
    for (int32_t id = 0; id < SliderCount; ++id)
        SetScrollPos(SliderBars[id], SB_CTL, ControlSettings.Value[id], TRUE);
    SetCheck(StopTimeBox, ControlSettings.Value[PlayUntilOn]);
    SetCheck(AlarmBox, ControlSettings.Value[AlarmOn]);
    SetCheck(PmButton, ControlSettings.Value[Alarm_PM]);
    SetCheck(AmButton, ControlSettings.Value[Alarm_AM]);
    for (int32_t i = 0; i < ProfileButtonCount; ++i) SetCheck(ProfileButtons[i], 0);
    for (int32_t i = 0; i < ProfileButtonCount; ++i)
        if (ProfileOfButton[i] == ControlSettings.Value[Profile]) SetCheck(ProfileButtons[i], 1);
    SetCheck(FadeInBox, ControlSettings.Value[FadeInOn]);
    SetCheck(FadeOutBox, ControlSettings.Value[FadeOutOn]);
}
}  // namespace

void LoadSettings() {
    if (SettingsLoaded == 1) return;
    // Stored values go into the controls, so the load waits for the last of
    // them: a WM_SIZE that comes while the window is being created finds none.
    if (EqDefeatButton == nullptr) return;
    SettingsLoaded = 1;  // before trying: a failed load is not repeated

    HKEY key = nullptr;
    if (RegOpenKeyExA(HKEY_LOCAL_MACHINE, SettingsKeyName, 0, KEY_QUERY_VALUE, &key) != ERROR_SUCCESS)
        return;  // first start: the start values stay, silently
    for (int32_t i = 0; i < StoredValueCount; ++i) LoadValue(key, i);
    if (RegCloseKey(key) != ERROR_SUCCESS) RegistryError(8736);

    ShowLoadedValues();
    EnableFadeOutControls();
    ShowChimeButton();
    // After stored settings the equaliser starts locked.
    SetCheck(EqLockBox, 1);
}

void SaveSettings() {
    if (HasPlayed != 1) return;
    HKEY root = nullptr;
    if (RegOpenKeyExA(HKEY_LOCAL_MACHINE, nullptr, 0, KEY_CREATE_SUB_KEY, &root) != ERROR_SUCCESS) {
        // Nothing can be written: one box, not one per value.
        RegistryError(8735);
        return;
    }
    HKEY key = nullptr;
    DWORD disposition = 0;
    if (RegCreateKeyExA(root, SettingsKeyName, 0, nullptr, REG_OPTION_NON_VOLATILE, KEY_WRITE,
                        nullptr, &key, &disposition) != ERROR_SUCCESS) {
        RegistryError(8734);
    } else {
        for (int32_t i = 0; i < StoredValueCount; ++i) {
            uint8_t data[4];
            EncodeStoredNumber(StoredNumberOf(i, &ControlSettings, EqMemories), data);
            if (RegSetValueExA(key, StoredValueAt(i).Name, 0, REG_DWORD, data, sizeof(data)) !=
                ERROR_SUCCESS)
                RegistryError(8736);
        }
        if (RegCloseKey(key) != ERROR_SUCCESS) RegistryError(8737);
    }
    if (RegCloseKey(root) != ERROR_SUCCESS) RegistryError(8738);
}
