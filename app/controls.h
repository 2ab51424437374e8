// app/controls.h: the main window's child controls: creation and layout.
//
// Controls are created without position or size and placed by the layout on
// every WM_SIZE; the outer window size is imposed there (750 x PanelHeight).
#pragma once
#include <windows.h>

// Creation, in the start-up order.
void CreateIconButtons(HWND window, HINSTANCE instance);      // during WM_CREATE: the six icon buttons
void CreateRemainingControls(HWND window, HINSTANCE instance);// after it: rows, profiles, fields, labels, sliders, equaliser
void SetStartPositions();                                      // M1, slider ranges 1..255 at 128, AM, Talking / TV

// Layout (WM_SIZE): imposes 750 x PanelHeight and places every control.
void LayoutWindow(HWND window);

// The equaliser panel: hide its controls and close to 270, or show them and
// open to 580; each sends the window a WM_SIZE to impose the new height.
void HideEqPanel(HWND window);
void ShowEqPanel(HWND window);
