#pragma once

#include <malloc.h>

namespace bench {

/// In a program that includes this, large blocks come from the system and go back there, on every side: a program keeps
/// what it loads, so a load fills memory that it never had. Without this, each round would fill what the round before gave
/// back.
[[maybe_unused]] static bool const isMemoryFresh = mallopt(M_MMAP_THRESHOLD, 64 << 10) == 1;

} // namespace bench
