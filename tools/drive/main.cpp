// sombrel-drive: works Sombrel.exe, started fresh, as a user does, with the
// program tests' harness.
//
//   sombrel-drive screenshots SOMBREL.EXE EQ-SETTING
//     puts the program into each state the manual pictures and asks the
//     harness (scripts/screenshots) to photograph the display: the window
//     with its frame, and a message box it shows. Each picture is one
//     "screenshot" request (in SOMBREL_WORK's requests) holding the screen
//     area and the picture's name. EQ-SETTING is the example equaliser
//     setting (31 band slider values, comma-separated) the manual plots.
//   sombrel-drive figures SOMBREL.EXE SECONDS
//     for scripts/measure-program: prints "time-to-window-ms N" once the
//     window shows, presses Play, prints "playing-pid N", plays SECONDS,
//     then stops and closes the program.
#include <windows.h>
#include <cstdio>
#include <cstdlib>
#include <string>
#include "app/control_settings.h"
#include "app/ids.h"
#include "tests/program/harness.h"

namespace {
Program P = {};

// The screen area of the window and of any box it shows, as "WxH+X+Y".
std::string Area() {
    RECT area;
    GetWindowRect(P.Window, &area);
    for (HWND box : OpenBoxes(P)) {
        RECT r;
        GetWindowRect(box, &r);
        UnionRect(&area, &area, &r);
    }
    char text[64];
    std::snprintf(text, sizeof(text), "%ldx%ld+%ld+%ld", area.right - area.left, area.bottom - area.top, area.left, area.top);
    return text;
}

bool Shoot(const char* name) {
    PumpUntil([] { return false; }, 700);  // the repaints the last action asked for reach the screen
    const bool taken = AskHarness("screenshot", Area() + " " + name);
    if (!taken) std::fprintf(stderr, "sombrel-drive: no picture \"%s\"\n", name);
    return taken;
}

void Send(HWND to, UINT message, WPARAM wParam, LPARAM lParam) {
    DWORD_PTR result = 0;
    SendMessageTimeoutA(to, message, wParam, lParam, SMTO_NORMAL, 5000, &result);
}
void Type(int32_t id, const char* text) { Send(GetDlgItem(P.Window, id), WM_SETTEXT, 0, reinterpret_cast<LPARAM>(text)); }

// The pixel at (x, y) of the client area, as the screen shows it.
COLORREF PixelAt(int32_t x, int32_t y) {
    POINT at = {x, y};
    ClientToScreen(P.Window, &at);
    HDC screen = GetDC(nullptr);
    const COLORREF pixel = GetPixel(screen, at.x, at.y);
    ReleaseDC(nullptr, screen);
    return pixel;
}

// Starts the program, plays it for `seconds` and closes it.
int Figures(const char* exe, double seconds) {
    const ULONGLONG start = GetTickCount64();
    if (!Launch(&P, WindowsPath(exe))) return 1;
    std::printf("time-to-window-ms %llu\n", GetTickCount64() - start);
    if (!Click(P, PlayId)) return 1;
    std::printf("playing-pid %lu\n", P.Process.dwProcessId);
    std::fflush(stdout);
    Sleep(static_cast<DWORD>(seconds * 1000));
    return Click(P, StopId) && Close(&P) == 0 ? 0 : 1;
}
}  // namespace

int main(int argc, char** argv) {
    const std::string mode = argc == 4 ? argv[1] : "";
    if (mode == "figures") return Figures(argv[2], std::atof(argv[3]));
    if (mode != "screenshots") {
        std::fprintf(stderr, "usage: sombrel-drive screenshots SOMBREL.EXE EQ-SETTING\n       sombrel-drive figures SOMBREL.EXE SECONDS\n");
        return 2;
    }
    if (!Launch(&P, WindowsPath(argv[2]))) {
        std::fprintf(stderr, "sombrel-drive: %s showed no window\n", argv[2]);
        return 1;
    }
    bool ok = Shoot("main");

    // Playing, once the meter shows the first block's bars.
    Click(P, PlayId);
    ok = PumpUntil([] { return PixelAt(20, 5) != PixelAt(20, 1); }, 10000) && ok;
    ok = Shoot("playing") && ok;
    Click(P, StopId);

    // The equaliser panel with the example setting, set from the top band
    // down so the readouts show the 20 Hz band. Opening it locks it.
    Click(P, EqPanelId);
    Click(P, EqLockId);
    const char* text = argv[3];
    int32_t bands[31];
    for (int32_t k = 0; k < 31; ++k) {
        char* end = nullptr;
        bands[k] = static_cast<int32_t>(std::strtol(text, &end, 10));
        text = *end == ',' ? end + 1 : end;
    }
    for (int32_t k = 30; k >= 0; --k)
        Send(P.Window, WM_VSCROLL, MAKEWPARAM(SB_THUMBPOSITION, bands[k]), reinterpret_cast<LPARAM>(GetDlgItem(P.Window, EqBandFirst + k)));
    ok = Shoot("equaliser") && ok;
    Click(P, EqCloseId);

    // The timers: stop at 7:30 AM with the alarm, fading in over 10 minutes
    // and out over the last 15; a click into the fade-out field takes the
    // focus rectangle away from the last button clicked.
    for (int32_t id : {StopTimeId, AmId, AlarmId, FadeInId, FadeOutId}) Click(P, id);
    for (const auto& field : {std::make_pair(HourFieldId, "7"), std::make_pair(MinuteFieldId, "30"), std::make_pair(FadeInFieldId, "10"), std::make_pair(FadeOutFieldId, "15")})
        Type(field.first, field.second);
    for (UINT message : {WM_LBUTTONDOWN, WM_LBUTTONUP}) Send(GetDlgItem(P.Window, FadeOutFieldId), message, message == WM_LBUTTONDOWN, MAKELPARAM(20, 10));
    ok = Shoot("timers") && ok;

    // An hour out of range: the box over the middle of the window, where
    // Windows puts it (Wine centres it on the screen), and the hour field
    // red behind it.
    Type(HourFieldId, "13");
    PostMessageA(GetDlgItem(P.Window, PlayId), BM_CLICK, 0, 0);
    if (PumpUntil([] { return !OpenBoxes(P).empty() && ReadBox(OpenBoxes(P)[0]).Buttons > 0; }, 20000)) {
        HWND box = OpenBoxes(P)[0];
        RECT w, b, field;
        GetWindowRect(P.Window, &w);
        GetWindowRect(box, &b);
        SetWindowPos(box, nullptr, (w.left + w.right - (b.right - b.left)) / 2, (w.top + w.bottom - (b.bottom - b.top)) / 2, 0, 0,
                     SWP_NOSIZE | SWP_NOZORDER);
        HWND hour = GetDlgItem(P.Window, HourFieldId);
        GetWindowRect(hour, &field);
        MapWindowPoints(nullptr, P.Window, reinterpret_cast<POINT*>(&field), 2);
        RedrawWindow(hour, nullptr, nullptr, RDW_INVALIDATE | RDW_ERASE | RDW_FRAME);
        ok = PumpUntil([&] { return PixelAt(field.right - 4, (field.top + field.bottom) / 2) == RGB(255, 0, 0); }, 5000) && ok;
        ok = Shoot("field-error") && ok;
    } else {
        ok = false;
    }
    return Close(&P) == 0 && ok ? 0 : 1;
}
