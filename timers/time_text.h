// timers/time_text.h: the rules for the text of the four time fields, apart
// from the controls that hold it.
#pragma once
#include <cstdint>

// Play's first check of a field's text: true when it is not empty and its
// first two characters (all it has, if fewer) are digits or full stops.
bool CheckTimeText(const char* text);

// The value Play stores for a field's text: its first four characters read
// as a decimal number (digits, an optional full stop and fraction, stopping
// at the first other character, an exponent's "e" included), truncated
// toward zero. Always 0..9999.
int32_t TimeTextValue(const char* text);
