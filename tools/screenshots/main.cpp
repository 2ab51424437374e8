// sombrel-screenshots: puts Sombrel.exe, started fresh, into each state the
// manual pictures and asks the harness (scripts/screenshots) to photograph
// the display: the window with its frame, and a message box it shows.
//
//   usage: sombrel-screenshots SOMBREL.EXE REQUESTS EQ-SETTING
//
// Each picture is one "screenshot" request in REQUESTS holding the screen
// area and the picture's name. EQ-SETTING is the example equaliser setting
// (31 band slider values, comma-separated) that the manual also plots.
#include <windows.h>
#include <cstdio>
#include <cstdlib>
#include <string>

#include "tests/program/driver.h"
#include "tests/program/window_ids.h"

namespace {
Program P = {};

// The screen area of the window and of any box it shows, as "WxH+X+Y".
std::string Area() {
    RECT area = OuterRect(P.Window);
    for (const Box& box : OpenBoxes(P)) {
        const RECT r = OuterRect(box.Window);
        UnionRect(&area, &area, &r);
    }
    char text[64];
    std::snprintf(text, sizeof(text), "%ldx%ld+%ld+%ld", area.right - area.left, area.bottom - area.top,
                  area.left, area.top);
    return text;
}

bool Shoot(const char* name) {
    Settle(P);
    Sleep(700);  // the repaints the last action asked for reach the screen
    const bool taken = AskHarness("screenshot", Area() + " " + name);
    if (!taken) std::fprintf(stderr, "sombrel-screenshots: no picture \"%s\"\n", name);
    return taken;
}

void Type(int32_t id, const char* text) {
    DWORD_PTR result = 0;
    SendMessageTimeoutA(Control(P, id), WM_SETTEXT, 0, reinterpret_cast<LPARAM>(text), SMTO_NORMAL, 5000,
                        &result);
}

// Moves equaliser band k as dragging its thumb to `value` does.
void SetBand(int32_t k, int32_t value) {
    DWORD_PTR result = 0;
    SendMessageTimeoutA(P.Window, WM_VSCROLL, MAKEWPARAM(SB_THUMBPOSITION, value),
                        reinterpret_cast<LPARAM>(Slider(P, FirstBandId + k)), SMTO_NORMAL, 5000, &result);
}

// Clicks into an edit field, which takes the keyboard focus (and with it any
// focus rectangle that the last button clicked still shows).
void ClickInto(int32_t id) {
    DWORD_PTR result = 0;
    for (UINT message : {WM_LBUTTONDOWN, WM_LBUTTONUP})
        SendMessageTimeoutA(Control(P, id), message, message == WM_LBUTTONDOWN ? MK_LBUTTON : 0,
                            MAKELPARAM(20, 10), SMTO_NORMAL, 5000, &result);
}

// Moves a box over the middle of the window, where Windows puts it (Wine
// centres it on the screen instead).
void CentreOnWindow(HWND box) {
    const RECT w = OuterRect(P.Window), b = OuterRect(box);
    SetWindowPos(box, nullptr, (w.left + w.right - (b.right - b.left)) / 2,
                 (w.top + w.bottom - (b.bottom - b.top)) / 2, 0, 0, SWP_NOSIZE | SWP_NOZORDER);
}

// The pixel at (x, y) of the client area, as the screen shows it.
uint32_t PixelAt(int32_t x, int32_t y) {
    Picture picture;
    return CaptureClient(P, &picture) ? picture.At(x, y) : 0;
}
}  // namespace

int main(int argc, char** argv) {
    if (argc != 4) {
        std::fprintf(stderr, "usage: sombrel-screenshots SOMBREL.EXE REQUESTS EQ-SETTING\n");
        return 2;
    }
    Config.ProgramPath = WindowsPath(argv[1]);
    Config.Requests = WindowsPath(argv[2]);
    if (!LaunchProgram(&P)) {
        std::fprintf(stderr, "sombrel-screenshots: %s showed no window\n", argv[1]);
        EndProgram(&P);
        return 1;
    }
    bool ok = Shoot("main");

    // Playing, once the meter shows the first block's bars.
    Click(P, PlayId);
    ok = WaitFor([] { return PixelAt(20, 5) != PixelAt(20, 1); }, 10000) && ok;
    ok = Shoot("playing") && ok;
    Click(P, StopId);

    // The equaliser panel with the example setting, set from the top band
    // down so the readouts show the 20 Hz band.
    Click(P, EqPanelId);
    Click(P, EqLockId);  // opening the panel locks it: unlock to edit
    int32_t bands[31];
    const char* text = argv[3];
    for (int32_t k = 0; k < 31; ++k) {
        char* end = nullptr;
        bands[k] = static_cast<int32_t>(std::strtol(text, &end, 10));
        text = *end == ',' ? end + 1 : end;
    }
    for (int32_t k = 30; k >= 0; --k) SetBand(k, bands[k]);
    ok = Shoot("equaliser") && ok;
    Click(P, EqCloseId);

    // The timers: stop at 7:30 AM with the alarm, fading in over 10
    // minutes and out over the last 15.
    Click(P, StopTimeId);
    Type(HourId, "7");
    Type(MinuteId, "30");
    Click(P, AmId);
    Click(P, AlarmId);
    Click(P, FadeInId);
    Type(FadeInFieldId, "10");
    Click(P, FadeOutId);
    Type(FadeOutFieldId, "15");
    ClickInto(FadeOutFieldId);
    ok = Shoot("timers") && ok;

    // An hour out of range: the box, and the hour field red behind it.
    Type(HourId, "13");
    ClickAsync(P, PlayId);
    Box box;
    if (WaitForBox(P, &box)) {
        CentreOnWindow(box.Window);
        const RECT field = ClientRectOf(P, Control(P, HourId));
        RedrawWindow(Control(P, HourId), nullptr, nullptr, RDW_INVALIDATE | RDW_ERASE | RDW_FRAME);
        ok = WaitFor([&] { return PixelAt(field.right - 4, (field.top + field.bottom) / 2) == Rgb(255, 0, 0); },
                     5000) && ok;
        ok = Shoot("field-error") && ok;
        CloseBox(box);
    } else {
        ok = false;
    }
    if (CloseProgram(&P) < 0) EndProgram(&P);
    return ok ? 0 : 1;
}
