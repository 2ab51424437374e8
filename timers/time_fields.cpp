#include "timers/time_fields.h"
#include "app/core_state.h"
#include "app/globals.h"
#include "timers/time_text.h"

namespace {
enum FieldIndex : int32_t { MinuteSlot = 0, HourSlot = 1, FadeInSlot = 2, FadeOutSlot = 3 };

// Checks one field, stores its value (also when out of range) and rewrites
// its text as the stored integer. Leaves the stored value alone when the
// text itself is unacceptable.
void ParseTimeField(HWND field, int32_t slot, int32_t fieldIndex, int32_t low, int32_t high,
                    int32_t* result) {
    // Only the first two characters are checked, but four are converted.
    char text[5] = {0, 0, 0, 0, 0};
    GetWindowTextA(field, text, 3);
    if (!CheckTimeText(text)) {
        FieldValid[slot] = 0;
        *result = 0;
        return;
    }
    GetWindowTextA(field, text, sizeof(text));
    const int32_t value = TimeTextValue(text);
    ControlSettings.Value[fieldIndex] = value;
    char shown[16];
    wsprintfA(shown, "%d", value);
    SetWindowTextA(field, shown);
    if (value >= low && value <= high) {
        FieldValid[slot] = 1;
    } else {
        FieldValid[slot] = 0;
        *result = 0;
    }
}

void Complain(HWND owner, const char* text) {
    MessageBoxA(owner, text, "Sombrel Player", MB_ICONHAND);
}

bool Marked(int32_t field) { return ControlSettings.Value[field] == 1; }
}  // namespace

void EnableFadeOutControls() {
    const BOOL on = Marked(AlarmOn) || Marked(PlayUntilOn);
    EnableWindow(FadeOutBox, on);
    EnableWindow(FadeOutField, on);
}

void ShowChimeButton() {
    ShowWindow(ChimeButton, Marked(AlarmOn) ? SW_SHOWNORMAL : SW_HIDE);
}

int32_t ValidateTimeFields() {
    int32_t result = 1;
    if (Marked(PlayUntilOn) || Marked(AlarmOn)) {
        ParseTimeField(MinuteField, MinuteSlot, Alarm_Min, 0, 59, &result);
        ParseTimeField(HourField, HourSlot, Alarm_Hr, 1, 12, &result);
        if (FieldValid[MinuteSlot] == 0) Complain(MinuteField, "Minutes must be between 0 and 59");
        if (FieldValid[HourSlot] == 0) Complain(HourField, "Hours must be between 1 and 12");
    }
    if (Marked(FadeInOn)) {
        ParseTimeField(FadeInField, FadeInSlot, FadeInTime, 1, 15, &result);
        if (FieldValid[FadeInSlot] == 0)
            Complain(FadeInField, "Fade In Time must be between 1 and 15 minutes");
    }
    if (Marked(FadeOutOn)) {
        ParseTimeField(FadeOutField, FadeOutSlot, FadeOutTime, 1, 15, &result);
        if (FieldValid[FadeOutSlot] == 0)
            Complain(FadeOutField, "Fade Out Time must be between 1 and 15 minutes");
    }
    // A flag left at 0 by an earlier Play also draws the focus; the last
    // failing field keeps it.
    HWND fields[4] = {MinuteField, HourField, FadeInField, FadeOutField};
    for (int32_t i = 0; i < 4; ++i)
        if (FieldValid[i] == 0) SetFocus(fields[i]);
    return result;
}

HBRUSH TimeFieldBrush(HWND field) {
    int32_t slot;
    bool featureOn;
    if (field == MinuteField || field == HourField) {
        slot = field == MinuteField ? MinuteSlot : HourSlot;
        featureOn = Marked(PlayUntilOn) || Marked(AlarmOn);
    } else if (field == FadeInField) {
        slot = FadeInSlot;
        featureOn = Marked(FadeInOn);
    } else if (field == FadeOutField) {
        slot = FadeOutSlot;
        featureOn = Marked(FadeOutOn);
    } else {
        return nullptr;
    }
    return featureOn && FieldValid[slot] == 0 ? RedFieldBrush : WhiteFieldBrush;
}
