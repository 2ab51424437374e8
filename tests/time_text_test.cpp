// What Play makes of a time field's text: its first two characters must be
// digits or full stops, and its first four are read as a number, truncated.
#include <gtest/gtest.h>
#include "timers/time_text.h"

TEST(TimeText, TheFirstTwoCharactersAreCheckedAndFourRead) {
    const struct { const char* Text; bool Accepted; int32_t Value; } cases[] = {
        {"7", true, 7},      {"7x", false, 7},    {"77x", true, 77},  {"-5", false, 0},   {".", true, 0},
        {"..", true, 0},     {"12x", true, 12},   {"123", true, 123}, {"1.5", true, 1},   {"", false, 0},
        {" 5", false, 0},    {"x", false, 0},     {"0", true, 0},     {"5-", false, 5},   {"/", false, 0},
        {":", false, 0},     {"9.99", true, 9},   {"12345", true, 1234}, {"9999", true, 9999}, {"12e1", true, 12},
        {"55e9", true, 55},  {".5e1", true, 0},   {"1e3", false, 1}};
    for (const auto& c : cases) {
        EXPECT_EQ(CheckTimeText(c.Text), c.Accepted) << "CheckTimeText(\"" << c.Text << "\")";
        EXPECT_EQ(TimeTextValue(c.Text), c.Value) << "TimeTextValue(\"" << c.Text << "\")";
    }
}
