// tests/program/driver.h: works Sombrel.exe from another process, as a user
// would: starts it, finds its window, clicks its controls with messages,
// reads the controls back and handles its message boxes.
//
// Every wait polls a condition with a bounded timeout; nothing waits for a
// fixed time and then assumes something happened.
#pragma once
#include <cstdint>
#include <string>
#include <vector>
#include <windows.h>

// Paths and settings handed in by the harness.
struct DriverConfig {
    std::string ProgramPath;   // Windows path of Sombrel.exe
    std::string WorkDir;       // Windows path of a directory the tests may fill
    std::string Requests;      // Windows path where requests to the harness go ("" if none)
};
extern DriverConfig Config;

// Turns "/a/b" into "Z:\a\b" (Wine's drive for the Unix root); other paths
// are returned as they are.
std::string WindowsPath(const std::string& path);

// A running copy of the program.
struct Program {
    PROCESS_INFORMATION Process;  // its process and main thread
    HWND Window;                  // its main window, nullptr until found
    double MillisecondsToShow;    // from CreateProcess to the window visible
};

// Starts `exe` (default: Config.ProgramPath) and waits up to 30 s for its
// visible main window. False (with Process left valid) when none appears.
bool LaunchProgram(Program* program, const std::string& exe = "");
// Asks the window to close and waits up to `ms` for the process to end;
// returns its exit code, or -1 if it did not end (it is then terminated).
int32_t CloseProgram(Program* program, DWORD ms = 20000);
// Ends a program that a failed test left behind.
void EndProgram(Program* program);

// Controls of the main window.
HWND Control(const Program& program, int32_t id);
// The slider (scroll bar) with control id 0..35.
HWND Slider(const Program& program, int32_t id);
// The playing state as the controls show it: every control Play disables is
// disabled. The stopped state: all of them enabled but the Fade Out pair,
// which follows Stop Time and Alarm.
bool ShowsPlaying(const Program& program);
bool ShowsStopped(const Program& program);
// Finds a child by class and text (for the id-0 labels and frames).
HWND ChildByText(const Program& program, const char* cls, const char* text);
std::string ClassOf(HWND window);
std::string TextOf(HWND window);
RECT ClientRectOf(const Program& program, HWND child);  // child's place in the main window's client area
RECT OuterRect(HWND window);
bool IsChecked(HWND button);
int32_t SliderPosition(HWND slider);

// A click as the user makes it (BM_CLICK: the button presses itself and
// tells the window). Click waits until the program has handled it, at most
// 10 s (false if it did not answer: a modal box may be holding it);
// ClickAsync only posts it, for clicks that open a box the driver must answer.
bool Click(const Program& program, int32_t id);
void ClickAsync(const Program& program, int32_t id);
// Sends a scroll request to a main slider and waits until it is handled.
void Scroll(const Program& program, int32_t sliderId, int32_t code, int32_t position = 0);
// Waits until the program's thread answers a message, which it does only
// from a message loop, that is, between commands.
bool Settle(const Program& program, DWORD ms = 10000);

// Polls `condition` every 20 ms until it holds or `ms` have passed.
template <typename F>
bool WaitFor(F condition, DWORD ms) {
    const ULONGLONG end = GetTickCount64() + ms;
    for (;;) {
        if (condition()) return true;
        if (GetTickCount64() >= end) return false;
        Sleep(20);
    }
}

// A message box of the program: its caption, text, whether it shows an
// icon, and the texts of its buttons.
struct Box {
    HWND Window;
    std::string Caption;
    std::string Text;
    bool HasIcon;
    std::vector<std::string> Buttons;
};
// The visible dialog boxes owned by the program's process, oldest first.
std::vector<Box> OpenBoxes(const Program& program);
// Waits up to `ms` for a box to be open and reads it.
bool WaitForBox(const Program& program, Box* box, DWORD ms = 20000);
// Presses the box's OK button and waits for it to go.
bool CloseBox(const Box& box);

// Process-wide counts of the program, to see leaks.
int32_t KernelHandleCount(DWORD processId);            // from the system handle list
int32_t GdiObjectCount(HANDLE process);               // from the process's GDI handle table
int32_t WindowCount(DWORD processId);                 // top-level and child windows

// The window's pixels as seen on the screen, 32-bit BGRA rows, top first.
struct Picture {
    int32_t Width = 0;
    int32_t Height = 0;
    std::vector<uint32_t> Pixels;
    uint32_t At(int32_t x, int32_t y) const { return Pixels[static_cast<size_t>(y) * Width + x]; }
};
// The client area of the main window, from the screen.
bool CaptureClient(const Program& program, Picture* picture);
uint32_t Rgb(uint8_t r, uint8_t g, uint8_t b);   // in the Picture's pixel format

// Asks the harness to do something outside Wine (start or stop the sound
// server, take a screenshot) and waits for it to confirm. The request's
// file holds `detail`. False without a harness.
bool AskHarness(const char* request, const std::string& detail = "", DWORD ms = 30000);

// Size in bytes of a file (the harness's running recording), -1 if absent.
int64_t FileSize(const std::string& path);
