#pragma once

#include <tbb/global_control.h>

#include <cstddef>

namespace support {

/// Calls check() with the parallel loops on at most 1, 2, 3 and all threads in turn.
template <class Check>
void onThreadCounts(Check const& check)
{
    for (std::size_t const threads : {1u, 2u, 3u}) {
        tbb::global_control const limit(tbb::global_control::max_allowed_parallelism, threads);
        check();
    }
    check();
}

} // namespace support
