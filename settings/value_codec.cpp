#include "settings/value_codec.h"

#include <cstdio>
#include <cstring>

namespace {
constexpr int32_t MainSliderCount = 5;

// Rows 98..108: the switches, the time fields and the profile, in the order
// they are written, with the field each one feeds.
struct TailRow {
    const char* Name;
    int32_t Kind;
    int32_t Field;
};
constexpr TailRow TailRows[11] = {
    {"PlayUntilOn", StoredSwitch, PlayUntilOn}, {"AlarmOn", StoredSwitch, AlarmOn},
    {"Alarm_PM", StoredSwitch, Alarm_PM},       {"Alarm_AM", StoredSwitch, Alarm_AM},
    {"Alarm_Hr", StoredTime, Alarm_Hr},         {"Alarm_Min", StoredTime, Alarm_Min},
    {"Profile", StoredProfile, Profile},        {"FadeInOn", StoredSwitch, FadeInOn},
    {"FadeOutOn", StoredSwitch, FadeOutOn},     {"FadeInTime", StoredTime, FadeInTime},
    {"FadeOutTime", StoredTime, FadeOutTime}};

constexpr const char* SliderNames[MainSliderCount] = {"Attenuator", "Hardness", "Bass", "SubBass",
                                                      "Treble"};

// Value names of the memories: the band plus 0 (M1), 100 (M2) or 1000 (M3).
constexpr int32_t MemoryNameBase[3] = {0, 100, 1000};

void SetName(StoredValue* row, const char* name) {
    std::snprintf(row->Name, sizeof(row->Name), "%s", name);
}

bool IsBlank(uint8_t c) { return c == ' ' || (c >= '\t' && c <= '\r'); }
}  // namespace

StoredValue StoredValueAt(int32_t index) {
    StoredValue row = {};
    row.Band = -1;
    row.Low = SliderMin;
    row.High = SliderMax;
    if (index < 0 || index >= StoredValueCount) {
        row.Kind = -1;
        row.Field = -1;
        return row;
    }
    if (index < MainSliderCount) {
        SetName(&row, SliderNames[index]);
        row.Kind = StoredSlider;
        row.Field = index;
        return row;
    }
    if (index < MainSliderCount + 3 * EqBandCount) {
        const int32_t memory = (index - MainSliderCount) / EqBandCount;
        row.Band = (index - MainSliderCount) % EqBandCount;
        std::snprintf(row.Name, sizeof(row.Name), "%d", MemoryNameBase[memory] + row.Band);
        row.Kind = StoredMemory1 + memory;
        row.Field = EqBandFirst + row.Band;
        return row;
    }
    const TailRow& tail = TailRows[index - MainSliderCount - 3 * EqBandCount];
    SetName(&row, tail.Name);
    row.Kind = tail.Kind;
    row.Field = tail.Field;
    if (tail.Kind == StoredSwitch) {
        row.Low = 0;
        row.High = 1;
    } else if (tail.Kind == StoredProfile) {
        row.Low = ProfileWhite;
        row.High = ProfileDogs;
    } else {
        // Play checks the time fields and names the bad one; a load keeps
        // any number, as the user could have typed it.
        row.Low = INT32_MIN;
        row.High = INT32_MAX;
    }
    return row;
}

void EncodeStoredNumber(int32_t number, uint8_t data[4]) {
    char text[16] = {};
    std::snprintf(text, sizeof(text), "%d", number);
    // Bytes after the NUL are not significant; they are written as zeros.
    for (int32_t i = 0; i < 4; ++i) data[i] = static_cast<uint8_t>(text[i]);
}

bool DecodeStoredNumber(const uint8_t* data, uint32_t length, int32_t* number) {
    const uint32_t end = length < 4 ? length : 4;
    uint32_t i = 0;
    while (i < end && IsBlank(data[i])) ++i;
    bool negative = false;
    if (i < end && (data[i] == '+' || data[i] == '-')) {
        negative = data[i] == '-';
        ++i;
    }
    int32_t value = 0;
    bool digit = false;
    for (; i < end && data[i] >= '0' && data[i] <= '9'; ++i) {
        value = value * 10 + (data[i] - '0');  // at most four digits: no overflow
        digit = true;
    }
    if (!digit) return false;
    *number = negative ? -value : value;
    return true;
}

void StoredText(const uint8_t* data, uint32_t length, char text[5]) {
    const uint32_t end = length < 4 ? length : 4;
    uint32_t i = 0;
    for (; i < end && data[i] != 0; ++i) text[i] = static_cast<char>(data[i]);
    text[i] = '\0';
}

bool AcceptStoredData(int32_t index, bool found, uint32_t type, const uint8_t* data,
                      uint32_t length, int32_t* number) {
    if (!found || type != StoredValueType || length != StoredValueBytes) return false;
    int32_t value = 0;
    if (!DecodeStoredNumber(data, length, &value)) return false;
    const StoredValue row = StoredValueAt(index);
    if (row.Kind < 0 || value < row.Low || value > row.High) return false;
    *number = value;
    return true;
}

int32_t StartValueOf(int32_t index) {
    const StoredValue row = StoredValueAt(index);
    if (row.Field < 0) return 0;
    ControlRecord start;
    SetControlStartValues(&start);
    // The memories start where the bands start: all at the neutral 128.
    return start.Value[row.Field];
}

int32_t StoredNumberOf(int32_t index, const ControlRecord* settings, const int32_t memories[3][31]) {
    const StoredValue row = StoredValueAt(index);
    if (row.Kind >= StoredMemory1 && row.Kind <= StoredMemory3)
        return memories[row.Kind - StoredMemory1][row.Band];
    if (row.Field < 0) return 0;
    return settings->Value[row.Field];
}

void ApplyStoredNumber(int32_t index, int32_t number, ControlRecord* settings,
                       int32_t memories[3][31]) {
    const StoredValue row = StoredValueAt(index);
    if (row.Field < 0) return;
    if (row.Kind >= StoredMemory1 && row.Kind <= StoredMemory3) {
        memories[row.Kind - StoredMemory1][row.Band] = number;
        // The current band levels are not stored on their own: M1 brings them.
        if (row.Kind == StoredMemory1) settings->Value[row.Field] = number;
        return;
    }
    settings->Value[row.Field] = number;
}
