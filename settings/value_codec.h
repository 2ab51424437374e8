// settings/value_codec.h: the stored form of the program's settings, free of
// any Windows header so that it is tested on every build.
//
// The settings are 109 registry values of type REG_DWORD. Their four data
// bytes are not the number as a DWORD but the start of its decimal text
// ("%d"): 128 is 31 32 38 00, 1000 is 31 30 30 30, -1000 is cut to "-100".
// The first five values are the main sliders, then M1, M2 and M3 of the
// equaliser memories (31 bands each; M1 also gives the current band levels),
// then the switches, the time fields and the profile.
//
// A load takes a stored number only when it reads as one (type REG_DWORD,
// exactly 4 bytes, at least one digit) and, except for the four time fields
// (Play checks those), lies in its control's range; otherwise the field keeps
// its start value.
#pragma once
#include <cstdint>
#include "app/control_settings.h"

constexpr int32_t StoredValueCount = 109;   // values in the key, in write order
constexpr uint32_t StoredValueType = 4;     // REG_DWORD, the only type a load accepts
constexpr uint32_t StoredValueBytes = 4;    // the only data length a load accepts

// What a stored value holds, and so how a load applies it.
enum StoredKind : int32_t {
    StoredSlider = 0,   // a main slider's field (0..4), 1..255
    StoredMemory1 = 1,  // band of M1 and the band's current level, 1..255
    StoredMemory2 = 2,  // band of M2, 1..255
    StoredMemory3 = 3,  // band of M3, 1..255
    StoredSwitch = 4,   // a check box or the AM / PM pair, 0..1
    StoredTime = 5,     // hour, minute or fade minutes: taken as stored, with its text
    StoredProfile = 6   // noise colour or masking profile, 100..107
};

// One row of the table of values.
struct StoredValue {
    char Name[12];   // the registry value name, exactly as written
    int32_t Kind;    // a StoredKind
    int32_t Field;   // ControlSettings field (for the memories: 5 + band)
    int32_t Band;    // 0..30 for the memories, -1 for the others
    int32_t Low;     // range a load accepts (the time fields: any number)
    int32_t High;
};

// The table: row `index` (0..108) in the order SaveSettings writes them.
StoredValue StoredValueAt(int32_t index);

// The four data bytes of a number: the first four characters of its "%d"
// text, then its terminating NUL and zeros when the text is shorter.
void EncodeStoredNumber(int32_t number, uint8_t data[4]);

// Parses the data with atoi's rules (leading blanks, optional sign, digits),
// reading at most `length` bytes and at most four, stopping at a NUL or any
// other character. False, with *number untouched, when no digit is found.
bool DecodeStoredNumber(const uint8_t* data, uint32_t length, int32_t* number);

// The text a time field shows after a load: the data bytes up to the NUL,
// at most four characters (not re-printed: " 07" stays " 07").
void StoredText(const uint8_t* data, uint32_t length, char text[5]);

// What a load makes of a query's outcome: true with *number set when the
// value was found, is a REG_DWORD of 4 bytes, reads as a number and lies in
// its range; false (the field keeps its start value) otherwise.
bool AcceptStoredData(int32_t index, bool found, uint32_t type, const uint8_t* data,
                      uint32_t length, int32_t* number);

// The start value a load keeps when a value is not accepted.
int32_t StartValueOf(int32_t index);

// The number written for row `index`, from the controls and the memories.
int32_t StoredNumberOf(int32_t index, const ControlRecord* settings, const int32_t memories[3][31]);

// Applies a number to what row `index` feeds: its field, its memory entry,
// and for M1 also the band's current level.
void ApplyStoredNumber(int32_t index, int32_t number, ControlRecord* settings,
                       int32_t memories[3][31]);
