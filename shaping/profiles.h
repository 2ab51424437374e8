// shaping/profiles.h: noise colours and masking profiles.
#pragma once
#include <cstdint>
#include "engine/synth_state.h"

// Rebuilds ProfileResponse over bins 6..6825 for profile 100..107 (and, for
// 104..107, the section table, then BuildPeakResponse). Any other value
// changes nothing.
void BuildProfileResponse(int32_t profile, SynthRecord* state);

// Rebuilds ProfileResponse over bins 6..6825 as the product of the first
// ProfilePeakCount analogue peak sections.
void BuildPeakResponse(SynthRecord* state);
