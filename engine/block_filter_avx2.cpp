// The block filter's transforms compiled for AVX2 (CMakeLists.txt gives this
// file -mavx2 and no FMA); the same source as the baseline, the same bytes.
#include <cstdint>

#include "engine/block_filter_tables.h"

namespace Avx2Filter {
#include "engine/block_filter_kernel.inc"
}
