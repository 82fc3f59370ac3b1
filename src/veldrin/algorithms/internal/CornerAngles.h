#pragma once

#include <veldrin/algorithms/internal/BlockMath.h>
#include <veldrin/algorithms/internal/FaceNormal.h>
#include <veldrin/algorithms/internal/MeshFaces.h>

#include <array>
#include <cstddef>
#include <cstdint>
#include <vector>

namespace Veldrin::GeometryAlgorithms {

/// The angles at the corners of the faces of a `FaceNormalBlock`, in radians, computed together. An edge not longer than
/// the smallest normal float counts as it is, not as a unit vector.
template <class Ranges>
class CornerAngles;

/// Faces of any size: edges are gathered first.
template <>
class CornerAngles<Geometry::OffsetRanges> {
public:
    template <class Block>
    void compute(Block const& block, Positions const& positions, unsigned int const* points,
                 Geometry::OffsetRanges const& ranges, std::uint64_t begin, std::uint64_t end)
    {
        count_ = 0;
        for (std::uint64_t f = begin; f < end; ++f) {
            firsts_[f - begin] = count_;
            if (block.isCovered(f - begin))
                addFace(positions, points + ranges[f].begin, ranges[f].end - ranges[f].begin);
        }
        computeAdded();
    }

    /// Of a covered face.
    [[nodiscard]] float operator()(std::size_t face, std::uint64_t corner) const noexcept
    {
        return angles_[firsts_[face] + corner];
    }

private:
    void addFace(Positions const& positions, unsigned int const* points, std::uint64_t n);
    void computeAdded() noexcept;
    void grow(std::size_t count);

    std::size_t count_ = 0;
    std::array<std::size_t, kBlockSize> firsts_;
    // Edge k leads from corner k to the next of its face; previous_[k] is the index of the edge before it.
    std::vector<float> x_, y_, z_, angles_;
    std::vector<std::uint32_t> previous_;
};

template <unsigned int N>
class CornerAngles<Geometry::UniformRanges<N>> {
public:
    template <class Block>
    void compute(Block const& block, Positions const&, unsigned int const*, Geometry::UniformRanges<N> const&,
                 std::uint64_t, std::uint64_t) noexcept
    {
        cornerAngles<N>(block.corners(), angles_);
    }

    [[nodiscard]] float operator()(std::size_t face, std::uint64_t corner) const noexcept
    {
        return angles_[corner][face];
    }

private:
    float angles_[N][kBlockSize];
};

} // namespace Veldrin::GeometryAlgorithms
