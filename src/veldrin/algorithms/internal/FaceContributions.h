#pragma once

#include <veldrin/algorithms/internal/CornerAngles.h>
#include <veldrin/algorithms/internal/FaceNormalBlock.h>
#include <veldrin/algorithms/internal/Prefetch.h>

#include <algorithm>
#include <utility>

namespace Veldrin::GeometryAlgorithms {

[[gnu::always_inline]] inline Math::float3 scaled(Math::float3 const& v, float factor) noexcept
{
    return {v.x * factor, v.y * factor, v.z * factor};
}

/// Calls visit(i, k) for each corner i of a face, the k-th of its own.
template <class Visit>
[[gnu::always_inline]] inline void forEachCornerOf(Geometry::OffsetRanges const& ranges, std::uint64_t f,
                                                   Visit const& visit)
{
    Geometry::IndexRange const corners = ranges[f];
    for (std::uint64_t i = corners.begin; i < corners.end; ++i)
        visit(i, i - corners.begin);
}

/// The same without a loop.
template <unsigned int N, class Visit>
[[gnu::always_inline]] inline void forEachCornerOf(Geometry::UniformRanges<N> const& ranges, std::uint64_t f,
                                                   Visit const& visit)
{
    std::uint64_t const first = ranges[f].begin;
    [&]<std::uint64_t... k>(std::integer_sequence<std::uint64_t, k...>) {
        (visit(first + k, k), ...);
    }(std::make_integer_sequence<std::uint64_t, N>());
}

/// What faces add to the normals of their points, a block of faces at a time.
template <bool isAngleWeighted, bool isAreaWeighted, class Ranges>
class FaceContributions {
public:
    FaceContributions(Positions const& positions, unsigned int const* points, Ranges const& ranges)
        : positions_(positions), points_(points), ranges_(ranges)
    {
    }

    /// Calls visit(face, normal, angleAt) for the faces [begin, end) in order: the unit normal, weighted by area if
    /// asked for, and angleAt(k) the angle at its corner k. Leaves out faces without a normal.
    template <class Visit>
    [[gnu::always_inline]] void forEachFace(std::uint64_t begin, std::uint64_t end, Visit const& visit)
    {
        for (std::uint64_t next = begin; begin < end; begin = next) {
            next = std::min(begin + normals_.kSize, end);
            prefetchCorners(begin);
            normals_.compute(positions_, points_, ranges_, begin, next);
            if constexpr (isAngleWeighted)
                angles_.compute(normals_, positions_, points_, ranges_, begin, next);
            for (std::uint64_t f = begin; f < next; ++f)
                if (normals_.isCovered(f - begin))
                    visit(f, normals_[f - begin], [this, i = f - begin](std::uint64_t k) { return angles_(i, k); });
        }
    }

    /// Calls add(point, value) for each corner of the faces [begin, end), in order.
    template <class Add>
    [[gnu::always_inline]] void forEachCorner(std::uint64_t begin, std::uint64_t end, Add const& add)
    {
        forEachFace(begin, end,
                    [&add, points = points_, &ranges = ranges_](std::uint64_t f, Math::float3 const& normal,
                                                                auto const& angleAt) {
                        forEachCornerOf(ranges, f, [&](std::uint64_t i, std::uint64_t k) {
                            add(points[i], isAngleWeighted ? scaled(normal, angleAt(k)) : normal);
                        });
                    });
    }

private:
    /// Whoever looks at a thousand faces at once before they come here finds their corners in the cache.
    [[gnu::always_inline]] void prefetchCorners(std::uint64_t face) const noexcept
    {
        constexpr std::uint64_t kCornersAhead = 4096;
        constexpr std::uint64_t kCornersOfLine = 16;
        std::uint64_t const first = ranges_[face].begin + kCornersAhead;
        for (std::uint64_t i = 0; i < kBlockSize * 4; i += kCornersOfLine)
            Geometry::prefetch(points_, first + i);
    }

    Positions const& positions_;
    unsigned int const* points_;
    Ranges const& ranges_;
    FaceNormalBlock<isAreaWeighted, Ranges> normals_;
    CornerAngles<Ranges> angles_;
};

} // namespace Veldrin::GeometryAlgorithms
