// The block filter's transforms for the SSE2 baseline (every x86-64 processor).
#include <cstdint>

#include "engine/block_filter_tables.h"

namespace Sse2Filter {
#include "engine/block_filter_kernel.inc"
}
