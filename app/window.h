// app/window.h: the main window: its class, its procedure and the start-up
// of the whole program.
#pragma once
#include <windows.h>

// The window procedure: a dispatch table, one handler per message.
LRESULT CALLBACK MainWindowProc(HWND window, UINT message, WPARAM wParam, LPARAM lParam);

// Start-up up to the shown window: registers the class, creates the window
// (WM_CREATE runs the application initialiser), creates and sets up the
// remaining controls, applies the closed-panel state and shows the window.
// Returns MainWindow, or nullptr when the class or window cannot be made.
HWND StartProgram(HINSTANCE instance, int showCommand);

// Runs the message loop until WM_QUIT; returns its wParam (0).
int RunMessageLoop();

// The application initialiser: flags, engine start values, field flags,
// control start values, equaliser memories, brushes. Once, in WM_CREATE.
void InitialiseApplication();
