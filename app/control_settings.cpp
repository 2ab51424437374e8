#include "app/control_settings.h"

void SetControlStartValues(ControlRecord* settings) {
    for (int32_t i = 0; i < ControlFieldCount; ++i) settings->Value[i] = 0;
    for (int32_t i = 0; i < SliderCount; ++i) settings->Value[i] = SliderNeutral;
    settings->Value[Alarm_AM] = 1;
    settings->Value[Profile] = ProfileTalking;
}
