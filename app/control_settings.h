// app/control_settings.h: the control record, the one channel from the user
// interface to the sound engine and the timers.
//
// 47 signed 32-bit fields, indexed by ControlField. Fields 0..35 are also the
// control ids of the 36 sliders (5 main sliders, 31 equaliser bands), so a
// slider handler goes from its scroll bar's id straight to its field.
// Writing a field is the whole announcement of a change: the engine compares
// with its cached copy at its next block.
#pragma once
#include <cstdint>

enum ControlField : int32_t {
    Attenuator = 0,     // " Volume" slider, 1..255
    Hardness = 1,       // " Hardness" slider, 1..255
    Bass = 2,           // " Bass" slider, 1..255
    SubBass = 3,        // " Sub Bass" slider, 1..255
    Treble = 4,         // " Treble" slider, 1..255
    EqBandFirst = 5,    // band k lives in field 5 + k, k = 0..30, 1..255 (1 is +20 dB)
    EqBandLast = 35,
    PlayUntilOn = 36,   // "Stop Time" check box, 0 or 1
    AlarmOn = 37,       // "Alarm" check box, 0 or 1
    Alarm_PM = 38,      // "PM" radio button, 0 or 1
    Alarm_AM = 39,      // "AM" radio button, 0 or 1
    FadeInOn = 40,      // "Fade In" check box, 0 or 1
    FadeOutOn = 41,     // "Fade Out" check box, 0 or 1
    Profile = 42,       // noise colour or masking profile, 100..107
    Alarm_Hr = 43,      // hour field as last validated, 1..12
    Alarm_Min = 44,     // minute field as last validated, 0..59
    FadeInTime = 45,    // fade-in minutes as last validated, 1..15
    FadeOutTime = 46,   // fade-out minutes as last validated, 1..15
    ControlFieldCount = 47
};

constexpr int32_t EqBandCount = 31;
constexpr int32_t SliderCount = 36;     // fields and control ids 0..35
constexpr int32_t SliderMin = 1;
constexpr int32_t SliderMax = 255;
constexpr int32_t SliderNeutral = 128;

// Profile values. Traffic is 106 and Dogs 107, although the Dogs button comes
// first on screen; stored settings rely on these numbers.
enum ProfileValue : int32_t {
    ProfileWhite = 100,
    ProfilePink = 101,
    ProfileRed = 102,
    ProfileBrown = 103,
    ProfileTalking = 104,
    ProfileMusic = 105,
    ProfileTraffic = 106,
    ProfileDogs = 107
};

struct ControlRecord {
    int32_t Value[ControlFieldCount];
};

// Start values: sliders and bands 128, Alarm_AM 1, Profile 104, the rest 0.
void SetControlStartValues(ControlRecord* settings);
