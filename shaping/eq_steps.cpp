#include "shaping/eq_steps.h"

#include "app/control_settings.h"

namespace {
int32_t KeptInRange(int32_t level) {
    if (level < SliderMin) return SliderMin;
    if (level > SliderMax) return SliderMax;
    return level;
}
}  // namespace

bool IsEqBandId(int32_t id) { return id >= EqBandFirst && id <= EqBandLast; }

int32_t SteppedBandLevel(int32_t level, int32_t request, int32_t thumb) {
    switch (request) {
    case BandLineUp: return KeptInRange(level - 5);
    case BandLineDown: return KeptInRange(level + 5);
    case BandPageUp: return KeptInRange(level - 25);
    case BandPageDown: return KeptInRange(level + 25);
    case BandThumbPosition:
    case BandThumbTrack: return KeptInRange(thumb);
    default: return level;
    }
}

int32_t ReadoutNumber(float value) { return static_cast<int32_t>(value); }
