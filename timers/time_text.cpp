#include "timers/time_text.h"

#include <cstdlib>

bool CheckTimeText(const char* text) {
    if (text[0] == '\0') return false;
    for (int32_t i = 0; i < 2 && text[i] != '\0'; ++i) {
        const char c = text[i];
        if (!((c >= '0' && c <= '9') || c == '.')) return false;
    }
    return true;
}

int32_t TimeTextValue(const char* text) {
    char head[5] = {0, 0, 0, 0, 0};
    for (int32_t i = 0; i < 4 && text[i] != '\0'; ++i) head[i] = text[i];
    return static_cast<int32_t>(std::atof(head));
}
