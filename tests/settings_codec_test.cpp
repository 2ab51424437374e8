// The stored form of the settings: the 4-byte decimal text of each number,
// the table of 109 values and what a load accepts from a damaged key.
#include <gtest/gtest.h>

#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <string>

#include "tests/expected_stored_names.h"
#include "app/control_settings.h"
#include "settings/value_codec.h"

namespace {

uint32_t AsDword(const uint8_t d[4]) {
    return static_cast<uint32_t>(d[0]) | (static_cast<uint32_t>(d[1]) << 8) |
           (static_cast<uint32_t>(d[2]) << 16) | (static_cast<uint32_t>(d[3]) << 24);
}

std::string Hex(const uint8_t d[4]) {
    char text[16];
    std::snprintf(text, sizeof(text), "%02x %02x %02x %02x", d[0], d[1], d[2], d[3]);
    return text;
}

// Row index of a value name, or -1.
int32_t RowOf(const char* name) {
    for (int32_t i = 0; i < StoredValueCount; ++i)
        if (std::strcmp(StoredValueAt(i).Name, name) == 0) return i;
    return -1;
}

// A well-formed stored datum for `text` (at most four characters).
struct Datum {
    uint8_t Bytes[4];
};
Datum TextDatum(const char* text) {
    Datum d = {{0, 0, 0, 0}};
    for (size_t i = 0; i < 4 && text[i] != 0; ++i) d.Bytes[i] = static_cast<uint8_t>(text[i]);
    return d;
}

}  // namespace

TEST(StoredNumber, IsTheStartOfTheDecimalText) {
    struct Case {
        int32_t Number;
        uint8_t Bytes[4];
        size_t Significant;  // bytes up to and including the NUL, or 4
    };
    const Case cases[] = {{128, {0x31, 0x32, 0x38, 0x00}, 4},
                          {15, {0x31, 0x35, 0x00, 0x00}, 3},
                          {0, {0x30, 0x00, 0x00, 0x00}, 2},
                          {1000, {0x31, 0x30, 0x30, 0x30}, 4},
                          {12345, {0x31, 0x32, 0x33, 0x34}, 4},
                          {-5, {0x2d, 0x35, 0x00, 0x00}, 3},
                          {-1000, {0x2d, 0x31, 0x30, 0x30}, 4}};
    for (const Case& c : cases) {
        uint8_t data[4] = {0xAA, 0xAA, 0xAA, 0xAA};
        EncodeStoredNumber(c.Number, data);
        EXPECT_EQ(0, std::memcmp(data, c.Bytes, c.Significant))
            << "EncodeStoredNumber(" << c.Number << ") gave " << Hex(data) << ", expected "
            << Hex(c.Bytes) << " in its first " << c.Significant << " bytes";
    }
    uint8_t data[4];
    EncodeStoredNumber(128, data);
    EXPECT_EQ(0x00383231u, AsDword(data)) << "EncodeStoredNumber(128) read as a DWORD";
}

TEST(StoredNumber, EveryValueInTheControlsRangesRoundTrips) {
    for (int32_t n = -99; n <= 999; ++n) {
        uint8_t data[4];
        EncodeStoredNumber(n, data);
        int32_t back = -12345;
        ASSERT_TRUE(DecodeStoredNumber(data, 4, &back)) << "DecodeStoredNumber(" << Hex(data) << ") failed";
        ASSERT_EQ(n, back) << "DecodeStoredNumber(EncodeStoredNumber(" << n << "))";
    }
    uint8_t data[4];
    EncodeStoredNumber(4321, data);
    int32_t back = 0;
    ASSERT_TRUE(DecodeStoredNumber(data, 4, &back));
    EXPECT_EQ(4321, back) << "a four-character text is stored without its NUL and still reads back";
}

TEST(StoredNumber, ReadsLikeAtoiWithinFourBytes) {
    struct Case {
        const char* Bytes;  // four bytes, given as a 4-character literal
        uint32_t Length;
        bool Readable;
        int32_t Number;
    };
    const Case cases[] = {{"12x\0", 4, true, 12},   {"7\0\x35\x35", 4, true, 7},  // bytes after the NUL ignored
                          {" 42\0", 4, true, 42},   {"+9\0\0", 4, true, 9},
                          {"-13\0", 4, true, -13},  {"12345", 4, true, 1234},
                          {"abc\0", 4, false, 0},   {"-\0\0\0", 4, false, 0},
                          {"\0\0\0\0", 4, false, 0}, {"12\0\0", 1, true, 1},
                          {"12\0\0", 0, false, 0}};
    for (const Case& c : cases) {
        int32_t number = -777;
        const bool readable =
            DecodeStoredNumber(reinterpret_cast<const uint8_t*>(c.Bytes), c.Length, &number);
        EXPECT_EQ(c.Readable, readable) << "DecodeStoredNumber(\"" << c.Bytes << "\", " << c.Length << ")";
        EXPECT_EQ(c.Readable ? c.Number : -777, number)
            << "DecodeStoredNumber(\"" << c.Bytes << "\", " << c.Length << ") number";
    }
}

TEST(StoredText, IsTheBytesUpToTheNulAtMostFour) {
    char text[5];
    StoredText(reinterpret_cast<const uint8_t*>("7\0\x39\x39"), 4, text);
    EXPECT_STREQ("7", text) << "StoredText of 37 00 39 39";
    StoredText(reinterpret_cast<const uint8_t*>("05\0\0"), 4, text);
    EXPECT_STREQ("05", text) << "StoredText keeps the stored characters, not re-printed";
    StoredText(reinterpret_cast<const uint8_t*>("1234"), 4, text);
    EXPECT_STREQ("1234", text) << "StoredText of four characters without a NUL";
}

TEST(StoredValueTable, Has109NamesInWriteOrder) {
    for (int32_t i = 0; i < StoredValueCount; ++i)
        EXPECT_EQ(ExpectedStoredName(i), StoredValueAt(i).Name) << "StoredValueAt(" << i << ").Name";
    EXPECT_LT(StoredValueAt(StoredValueCount).Kind, 0) << "StoredValueAt(109) is no row";
    EXPECT_LT(StoredValueAt(-1).Kind, 0) << "StoredValueAt(-1) is no row";
}

TEST(StoredValueTable, FeedsTheRightFieldsAndMemories) {
    ControlRecord settings;
    SetControlStartValues(&settings);
    int32_t memories[3][31];
    for (auto& m : memories)
        for (int32_t& v : m) v = 128;
    // Give each row a distinct number and look where it lands.
    for (int32_t i = 0; i < StoredValueCount; ++i) ApplyStoredNumber(i, 1000 + i, &settings, memories);
    EXPECT_EQ(1000, settings.Value[Attenuator]) << "row 0 Attenuator";
    EXPECT_EQ(1004, settings.Value[Treble]) << "row 4 Treble";
    for (int32_t k = 0; k < 31; ++k) {
        EXPECT_EQ(1005 + k, memories[0][k]) << "value \"" << k << "\" into M1 band " << k;
        EXPECT_EQ(1005 + k, settings.Value[EqBandFirst + k]) << "value \"" << k << "\" into band level " << k;
        EXPECT_EQ(1036 + k, memories[1][k]) << "value \"" << 100 + k << "\" into M2 band " << k;
        EXPECT_EQ(1067 + k, memories[2][k]) << "value \"" << 1000 + k << "\" into M3 band " << k;
    }
    const struct {
        const char* Name;
        int32_t Field;
    } tail[] = {{"PlayUntilOn", PlayUntilOn}, {"AlarmOn", AlarmOn},     {"Alarm_PM", Alarm_PM},
                {"Alarm_AM", Alarm_AM},       {"Alarm_Hr", Alarm_Hr},   {"Alarm_Min", Alarm_Min},
                {"Profile", Profile},         {"FadeInOn", FadeInOn},   {"FadeOutOn", FadeOutOn},
                {"FadeInTime", FadeInTime},   {"FadeOutTime", FadeOutTime}};
    for (const auto& t : tail)
        EXPECT_EQ(1000 + RowOf(t.Name), settings.Value[t.Field]) << "value \"" << t.Name << "\"";
    // And back: what a save writes is what a load applied.
    for (int32_t i = 0; i < StoredValueCount; ++i)
        EXPECT_EQ(1000 + i, StoredNumberOf(i, &settings, memories)) << "StoredNumberOf(" << i << ")";
}

TEST(StoredValueTable, SaveWritesM1M2M3FromTheMemoriesNotTheBands) {
    ControlRecord settings;
    SetControlStartValues(&settings);
    int32_t memories[3][31] = {};
    for (int32_t k = 0; k < 31; ++k) {
        memories[0][k] = 10 + k;
        memories[1][k] = 50 + k;
        memories[2][k] = 90 + k;
        settings.Value[EqBandFirst + k] = 200;  // e.g. EQ Defeat leaves the bands elsewhere
    }
    EXPECT_EQ(17, StoredNumberOf(RowOf("7"), &settings, memories)) << "value \"7\"";
    EXPECT_EQ(57, StoredNumberOf(RowOf("107"), &settings, memories)) << "value \"107\"";
    EXPECT_EQ(97, StoredNumberOf(RowOf("1007"), &settings, memories)) << "value \"1007\"";
}

TEST(StoredData, ADamagedValueKeepsTheStartValue) {
    const Datum good = TextDatum("200");
    int32_t number = -1;
    const int32_t attenuator = RowOf("Attenuator");
    ASSERT_TRUE(AcceptStoredData(attenuator, true, StoredValueType, good.Bytes, 4, &number));
    EXPECT_EQ(200, number) << "a sound Attenuator of 200";

    struct Case {
        const char* What;
        const char* Name;
        bool Found;
        uint32_t Type;
        const char* Text;
        uint32_t Length;
    };
    const Case damaged[] = {
        {"missing", "Attenuator", false, StoredValueType, "200", 4},
        {"above the slider's range", "Attenuator", true, StoredValueType, "999", 4},
        {"zero", "Hardness", true, StoredValueType, "0", 4},
        {"negative", "Bass", true, StoredValueType, "-5", 4},
        {"non-digits", "Treble", true, StoredValueType, "ab", 4},
        {"REG_SZ", "SubBass", true, 1, "200", 4},
        {"REG_BINARY", "SubBass", true, 3, "200", 4},
        {"3 bytes", "Attenuator", true, StoredValueType, "200", 3},
        {"8 bytes", "Attenuator", true, StoredValueType, "200", 8},
        {"empty", "Attenuator", true, StoredValueType, "", 0},
        {"band out of range", "30", true, StoredValueType, "256", 4},
        {"M2 band out of range", "115", true, StoredValueType, "0", 4},
        {"M3 band negative", "1030", true, StoredValueType, "-1", 4},
        {"Profile 0", "Profile", true, StoredValueType, "0", 4},
        {"Profile 108", "Profile", true, StoredValueType, "108", 4},
        {"Profile 99", "Profile", true, StoredValueType, "99", 4},
        {"switch 2", "AlarmOn", true, StoredValueType, "2", 4},
        {"switch -1", "FadeOutOn", true, StoredValueType, "-1", 4},
        {"time field non-digits", "Alarm_Hr", true, StoredValueType, "x", 4},
        {"time field as REG_SZ", "Alarm_Min", true, 1, "5", 4},
    };
    for (const Case& c : damaged) {
        ASSERT_GE(RowOf(c.Name), 0) << "no value named " << c.Name;
        uint8_t bytes[8] = {};
        std::memcpy(bytes, TextDatum(c.Text).Bytes, 4);
        int32_t got = -777;
        const bool accepted = AcceptStoredData(RowOf(c.Name), c.Found, c.Type, bytes, c.Length, &got);
        EXPECT_FALSE(accepted) << c.What << ": AcceptStoredData(\"" << c.Name << "\", \"" << c.Text
                               << "\") accepted " << got << ", expected the start value to stay";
    }
}

TEST(StoredData, TimeFieldsAreTakenAsStored) {
    // Play checks the time fields and names the bad one, so a load keeps them.
    const struct {
        const char* Name;
        const char* Text;
        int32_t Number;
    } cases[] = {{"Alarm_Hr", "7", 7}, {"Alarm_Hr", "99", 99}, {"Alarm_Min", "-5", -5},
                 {"FadeInTime", "16", 16}, {"FadeOutTime", "0", 0}, {"Alarm_Min", "12x", 12}};
    for (const auto& c : cases) {
        int32_t got = -777;
        EXPECT_TRUE(AcceptStoredData(RowOf(c.Name), true, StoredValueType, TextDatum(c.Text).Bytes, 4, &got))
            << "AcceptStoredData(\"" << c.Name << "\", \"" << c.Text << "\")";
        EXPECT_EQ(c.Number, got) << "AcceptStoredData(\"" << c.Name << "\", \"" << c.Text << "\") number";
    }
}

TEST(StoredData, RangeEdgesAreAccepted) {
    const struct {
        const char* Name;
        const char* Text;
    } edges[] = {{"Attenuator", "1"}, {"Attenuator", "255"}, {"0", "1"},      {"130", "255"},
                 {"1015", "128"},     {"Profile", "100"},    {"Profile", "107"}, {"AlarmOn", "0"},
                 {"Alarm_AM", "1"}};
    for (const auto& e : edges) {
        int32_t got = -777;
        EXPECT_TRUE(AcceptStoredData(RowOf(e.Name), true, StoredValueType, TextDatum(e.Text).Bytes, 4, &got))
            << "AcceptStoredData(\"" << e.Name << "\", \"" << e.Text << "\")";
        EXPECT_EQ(std::atoi(e.Text), got) << e.Name;
    }
}

TEST(StoredData, StartValuesAreTheProgramsStartValues) {
    EXPECT_EQ(128, StartValueOf(RowOf("Attenuator"))) << "Attenuator";
    EXPECT_EQ(128, StartValueOf(RowOf("0"))) << "M1 band 0";
    EXPECT_EQ(128, StartValueOf(RowOf("130"))) << "M2 band 30";
    EXPECT_EQ(128, StartValueOf(RowOf("1000"))) << "M3 band 0";
    EXPECT_EQ(104, StartValueOf(RowOf("Profile"))) << "Profile";
    EXPECT_EQ(1, StartValueOf(RowOf("Alarm_AM"))) << "Alarm_AM";
    EXPECT_EQ(0, StartValueOf(RowOf("Alarm_PM"))) << "Alarm_PM";
    EXPECT_EQ(0, StartValueOf(RowOf("FadeOutTime"))) << "FadeOutTime";
}
