// tests/test_platform.h: the tests' side of the engine's platform seam.
// Each call is counted so a test can see what the core asked for.
#pragma once
#include <cstdint>

struct PlatformCalls {
    int32_t Stops, Chimes, PeakUpdates;  // calls of StopPlayback, StartChime and UpdatePeaks
    int32_t PeakRight, PeakLeft;         // peaks of the last UpdatePeaks, truncated
    int32_t ClockHour, ClockMinute;      // what ReadLocalClock answers
};
extern PlatformCalls Platform;

// Start values for the engine and the controls, and a cleared call record.
void ResetProgramState();
