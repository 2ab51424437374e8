// shaping/eq_steps.h: the equaliser panel's arithmetic, free of any Windows
// header: how a band slider's scroll request moves its level and what the
// two readouts show.
#pragma once
#include <cstdint>

// Scroll requests as a vertical scroll bar sends them (SB_LINEUP .. SB_THUMBTRACK).
enum BandRequest : int32_t {
    BandLineUp = 0,         // level - 5, not below 1
    BandLineDown = 1,       // level + 5, not above 255
    BandPageUp = 2,         // level - 25, not below 1
    BandPageDown = 3,       // level + 25, not above 255
    BandThumbPosition = 4,  // the thumb's position
    BandThumbTrack = 5      // the thumb's position while dragging
};

// True for the control ids of the 31 band sliders, 5..35.
bool IsEqBandId(int32_t id);

// The band level after one scroll request; any other request (top, bottom,
// end of scrolling) leaves it unchanged. A thumb position is kept within
// 1..255, the range of the slider that sends it.
int32_t SteppedBandLevel(int32_t level, int32_t request, int32_t thumb);

// What a readout shows of a level in dB or a centre in Hz: the number
// truncated toward zero (+19.84 dB shows 19, -0.157 dB shows 0).
int32_t ReadoutNumber(float value);
