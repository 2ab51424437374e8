#include "app/window.h"
#include <mmsystem.h>
#include "app/commands.h"
#include "app/controls.h"
#include "app/core_state.h"
#include "app/globals.h"
#include "timers/time_fields.h"
#include "engine/block.h"
#include "settings/registry.h"
#include "shaping/eq_window.h"

namespace {
const char ClassName[] = "Sombrel Player";
const char Caption[] = "Sombrel  www.sombrel.example";

LRESULT OnCreate(HWND window) {
    PanelHeight = PanelClosedHeight;
    const HINSTANCE instance = reinterpret_cast<HINSTANCE>(GetWindowLongPtrA(window, GWLP_HINSTANCE));
    CreateIconButtons(window, instance);
    MainWindow = window;
    InitialiseApplication();
    return 0;
}

LRESULT OnDestroy() {
    SaveSettings();  // writes only after a run in which Play was used
    PostQuitMessage(0);
    return 0;
}

LRESULT OnSize(HWND window) {
    LayoutWindow(window);
    LoadSettings();  // acts once, the first time the controls are in place
    return 0;
}

LRESULT OnPaint(HWND window) {
    PaintMeter(window, &MeterState);
    return 0;
}

LRESULT OnCommand(HWND window, UINT message, WPARAM wParam, LPARAM lParam) {
    if (RunCommand(window, LOWORD(wParam))) return 0;
    return DefWindowProcA(window, message, wParam, lParam);
}

LRESULT OnHorizontalScroll(WPARAM wParam, LPARAM lParam) {
    // The thumb position travels as a 16-bit word; slider values fit it.
    StepMainSlider(reinterpret_cast<HWND>(lParam), LOWORD(wParam), HIWORD(wParam));
    return 0;
}

LRESULT OnVerticalScroll(WPARAM wParam, LPARAM lParam) {
    ScrollEqBand(reinterpret_cast<HWND>(lParam), LOWORD(wParam), HIWORD(wParam));
    return 0;
}

LRESULT OnColourEdit(HWND window, UINT message, WPARAM wParam, LPARAM lParam) {
    HBRUSH brush = TimeFieldBrush(reinterpret_cast<HWND>(lParam));
    if (brush != nullptr) return reinterpret_cast<LRESULT>(brush);
    return DefWindowProcA(window, message, wParam, lParam);
}

LRESULT OnPowerBroadcast(HWND window) {
    // Whatever the power event, a minimised window comes back.
    ShowWindow(window, SW_SHOWNORMAL);
    return 0;
}

LRESULT OnDeviceDone(WPARAM wParam) {
    OnBufferDone(reinterpret_cast<HWAVEOUT>(wParam));
    return 0;
}
}  // namespace

LRESULT CALLBACK MainWindowProc(HWND window, UINT message, WPARAM wParam, LPARAM lParam) {
    switch (message) {
    case WM_CREATE: return OnCreate(window);
    case WM_DESTROY: return OnDestroy();
    case WM_SIZE: return OnSize(window);
    case WM_PAINT: return OnPaint(window);
    case WM_COMMAND: return OnCommand(window, message, wParam, lParam);
    case WM_HSCROLL: return OnHorizontalScroll(wParam, lParam);
    case WM_VSCROLL: return OnVerticalScroll(wParam, lParam);
    case WM_CTLCOLOREDIT: return OnColourEdit(window, message, wParam, lParam);
    case WM_POWERBROADCAST: return OnPowerBroadcast(window);
    case MM_WOM_DONE: return OnDeviceDone(wParam);
    default: return DefWindowProcA(window, message, wParam, lParam);
    }
}

void InitialiseApplication() {
    IsPlaying = 0;
    IsChiming = 0;
    ChimeBuffersDone = 0;
    HasPlayed = 0;
    InitEngine(&SynthState);  // also EqChanged = 1, so the first block builds every curve
    for (int32_t i = 0; i < 4; ++i) FieldValid[i] = 1;
    SetControlStartValues(&ControlSettings);
    for (int32_t m = 0; m < 3; ++m)
        for (int32_t k = 0; k < EqBandCount; ++k) EqMemories[m][k] = SliderNeutral;
    CreateMeterBrushes(&MeterState);
    WhiteFieldBrush = CreateSolidBrush(RGB(255, 255, 255));
    RedFieldBrush = CreateSolidBrush(RGB(255, 0, 0));
}

HWND StartProgram(HINSTANCE instance, int showCommand) {
    WNDCLASSEXA windowClass = {};
    windowClass.cbSize = sizeof(WNDCLASSEXA);
    windowClass.style = CS_HREDRAW | CS_VREDRAW;
    windowClass.lpfnWndProc = MainWindowProc;
    windowClass.hInstance = instance;
    windowClass.hIcon = LoadIconA(instance, MAKEINTRESOURCEA(AppIconId));
    windowClass.hIconSm = LoadIconA(instance, MAKEINTRESOURCEA(AppIconId));
    windowClass.hCursor = LoadCursorA(nullptr, MAKEINTRESOURCEA(32512));
    windowClass.hbrBackground = reinterpret_cast<HBRUSH>(COLOR_BTNFACE + 1);
    windowClass.lpszClassName = ClassName;
    if (RegisterClassExA(&windowClass) == 0) return nullptr;

    HWND window = CreateWindowExA(0, ClassName, Caption, WS_OVERLAPPEDWINDOW, CW_USEDEFAULT,
                                  CW_USEDEFAULT, 0, 0, nullptr, nullptr, instance, nullptr);
    if (window == nullptr) return nullptr;

    CreateRemainingControls(window, instance);
    SetStartPositions();
    HideEqPanel(window);
    EnableFadeOutControls();
    ShowWindow(window, showCommand);
    UpdateWindow(window);
    return window;
}

int RunMessageLoop() {
    MSG message;
    while (GetMessageA(&message, nullptr, 0, 0) > 0) {
        TranslateMessage(&message);
        DispatchMessageA(&message);
    }
    return static_cast<int>(message.wParam);
}
