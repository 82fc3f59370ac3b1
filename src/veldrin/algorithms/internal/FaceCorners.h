#pragma once

#include <nexil/parallel/Parallel.h>
#include <veldrin/algorithms/internal/TopologyArrays.h>

#include <algorithm>
#include <cstdint>
#include <functional>
#include <vector>

namespace Veldrin::Geometry {

/// Sorts, in parallel where there is much to sort.
template <class T>
void sortMany(T* first, T* last)
{
    constexpr std::ptrdiff_t kMany = 65536;
    if (last - first < kMany)
        std::sort(first, last);
    else
        Nexil::parallel::sort(first, last, std::less<>());
}

/// Whether a face has at least three corners, all of them below `pointCount` and all different.
///
/// scratch: holds a copy of the corners of a face that has too many to compare them pair by pair.
[[nodiscard]] inline bool isRegularFace(unsigned int const* points, IndexRange range, std::uint64_t pointCount,
                                        std::vector<std::uint64_t>& scratch)
{
    constexpr std::uint64_t kFew = 16;
    if (range.begin + 3 > range.end)
        return false;
    std::uint64_t const count = range.end - range.begin;
    unsigned int const* const corners = points + range.begin;
    if (count == 3)
        return (corners[0] < pointCount) & (corners[1] < pointCount) & (corners[2] < pointCount) &
               (corners[0] != corners[1]) & (corners[1] != corners[2]) & (corners[2] != corners[0]);
    for (std::uint64_t i = 0; i < count; ++i)
        if (corners[i] >= pointCount)
            return false;
    if (count <= kFew) {
        bool isRepeated = false;
        for (std::uint64_t i = 1; i < count; ++i)
            for (std::uint64_t j = 0; j < i; ++j)
                isRepeated |= corners[i] == corners[j];
        return !isRepeated;
    }
    scratch.assign(corners, corners + count);
    sortMany(scratch.data(), scratch.data() + count);
    return std::adjacent_find(scratch.begin(), scratch.end()) == scratch.end();
}

} // namespace Veldrin::Geometry
