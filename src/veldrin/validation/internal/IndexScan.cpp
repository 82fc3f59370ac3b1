#include <veldrin/validation/internal/IndexScan.h>

#include <nexil/parallel/Parallel.h>

#include <algorithm>
#include <cstddef>

namespace Veldrin::Geometry::Internal {

namespace {

    namespace grain {
        constexpr std::size_t kIndices = 65536;
    } // namespace grain

    // The inner loops run to their end and join without branches, so that they become vector code.

    unsigned int largestSum(unsigned int const* indices, std::uint64_t count, unsigned int addend)
    {
        return Nexil::parallel::reduceInOrder(
            count, grain::kIndices, 0u,
            [=](std::size_t begin, std::size_t end, unsigned int largest) {
                for (std::size_t i = begin; i < end; ++i)
                    largest = std::max(largest, indices[i] + addend);
                return largest;
            },
            [](unsigned int left, unsigned int right) { return std::max(left, right); });
    }

} // namespace

unsigned int largestIndex(unsigned int const* indices, std::uint64_t count)
{
    return largestSum(indices, count, 0);
}

unsigned int elementBound(unsigned int const* indices, std::uint64_t count)
{
    // kInvalidIndex is the largest value there is, so that adding one makes it the least.
    return largestSum(indices, count, 1);
}

bool neverFalls(unsigned int const* offsets, std::uint64_t count)
{
    if (count < 2)
        return true;
    return Nexil::parallel::reduceInOrder(
               count - 1, grain::kIndices, 0u,
               [=](std::size_t begin, std::size_t end, unsigned int falls) {
                   for (std::size_t i = begin; i < end; ++i)
                       falls |= offsets[i + 1] < offsets[i] ? 1u : 0u;
                   return falls;
               },
               [](unsigned int left, unsigned int right) { return left | right; }) == 0;
}

} // namespace Veldrin::Geometry::Internal
