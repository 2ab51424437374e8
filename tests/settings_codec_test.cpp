// The stored form of the settings: a number is kept as the first four bytes
// of its decimal text, and a load takes a stored value only when it is a
// REG_DWORD of 4 bytes reading as a number in its control's range (the time
// fields: any number, for Play to check).
#include <gtest/gtest.h>
#include <cstring>
#include "settings/value_codec.h"
#include "tests/expected_stored_names.h"

namespace {
int32_t RowOf(const std::string& name) {
    for (int32_t row = 0; row < StoredValueCount; ++row)
        if (ExpectedStoredName(row) == name) return row;
    return -1;
}
const uint8_t* Bytes(const char* text) { return reinterpret_cast<const uint8_t*>(text); }
}  // namespace

TEST(StoredValue, IsWrittenAsTheStartOfTheNumbersDecimalTextUnderItsName) {
    const struct { int32_t Number; const char* Bytes; size_t Significant; } cases[] = {
        {128, "128\0", 4}, {15, "15\0", 3}, {0, "0\0", 2}, {1000, "1000", 4}, {12345, "1234", 4}, {-5, "-5\0", 3}, {-1000, "-100", 4}};
    for (const auto& c : cases) {
        uint8_t data[4] = {0xAA, 0xAA, 0xAA, 0xAA};
        EncodeStoredNumber(c.Number, data);
        EXPECT_EQ(std::string(reinterpret_cast<char*>(data), c.Significant), std::string(c.Bytes, c.Significant)) << "EncodeStoredNumber(" << c.Number << ")";
    }
    for (int32_t row = 0; row < StoredValueCount; ++row) EXPECT_EQ(StoredValueAt(row).Name, ExpectedStoredName(row)) << "row " << row;
    EXPECT_TRUE(StoredValueAt(StoredValueCount).Kind < 0 && StoredValueAt(-1).Kind < 0) << "rows outside the table";
}

TEST(StoredValue, IsTakenOnlyAsAFourByteDwordReadingAsANumberInItsRange) {
    // Number -1000: not taken. Each range's first and last value, and the first beyond.
    const struct { const char* Name; const char* Bytes; int32_t Number; } cases[] = {
        {"Attenuator", "1\0\0", 1}, {"Attenuator", "255\0", 255}, {"Attenuator", "0\0\0", -1000}, {"Treble", "256\0", -1000},
        {"0", "1\0\0", 1},          {"130", "255\0", 255},       {"1030", "0\0\0", -1000},       {"30", "256\0", -1000},
        {"AlarmOn", "0\0\0", 0},    {"Alarm_AM", "1\0\0", 1},    {"FadeOutOn", "2\0\0", -1000},  {"Alarm_PM", "-1\0", -1000},
        {"Profile", "100\0", 100},  {"Profile", "107\0", 107},   {"Profile", "99\0", -1000},     {"Profile", "108\0", -1000},
        {"Alarm_Hr", "-999", -999}, {"FadeOutTime", "9999", 9999},
        // Read as atoi reads, within four bytes.
        {"Alarm_Min", "12x\0", 12}, {"Bass", " 42\0", 42},       {"Bass", "\t7\0\0", 7},         {"Bass", "+9\0\0", 9},
        {"Bass", "7\0" "55", 7},    {"Bass", "ab\0\0", -1000},   {"Bass", "-\0\0\0", -1000},     {"Bass", "\0\0\0\0", -1000}};
    for (const auto& c : cases) {
        int32_t number = -1000;
        const bool taken = AcceptStoredData(RowOf(c.Name), true, 4, Bytes(c.Bytes), 4, &number);
        EXPECT_EQ(taken ? number : -1000, c.Number) << c.Name << " \"" << c.Bytes << "\"";
    }
    // Only a present REG_DWORD (type 4) of 4 bytes: each other form of a good number.
    const uint32_t forms[][3] = {{1, 1, 4}, {1, 3, 4}, {1, 4, 3}, {1, 4, 8}, {1, 4, 0}, {0, 4, 4}};  // present, type, length
    for (const auto& f : forms) {
        int32_t number = 0;
        EXPECT_FALSE(AcceptStoredData(RowOf("Bass"), f[0] == 1, f[1], Bytes("200\0\0\0\0"), f[2], &number)) << "present " << f[0] << ", type " << f[1] << ", length " << f[2];
    }
    char text[5];
    for (const char* stored : {"7\0" "99", "05\0\0", "1234"}) {  // a time field shows its stored text, not re-printed
        StoredText(Bytes(stored), 4, text);
        EXPECT_EQ(std::string(text), std::string(stored).substr(0, 4));
    }
}
