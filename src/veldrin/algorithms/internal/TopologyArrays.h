#pragma once

#include <nexil/Array.h>
#include <nexil/Ptr.h>
#include <veldrin/geometry/GeoProperties.h>
#include <veldrin/geometry/Names.h>
#include <veldrin/object/Properties.h>

#include <algorithm>
#include <cstdint>

/// The arrays of a geometry as algorithms read them: shared, not copied, and never read beyond their ends.
namespace Veldrin::Geometry {

using IndexArray = Nexil::Ptr<Nexil::Array<unsigned int>>;

/// The "data" of the geo property `name` when it holds elements of T; null otherwise.
template <class T>
[[nodiscard]] Nexil::Ptr<Nexil::Array<T>> dataOf(Object const& geometry, char const* name)
{
    auto const property = getPropertyAs<Nexil::Ptr<Object>>(geometry, name);
    return property ? getPropertyAs<Nexil::Ptr<Nexil::Array<T>>>(*property, sData) : nullptr;
}

/// Half-open range of indices.
struct IndexRange {
    std::uint64_t begin;
    std::uint64_t end;
};

/// Offsets of consecutive ranges: element i owns [offsets[i], offsets[i + 1]), cut off at `limit`, the size of the array
/// that the range runs over. One compare keeps what a hostile file says within bounds.
class OffsetRanges {
public:
    OffsetRanges(Nexil::Array<unsigned int> const& offsets, std::uint64_t limit)
        : OffsetRanges(offsets.data(), offsets.empty() ? 0 : offsets.size() - 1, limit)
    {
    }

    /// `count` ranges by `count` + 1 offsets.
    OffsetRanges(unsigned int const* offsets, std::uint64_t count, std::uint64_t limit)
        : offsets_(offsets), count_(count), limit_(limit)
    {
    }

    /// Number of ranges that the offsets describe.
    [[nodiscard]] std::uint64_t count() const noexcept { return count_; }
    /// Where ranges are cut off.
    [[nodiscard]] std::uint64_t limit() const noexcept { return limit_; }

    [[nodiscard]] IndexRange operator[](std::uint64_t i) const noexcept
    {
        return {std::min<std::uint64_t>(offsets_[i], limit_), std::min<std::uint64_t>(offsets_[i + 1], limit_)};
    }

    /// Whether no range of [begin, end) ends before it begins. To its end and by bits, so that it becomes vector code.
    [[nodiscard]] bool rise(std::uint64_t begin, std::uint64_t end) const noexcept
    {
        unsigned int falls = 0;
        for (std::uint64_t i = begin; i < end; ++i)
            falls |= offsets_[i + 1] < offsets_[i] ? 1u : 0u;
        return falls == 0;
    }

private:
    unsigned int const* offsets_;
    std::uint64_t count_;
    std::uint64_t limit_;
};

} // namespace Veldrin::Geometry
