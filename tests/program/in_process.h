// tests/program/in_process.h: for tests that run the program's window inside
// the test process, where its globals can be read directly.
#pragma once
#include <cstdint>
#include <string>
#include <windows.h>

#include "app/globals.h"

// Runs this thread's messages until `condition` holds or `ms` have passed;
// false when the time ran out first.
template <typename F>
bool PumpUntil(F condition, DWORD ms) {
    const ULONGLONG end = GetTickCount64() + ms;
    for (;;) {
        MSG message;
        while (PeekMessageA(&message, nullptr, 0, 0, PM_REMOVE)) {
            TranslateMessage(&message);
            DispatchMessageA(&message);
        }
        if (condition()) return true;
        if (GetTickCount64() >= end) return false;
        MsgWaitForMultipleObjects(0, nullptr, FALSE, 10, QS_ALLINPUT);
    }
}

// A command to the main window as a button click sends it.
inline void Command(int32_t id) { SendMessageA(MainWindow, WM_COMMAND, MAKEWPARAM(id, BN_CLICKED), 0); }

inline BOOL CALLBACK FindOwnBox(HWND window, LPARAM data) {
    char cls[32] = {0};
    GetClassNameA(window, cls, sizeof(cls));
    if (std::string(cls) == "#32770" && IsWindowVisible(window)) {
        *reinterpret_cast<HWND*>(data) = window;
        return FALSE;
    }
    return TRUE;
}

// The message box this thread has open (a box's modal loop runs on the
// thread that opened it), nullptr when none.
inline HWND OwnOpenBox() {
    HWND box = nullptr;
    EnumThreadWindows(GetCurrentThreadId(), FindOwnBox, reinterpret_cast<LPARAM>(&box));
    return box;
}
