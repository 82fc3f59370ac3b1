#pragma once

#include <cstdio>
#include <cstdlib>

namespace fuzz {

/// Ends the run with the line of the caller when the condition does not hold.
inline void check(bool condition, unsigned int line = __builtin_LINE())
{
    if (!condition) {
        std::fprintf(stderr, "check of line %u failed\n", line);
        std::abort();
    }
}

} // namespace fuzz
