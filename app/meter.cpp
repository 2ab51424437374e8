#include "app/meter.h"
#include "app/globals.h"
#include "engine/platform.h"
#include "engine/vector_ops.h"

namespace {
// The float nearest 1/28000, slightly below it: with the 660-pixel area a
// peak of exactly 28000 ends one pixel short of the area's last column.
constexpr float MeterScale = 3.5714285e-5f;
}  // namespace

void CreateMeterBrushes(MeterRecord* meter) {
    meter->UpperNormal = CreateSolidBrush(RGB(0, 0, 200));
    meter->LowerNormal = CreateSolidBrush(RGB(0, 0, 200));
    meter->UpperOverload = CreateSolidBrush(RGB(200, 0, 0));
    meter->LowerOverload = CreateSolidBrush(RGB(200, 0, 0));
}

void SetMeterRectangles(MeterRecord* meter) {
    RECT& up = meter->UpperArea;
    up.left = 15;
    up.top = 2;
    up.right = 675;
    up.bottom = 10;
    RECT& low = meter->LowerArea;
    low.left = up.left;
    low.top = up.bottom + up.top;
    low.right = up.right;
    low.bottom = low.top - up.top + up.bottom;
    meter->Frame.left = up.left - 1;
    meter->Frame.top = up.top - 1;
    meter->Frame.right = up.right + 1;
    meter->Frame.bottom = low.bottom + 1;
}

int32_t MeterBarRight(const RECT* area, int32_t width, int32_t peak) {
    const double edge = static_cast<double>(width) * peak * static_cast<double>(MeterScale) +
                        area->left - 1.0;
    int32_t right = static_cast<int32_t>(edge);
    if (right < area->left + 1) right = area->left + 1;
    if (right > area->right - 1) right = area->right - 1;
    return right;
}

// The block processor's report, once per block: each channel's largest
// magnitude before clipping, so a peak may exceed 32000. The meter shows
// only blocks that are queued: a block during which the stop time stopped
// the stream is never played, and while the alarm chime follows it the
// paint would keep its bars on screen to the chime's end.
void UpdatePeaks(const float* right, const float* left) {
    if (IsPlaying != 1) return;
    MeterState.PeakRight = PeakMagnitude(right, BlockFrames);
    MeterState.PeakLeft = PeakMagnitude(left, BlockFrames);
    InvalidateRect(MainWindow, &MeterState.Frame, TRUE);
}

namespace {
// One bar inside its area, one pixel in from its edges, as long as the peak
// says: blue up to the overload level, red above it.
void PaintBar(HDC dc, const RECT& area, int32_t width, int32_t peak, HBRUSH normal, HBRUSH overload,
              RECT* bar) {
    bar->left = area.left + 1;
    bar->top = area.top + 1;
    bar->bottom = area.bottom - 1;
    bar->right = MeterBarRight(&area, width, peak);
    FillRect(dc, bar, peak > MeterOverload ? overload : normal);
}
}  // namespace

void PaintMeter(HWND window, MeterRecord* meter) {
    meter->PaintDc = BeginPaint(window, &meter->Paint);
    // Any repaint while nothing plays (covering, uncovering) shows empty bars.
    if (IsPlaying == 0 && IsChiming == 0) {
        meter->PeakLeft = 0;
        meter->PeakRight = 0;
    }
    // Both bars scale by the upper area's width (the lower one's is the same).
    const int32_t width = meter->UpperArea.right - meter->UpperArea.left;
    PaintBar(meter->PaintDc, meter->UpperArea, width, meter->PeakRight, meter->UpperNormal,
             meter->UpperOverload, &meter->UpperBar);
    PaintBar(meter->PaintDc, meter->LowerArea, width, meter->PeakLeft, meter->LowerNormal,
             meter->LowerOverload, &meter->LowerBar);

    EndPaint(window, &meter->Paint);
}

void EmptyMeter(HWND window, MeterRecord* meter) {
    meter->PeakLeft = 0;
    meter->PeakRight = 0;
    InvalidateRect(window, &meter->Frame, TRUE);
}
