#pragma once

#include <tbb/global_control.h>
#include <tbb/task_arena.h>

#include <cstddef>

namespace support {

/// Calls check() with the parallel loops on 1, 2, 3 and 6 threads in turn, whatever the machine has, and on its own number.
template <class Check>
void onThreadCounts(Check const& check)
{
    for (int const threads : {1, 2, 3, 6}) {
        tbb::global_control const limit(tbb::global_control::max_allowed_parallelism,
                                        static_cast<std::size_t>(threads));
        tbb::task_arena(threads).execute(check);
    }
    check();
}

} // namespace support
