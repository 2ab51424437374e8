#include "timers/time_text.h"

bool CheckTimeText(const char* text) {
    if (text[0] == '\0') return false;
    for (int32_t i = 0; i < 2 && text[i] != '\0'; ++i) {
        const char c = text[i];
        if (!((c >= '0' && c <= '9') || c == '.')) return false;
    }
    return true;
}

int32_t TimeTextValue(const char* text) {
    // Leading digits, then an optional full stop and fraction: the fraction
    // is cut off by the truncation, so only the digits before the first other
    // character count. An exponent is not part of the number: "12e1" is 12.
    // At most four digits are read, so the value stays within 0..9999.
    int32_t value = 0;
    for (int32_t i = 0; i < 4 && text[i] >= '0' && text[i] <= '9'; ++i)
        value = value * 10 + (text[i] - '0');
    return value;
}
