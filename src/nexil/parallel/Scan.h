#pragma once

#include <nexil/Array.h>
#include <nexil/parallel/Parallel.h>

#include <algorithm>
#include <cstddef>
#include <utility>
#include <vector>

/// Running sums over ranges, and what is built on them.
///
///     auto const faces = parallel::indicesWhere<unsigned int>(faceCount, grain::kFaces, isDegenerate);
namespace Nexil::parallel {

/// Calls body(begin, end, before) for each range of `grain` that [0, count) is cut into, where `before` is the sum of
/// total(begin, end) over the ranges before it, added from left to right. Between the two, prepare(sum over all ranges)
/// is called once.
template <class Value, class Total, class Prepare, class Body>
void scanInOrder(std::size_t count, std::size_t grain, Value const& zero, Total const& total, Prepare const& prepare,
                 Body const& body)
{
    std::size_t const rangeCount = count / grain + (count % grain != 0);
    std::vector<Value> sums(rangeCount, zero);
    auto const forEachRange = [&](auto const& visit) {
        forRange(rangeCount, 1, [&](std::size_t first, std::size_t last) {
            for (std::size_t range = first; range < last; ++range)
                visit(sums[range], range * grain, std::min(count, range * grain + grain));
        });
    };
    forEachRange([&](Value& sum, std::size_t begin, std::size_t end) { sum = total(begin, end); });
    Value all = zero;
    for (Value& sum : sums)
        sum = std::exchange(all, all + sum);
    prepare(all);
    forEachRange([&](Value const& before, std::size_t begin, std::size_t end) { body(begin, end, before); });
}

namespace Internal {

    template <class IsWanted>
    [[nodiscard]] std::size_t countFrom(std::size_t begin, std::size_t end, IsWanted const& isWanted)
    {
        std::size_t found = 0;
        for (std::size_t i = begin; i < end; ++i)
            found += isWanted(i) ? 1 : 0;
        return found;
    }

} // namespace Internal

/// How many indices below `count` isWanted(index) is true for.
template <class IsWanted>
[[nodiscard]] std::size_t countWhere(std::size_t count, std::size_t grain, IsWanted const& isWanted)
{
    return reduceInOrder(
        count, grain, std::size_t(0),
        [&](std::size_t begin, std::size_t end, std::size_t found) {
            return found + Internal::countFrom(begin, end, isWanted);
        },
        [](std::size_t left, std::size_t right) { return left + right; });
}

/// Those indices in increasing order. isWanted is called twice for each.
template <class Index, class IsWanted>
[[nodiscard]] Array<Index> indicesWhere(std::size_t count, std::size_t grain, IsWanted const& isWanted)
{
    Array<Index> indices;
    scanInOrder(
        count, grain, std::size_t(0),
        [&](std::size_t begin, std::size_t end) { return Internal::countFrom(begin, end, isWanted); },
        [&](std::size_t found) { Nexil::Internal::resizeUninitialized(indices, found); },
        [&](std::size_t begin, std::size_t end, std::size_t before) {
            for (std::size_t i = begin; i < end; ++i)
                if (isWanted(i))
                    indices[before++] = static_cast<Index>(i);
        });
    return indices;
}

} // namespace Nexil::parallel
