// The engine's clock on Windows: the local time, hour and minute only.
#include <windows.h>
#include "engine/platform.h"

void ReadLocalClock(int32_t* hour, int32_t* minute) {
    SYSTEMTIME now;
    GetLocalTime(&now);
    *hour = now.wHour;
    *minute = now.wMinute;
}
