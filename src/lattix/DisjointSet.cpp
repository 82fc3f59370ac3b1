#include <lattix/DisjointSet.h>

#include <nexil/parallel/Scan.h>

namespace Lattix {

namespace {

    namespace grain {
        constexpr std::size_t kElements = 65536;
        constexpr std::size_t kRoots = 4096;
    } // namespace grain

} // namespace

template <class Index>
DisjointSet<Index>::DisjointSet(std::uint64_t elementCount)
{
    Nexil::Internal::resizeUninitialized(parents_, elementCount);
    Nexil::parallel::forRange(elementCount, grain::kElements, [&](std::size_t begin, std::size_t end) {
        for (std::size_t i = begin; i < end; ++i)
            parents_[i] = static_cast<Index>(i);
    });
}

template <class Index>
Nexil::Array<Index> DisjointSet<Index>::TBBGetRoots() const
{
    Index const* const parents = parents_.data();
    return Nexil::parallel::indicesWhere<Index>(parents_.size(), grain::kRoots,
                                                [=](std::size_t i) { return parents[i] == static_cast<Index>(i); });
}

template <class Index>
std::uint64_t DisjointSet<Index>::rootCount() const
{
    Index const* const parents = parents_.data();
    return Nexil::parallel::countWhere(parents_.size(), grain::kRoots,
                                       [=](std::size_t i) { return parents[i] == static_cast<Index>(i); });
}

template class DisjointSet<unsigned int>;

} // namespace Lattix
