#pragma once

#include <veldrin/algorithms/internal/FaceNormal.h>

#include <cstddef>
#include <cstdint>
#include <vector>

namespace Veldrin::GeometryAlgorithms {

/// The angles at the corners of faces, in radians, in the order in which faces were added: first gathered, then computed
/// all together.
class CornerAngles {
public:
    void clear() noexcept { count_ = 0; }

    /// A face that `positions` covers.
    void addFace(Positions const& positions, unsigned int const* points, std::uint64_t n);

    /// Turns what was added into angles. An edge not longer than the smallest normal float counts as it is, not as a unit
    /// vector.
    void compute() noexcept;

    [[nodiscard]] float operator[](std::size_t corner) const noexcept { return angles_[corner]; }

private:
    void grow(std::size_t count);

    std::size_t count_ = 0;
    // Edge k leads from corner k to the next of its face; previous_[k] is the index of the edge before it.
    std::vector<float> x_, y_, z_, angles_;
    std::vector<std::uint32_t> previous_;
};

} // namespace Veldrin::GeometryAlgorithms
