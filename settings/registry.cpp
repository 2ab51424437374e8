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

// Writes the 109 values to "Software\Sombrel" below `hive`, all of them even
// after a failure. 0 when every step worked, else the code of the first
// step that failed: 8735 the hive could not be opened for creating keys,
// 8734 the key not created or opened, 8736 a value not written, 8737 the key
// and 8738 the hive not closed.
int32_t WriteSettingsKey(HKEY hive) {
    HKEY root = nullptr;
    if (RegOpenKeyExA(hive, nullptr, 0, KEY_CREATE_SUB_KEY, &root) != ERROR_SUCCESS) return 8735;
    int32_t failed = 0;
    HKEY key = nullptr;
    DWORD disposition = 0;
    if (RegCreateKeyExA(root, SettingsKeyName, 0, nullptr, REG_OPTION_NON_VOLATILE, KEY_WRITE, nullptr,
                        &key, &disposition) != ERROR_SUCCESS) {
        failed = 8734;
    } else {
        for (int32_t i = 0; i < StoredValueCount; ++i) {
            uint8_t data[4];
            EncodeStoredNumber(StoredNumberOf(i, &ControlSettings, EqMemories), data);
            if (RegSetValueExA(key, StoredValueAt(i).Name, 0, REG_DWORD, data, sizeof(data)) != ERROR_SUCCESS &&
                failed == 0)
                failed = 8736;
        }
        if (RegCloseKey(key) != ERROR_SUCCESS && failed == 0) failed = 8737;
    }
    if (RegCloseKey(root) != ERROR_SUCCESS && failed == 0) failed = 8738;
    return failed;
}
}  // namespace

// Where the settings are kept. The machine's key is the first choice, as it
// always was. A standard user (and an administrator without elevation) may
// not write below HKEY_LOCAL_MACHINE, and a 64-bit program gets no registry
// virtualization, so every save would fail with a box and every setting be
// lost; such a user's settings go to the same key below HKEY_CURRENT_USER.
//
// Which key a start reads: the per-user key when it exists, else the
// machine's. A per-user key exists only after a save that could not write
// the machine's key, and a save that can write it removes the per-user key,
// so whichever key a user's last save took is the one read at the next start.
void LoadSettings() {
    if (SettingsLoaded == 1) return;
    // Stored values go into the controls, so the load waits for the last of
    // them: a WM_SIZE that comes while the window is being created finds none.
    if (EqDefeatButton == nullptr) return;
    SettingsLoaded = 1;  // before trying: a failed load is not repeated

    HKEY key = nullptr;
    if (RegOpenKeyExA(HKEY_CURRENT_USER, SettingsKeyName, 0, KEY_QUERY_VALUE, &key) != ERROR_SUCCESS &&
        RegOpenKeyExA(HKEY_LOCAL_MACHINE, SettingsKeyName, 0, KEY_QUERY_VALUE, &key) != ERROR_SUCCESS)
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
    const int32_t machine = WriteSettingsKey(HKEY_LOCAL_MACHINE);
    if (machine == 0) {
        // This user's older copy would win at the next start: it goes.
        RegDeleteKeyA(HKEY_CURRENT_USER, SettingsKeyName);
        return;
    }
    // Nothing is said while the user's own key takes the settings; one box
    // when it cannot either.
    const int32_t user = WriteSettingsKey(HKEY_CURRENT_USER);
    if (user != 0) RegistryError(user);
}
