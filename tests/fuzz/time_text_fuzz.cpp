// Any text a time field can hold, cut as Play reads it (two characters for
// the check, four for the value). The value always lies in 0..9999, and for
// a text of digits and full stops it is what the C library's conversion,
// truncated, gives.
#include <cstdlib>
#include <string>
#include "timers/time_text.h"

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* input, size_t size) {
    const std::string field = std::string(reinterpret_cast<const char*>(input), size).c_str();  // up to a NUL
    const std::string checked = field.substr(0, 2), read = field.substr(0, 4);
    CheckTimeText(checked.c_str());
    const int32_t value = TimeTextValue(read.c_str());
    if (value < 0 || value > 9999) std::abort();
    if (read.find_first_not_of("0123456789.") == std::string::npos &&
        value != static_cast<int32_t>(std::atof(read.c_str())))
        std::abort();
    return 0;
}
