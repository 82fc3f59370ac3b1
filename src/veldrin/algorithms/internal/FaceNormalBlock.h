#pragma once

#include <veldrin/algorithms/internal/CornerGather.h>
#include <veldrin/algorithms/internal/FaceNormal.h>
#include <veldrin/algorithms/internal/MeshFaces.h>

#include <array>

namespace Veldrin::GeometryAlgorithms {

/// The corners of the faces computed together: kept where all faces have the same number of them.
template <class Ranges>
struct BlockCorners {};

template <unsigned int N>
struct BlockCorners<Geometry::UniformRanges<N>> : CornerBlock<N> {};

/// Unit normals of up to `kSize` consecutive faces, computed together; on request times their areas.
///
/// Reading positions, the arithmetic, and writing elsewhere are three loops: one normal would wait for the other's square
/// root and quotient, and a read for the writes just before it at a like address.
template <bool isAreaWeighted, class Ranges>
class FaceNormalBlock {
public:
    static constexpr std::size_t kSize = kBlockSize;

    /// The faces [begin, end).
    [[gnu::always_inline]] void compute(Positions const& positions, unsigned int const* points, Ranges const& ranges,
                                        std::uint64_t begin, std::uint64_t end)
    {
        addUp(positions, points, ranges, begin, end);
        unitsOrFallback(x_.data(), y_.data(), z_.data(), end - begin);
        if constexpr (isAreaWeighted)
            scaleByHalfLength(x_.data(), y_.data(), z_.data(), u_.data(), v_.data(), w_.data(), end - begin);
    }

    /// False for a degenerate face, or one that names a point without a position.
    [[nodiscard]] bool isCovered(std::size_t i) const noexcept { return isCovered_[i]; }
    [[nodiscard]] Math::float3 operator[](std::size_t i) const noexcept { return {x_[i], y_[i], z_[i]}; }
    /// Those of faces that are not covered are zero.
    [[nodiscard]] BlockCorners<Ranges> const& corners() const noexcept { return corners_; }

private:
    // In both of these a face without a normal is a vector of no length to the loops that follow.

    [[gnu::always_inline]] void addUp(Positions const& positions, unsigned int const* points,
                                      Geometry::OffsetRanges const& ranges, std::uint64_t begin, std::uint64_t end)
    {
        for (std::uint64_t f = begin; f < end; ++f) {
            Geometry::IndexRange const range = ranges[f];
            std::uint64_t const n = range.end - range.begin;
            unsigned int const* const corners = points + range.begin;
            std::size_t const i = f - begin;
            isCovered_[i] = positions.cover(corners, n);
            Math::float3 const vector = isCovered_[i] ? fanVector(positions, corners, n) : Math::float3{};
            x_[i] = vector.x;
            y_[i] = vector.y;
            z_[i] = vector.z;
            if constexpr (isAreaWeighted) {
                Math::float3 const area = isCovered_[i] ? newellVector(positions, corners, n) : Math::float3{};
                u_[i] = area.x;
                v_[i] = area.y;
                w_[i] = area.z;
            }
        }
    }

    template <unsigned int N>
    [[gnu::always_inline]] void addUp(Positions const& positions, unsigned int const* points,
                                      Geometry::UniformRanges<N> const& ranges, std::uint64_t begin, std::uint64_t end)
    {
        unsigned int const* const corners = points + ranges[begin].begin;
        std::size_t const count = end - begin;
        if (count == kSize && mayGather(positions, corners, kSize * N)) {
            gatherBlock<N>(positions, corners, corners_);
            isCovered_.fill(true);
        } else {
            for (std::size_t i = 0; i < count; ++i) {
                isCovered_[i] = positions.cover(corners + i * N, N);
                for (unsigned int k = 0; k < N; ++k) {
                    Math::float3 const position = isCovered_[i] ? positions[corners[i * N + k]] : Math::float3{};
                    corners_.x[k][i] = position.x;
                    corners_.y[k][i] = position.y;
                    corners_.z[k][i] = position.z;
                }
            }
        }
        fanVectors(corners_, x_.data(), y_.data(), z_.data());
        if constexpr (isAreaWeighted)
            newellVectors(corners_, u_.data(), v_.data(), w_.data());
    }

    BlockCorners<Ranges> corners_{};
    std::array<float, kSize> x_, y_, z_;
    std::array<float, isAreaWeighted ? kSize : 0> u_, v_, w_;
    std::array<bool, kSize> isCovered_;
};

} // namespace Veldrin::GeometryAlgorithms
