// tests/expected_stored_names.h: the 109 registry value names in the order
// the program writes them, spelled out apart from the program's own table so
// that a wrong name there fails the tests. Shared by the native codec tests
// and the program's registry tests under Wine.
#pragma once
#include <cstdint>
#include <string>

inline std::string ExpectedStoredName(int32_t index) {
    static const char* const head[5] = {"Attenuator", "Hardness", "Bass", "SubBass", "Treble"};
    static const char* const tail[11] = {"PlayUntilOn", "AlarmOn", "Alarm_PM", "Alarm_AM", "Alarm_Hr", "Alarm_Min",
                                         "Profile", "FadeInOn", "FadeOutOn", "FadeInTime", "FadeOutTime"};
    if (index < 5) return head[index];
    if (index < 36) return std::to_string(index - 5);          // M1 bands: "0".."30"
    if (index < 67) return std::to_string(100 + index - 36);   // M2 bands: "100".."130"
    if (index < 98) return std::to_string(1000 + index - 67);  // M3 bands: "1000".."1030"
    return tail[index - 98];
}
