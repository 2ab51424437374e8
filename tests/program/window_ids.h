// tests/program/window_ids.h: the window's controls as the tests name them.
// Kept apart from the program's own id header on purpose: a wrong id there
// must make the tests fail, not follow it.
#pragma once
#include <cstdint>

constexpr int32_t PlayId = 1030, StopId = 1031, ChimeTestId = 1029, AlarmId = 1032;
constexpr int32_t HourId = 1033, MinuteId = 1034, AmId = 1035, PmId = 1036;
constexpr int32_t StopTimeId = 1038, FadeInId = 1039, FadeOutId = 1040;
constexpr int32_t FadeInFieldId = 1041, FadeOutFieldId = 1042, HelpId = 1051;
constexpr int32_t EqPanelId = 1055, EqLockId = 1057, M1Id = 1065, EqCloseId = 1069;
constexpr int32_t WhiteId = 1043, TalkingId = 1047, DogsId = 1049, TrafficId = 1050;
constexpr int32_t VolumeId = 0, FirstBandId = 5;

// What Play disables, in its order; Stop enables them again, the Fade Out
// pair only while Stop Time or Alarm is on.
constexpr int32_t DisabledWhilePlaying[] = {StopTimeId, HourId,        MinuteId,  AmId,
                                            PmId,       AlarmId,       FadeInFieldId, FadeInId,
                                            FadeOutFieldId, FadeOutId, ChimeTestId};
