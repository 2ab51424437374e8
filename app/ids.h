// app/ids.h: control ids and resource numbers of the main window.
//
// Ids 0..35 are the sliders (ControlField indices, app/control_settings.h).
// Command ids are what WM_COMMAND carries in the low word of wParam.
#pragma once
#include <cstdint>

// Commands: buttons, check boxes, radio buttons and edit fields.
constexpr int32_t ChimeTestId = 1029;     // chime test icon button
constexpr int32_t PlayId = 1030;          // Play icon button
constexpr int32_t StopId = 1031;          // Stop icon button
constexpr int32_t AlarmId = 1032;         // "Alarm" check box
constexpr int32_t HourFieldId = 1033;     // hour edit field
constexpr int32_t MinuteFieldId = 1034;   // minute edit field
constexpr int32_t AmId = 1035;            // "AM" radio button
constexpr int32_t PmId = 1036;            // "PM" radio button
constexpr int32_t StopTimeId = 1038;      // "Stop Time" check box
constexpr int32_t FadeInId = 1039;        // "Fade In" check box
constexpr int32_t FadeOutId = 1040;       // "Fade Out" check box
constexpr int32_t FadeInFieldId = 1041;   // fade-in minutes field
constexpr int32_t FadeOutFieldId = 1042;  // fade-out minutes field
constexpr int32_t ProfileFirstId = 1043;  // " White " .. " Traffic": 1043..1050
constexpr int32_t ProfileLastId = 1050;
constexpr int32_t HelpId = 1051;          // Help icon button
constexpr int32_t EqPanelId = 1055;       // equaliser panel open/close icon button
constexpr int32_t EqLockId = 1057;        // "EQ Lock" check box
constexpr int32_t EqFrequencyId = 1058;   // frequency readout
constexpr int32_t EqLevelId = 1059;       // level readout
constexpr int32_t EqMemory1Id = 1065;     // " M1"; " M2" 1066, " M3" 1067
constexpr int32_t EqDefeatId = 1068;      // " EQ Defeat"
constexpr int32_t EqCloseId = 1069;       // close the equaliser panel (icon button)

constexpr int32_t ProfileButtonCount = 8;

// Icon resources.
constexpr int32_t AppIconId = 101;        // noise square: class icon, large and small
constexpr int32_t PlayIconId = 102;       // red triangle
constexpr int32_t StopIconId = 103;       // red square
constexpr int32_t HelpIconId = 104;       // red question mark
constexpr int32_t ChimeIconId = 105;      // loudspeaker
constexpr int32_t EqPanelIconId = 107;    // slider bank framed in red
constexpr int32_t EqCloseIconId = 108;    // red arrow up

// Window geometry: the outer size is imposed on every WM_SIZE.
constexpr int32_t WindowWidth = 750;
constexpr int32_t PanelClosedHeight = 270;
constexpr int32_t PanelOpenHeight = 580;
