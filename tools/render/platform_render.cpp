// The render tool's side of the engine's platform seam.
#include "engine/platform.h"
#include "tools/render/render.h"

bool RenderStopped = false;

// The stop rule ends the render: the block in hand is not written, as the
// program does not queue it.
void StopPlayback() { RenderStopped = true; }

// The chime plays on a device of its own, after the rain has stopped; the
// rain's render ends where it starts.
void StartChime() {}

void UpdatePeaks(const float*, const float*) {}

// The render's clock stands at midnight, so a stop time of M minutes past
// midnight is M minutes of sound.
void ReadLocalClock(int32_t* hour, int32_t* minute) {
    *hour = 0;
    *minute = 0;
}
