// tests/program/harness.h: what the program's tests share, in the program's
// own process (its window hosted by the test) and from outside (Sombrel.exe
// started as a user starts it). Every wait is bounded.
#pragma once
#include <windows.h>
#include <cstdint>
#include <string>
#include <vector>

// Runs this thread's messages (the hosted window's, the devices' notices)
// until `done` holds or `ms` have passed; false when the time ran out.
template <typename F>
bool PumpUntil(F done, DWORD ms) {
    const ULONGLONG end = GetTickCount64() + ms;
    for (;;) {
        MSG message;
        while (PeekMessageA(&message, nullptr, 0, 0, PM_REMOVE)) {
            TranslateMessage(&message);
            DispatchMessageA(&message);
        }
        if (done()) return true;
        if (GetTickCount64() >= end) return false;
        MsgWaitForMultipleObjects(0, nullptr, FALSE, 10, QS_ALLINPUT);
    }
}

// A message box as the user sees it: caption, text, the system icon shown
// (LoadIconA(nullptr, IDI_...), nullptr for none) and its visible buttons.
struct Box { std::string Caption, Text; HICON Icon; int32_t Buttons; };
Box ReadBox(HWND box);

// In the program's process: from StartAnsweringBoxes on, a thread timer
// (which a box's own modal loop dispatches too) notes every box this thread
// shows in Boxes and presses its OK, unless HoldBox says to wait.
extern std::vector<Box> Boxes;
extern bool (*HoldBox)(const Box& box);
void StartAnsweringBoxes();
std::vector<std::string> BoxTexts();   // the texts noted, then forgotten

// Wine's path for a Unix path ("/a/b" is "Z:\a\b").
std::string WindowsPath(const std::string& path);
// The folder the harness gave this run (SOMBREL_WORK), as a Windows path.
std::string WorkDir();
// Asks the harness outside Wine (a screenshot) and waits for it to confirm;
// false without a harness.
bool AskHarness(const char* request, const std::string& detail = "");

// "Software\Sombrel" below HKEY_LOCAL_MACHINE (the default) or
// HKEY_CURRENT_USER in the throw-away prefix.
bool ForgetStoredSettings();                                   // both keys gone, access lists undone
bool KeyExists(HKEY hive = HKEY_LOCAL_MACHINE);
bool StoreRaw(const char* name, DWORD type, const void* data, DWORD length, HKEY hive = HKEY_LOCAL_MACHINE);
bool StoreNumber(const char* name, int32_t number, HKEY hive = HKEY_LOCAL_MACHINE);  // as the program stores it
std::string RawValue(const char* name, HKEY hive = HKEY_LOCAL_MACHINE);  // "type: bytes in hex", "" when missing
int32_t ValueCount(HKEY hive = HKEY_LOCAL_MACHINE);
bool DenyKey(HKEY hive = HKEY_LOCAL_MACHINE);                  // an empty access list: nobody may write

struct Program { PROCESS_INFORMATION Process; HWND Window; };  // Window: its visible main window
// Starts `exe` from its own folder and waits up to 30 s for its window.
bool Launch(Program* program, const std::string& exe);
// The boxes the program has open, newest last.
std::vector<HWND> OpenBoxes(const Program& program);
// Presses a control as the user does; false when not answered within 10 s.
bool Click(const Program& program, int32_t id);
// Closes the window, answering (and noting in Boxes) any box it shows on
// the way, and returns the exit code (-1 when it did not end within 30 s).
int32_t Close(Program* program);
