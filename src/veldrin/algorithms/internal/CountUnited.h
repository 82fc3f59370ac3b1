#pragma once

#include <lattix/DisjointSet.h>
#include <nexil/JobCancel.h>
#include <nexil/parallel/Parallel.h>

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <functional>

namespace Veldrin::Geometry::Mesh {

using PointSets = Lattix::DisjointSet<unsigned int>;

/// The number of sets, once unite(begin, end) has united [0, count) and told how many links that took. Where two threads
/// got into each other's way, uniteLocked(begin, end) does it again. Asks for cancellation after each `grain`.
template <class Unite, class UniteLocked>
std::uint64_t countUnited(PointSets const& sets, std::uint64_t count, std::size_t grain, bool isAlone,
                          Unite const& unite, UniteLocked const& uniteLocked)
{
    std::uint64_t linkCount = 0;
    if (isAlone) {
        for (std::uint64_t begin = 0; begin < count; begin += grain) {
            Nexil::Internal::throwIfJobCancelled();
            linkCount += unite(begin, std::min<std::uint64_t>(count, begin + grain));
        }
    } else {
        linkCount = Nexil::parallel::reduceInOrder(
            count, grain, std::uint64_t(0),
            [&](std::size_t begin, std::size_t end, std::uint64_t) { return unite(begin, end); }, std::plus<>());
    }
    std::uint64_t const rootCount = sets.rootCount();
    if (linkCount == sets.size() - rootCount)
        return rootCount;
    Nexil::parallel::forRange(count, grain, uniteLocked);
    return sets.rootCount();
}

} // namespace Veldrin::Geometry::Mesh
