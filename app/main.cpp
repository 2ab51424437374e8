// Sombrel Player: continuous synthesised rain, one window, one thread.
#include <windows.h>
#include "app/window.h"

int WINAPI WinMain(HINSTANCE instance, HINSTANCE, LPSTR, int showCommand) {
    if (StartProgram(instance, showCommand) == nullptr) return 1;
    return RunMessageLoop();
}
