// What Play makes of the text in a time field.
#include <gtest/gtest.h>

#include "timers/time_text.h"

TEST(TimeText, OnlyTheFirstTwoCharactersAreChecked) {
    struct Case {
        const char* Text;
        bool Accepted;
    };
    const Case cases[] = {{"7", true},   {"7x", false}, {"77x", true}, {"-5", false}, {".", true},
                          {"12x", true}, {"123", true}, {"1.5", true}, {"", false},   {" 5", false},
                          {"x", false},  {"0", true},   {"5-", false}, {"..", true}};
    for (const Case& c : cases)
        EXPECT_EQ(CheckTimeText(c.Text), c.Accepted) << "CheckTimeText(\"" << c.Text << "\")";
}

TEST(TimeText, FourCharactersAreConvertedAndTruncated) {
    struct Case {
        const char* Text;
        int32_t Value;
    };
    const Case cases[] = {{"77x", 77}, {".", 0},     {"12x", 12},  {"123", 123}, {"1.5", 1},  {"0", 0},
                          {"16", 16},  {"15", 15},   {"12345", 1234}, {"9.99", 9}, {"59", 59},
                          {"12e1", 12}, {"55e9", 55}, {".5e1", 0}, {"9999", 9999}};
    for (const Case& c : cases)
        EXPECT_EQ(TimeTextValue(c.Text), c.Value) << "TimeTextValue(\"" << c.Text << "\")";
}
