// app/meter.h: the two-bar stereo peak meter painted in the top strip of the
// main window (upper bar = right channel, lower bar = left channel).
//
// Bars are blue up to a peak of 28000 and red above it; a peak of 28000
// reaches x 673, anything larger fills to 674. No frame, no scale, no peak
// hold: each block's bars replace the last. UpdatePeaks (engine/platform.h)
// is the block processor's entry; the rest is called by the window.
#pragma once
#include <cstdint>
#include <windows.h>

constexpr int32_t MeterOverload = 28000;   // largest peak still drawn blue

struct MeterRecord {
    RECT UpperArea;          // 15, 2, 675, 10: the right channel's bar area
    RECT LowerArea;          // 15, 12, 675, 20: the left channel's bar area
    RECT Frame;              // 14, 1, 676, 21: what a new block invalidates
    RECT LowerBar;           // computed at each paint
    RECT UpperBar;           // computed at each paint
    HBRUSH UpperNormal;      // blue, RGB 0, 0, 200
    HBRUSH LowerNormal;      // blue
    HBRUSH UpperOverload;    // red, RGB 200, 0, 0
    HBRUSH LowerOverload;    // red
    int32_t PeakLeft;        // largest absolute left sample of the last block
    int32_t PeakRight;       // largest absolute right sample of the last block
    HDC PaintDc;             // valid between BeginPaint and EndPaint
    PAINTSTRUCT Paint;       // the paint step's BeginPaint record
};

// Creates the four brushes; once, by the application initialiser.
void CreateMeterBrushes(MeterRecord* meter);

// Sets the three fixed rectangles; by the layout on every WM_SIZE.
void SetMeterRectangles(MeterRecord* meter);

// Right edge of a bar for a peak: trunc(width * peak * k + left - 1) with k
// the float nearest 1/28000, clamped to left + 1 .. right - 1 of the area.
int32_t MeterBarRight(const RECT* area, int32_t width, int32_t peak);

// WM_PAINT: draws both bars; empty ones while neither sound plays.
void PaintMeter(HWND window, MeterRecord* meter);

// Stop: both peaks 0 and the frame invalidated with erasing.
void EmptyMeter(HWND window, MeterRecord* meter);
