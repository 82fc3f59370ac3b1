#pragma once

#include <veldrin/algorithms/internal/BlockMath.h>
#include <veldrin/algorithms/internal/FaceNormal.h>

#include <algorithm>
#include <cstring>

namespace Veldrin::GeometryAlgorithms {

/// Whether `gatherBlock` may read the positions of these points: all are there, with one more behind each.
[[nodiscard, gnu::always_inline]] inline bool mayGather(Positions const& positions, unsigned int const* points,
                                                        std::size_t n) noexcept
{
    unsigned int bits = 0;
    for (std::size_t i = 0; i < n; ++i)
        bits |= points[i];
    if (std::uint64_t(bits) + 1 < positions.count)
        return true;
    // The bits of all together are no less than the highest, and soon found; they may be more.
    unsigned int highest = 0;
    for (std::size_t i = 0; i < n; ++i)
        highest = std::max(highest, points[i]);
    return std::uint64_t(highest) + 1 < positions.count;
}

/// Reads the positions at the corners of `kBlockSize` faces, four faces at a time: each position with the number behind it,
/// which is left out as the rows are turned into columns. Takes half the time of number by number.
template <unsigned int N>
[[gnu::always_inline]] inline void gatherBlock(Positions const& positions, unsigned int const* points,
                                               CornerBlock<N>& corners) noexcept
{
    using Lanes [[gnu::vector_size(4 * sizeof(float))]] = float;
    for (std::size_t i = 0; i < kBlockSize; i += 4)
        for (unsigned int k = 0; k < N; ++k) {
            Lanes row[4];
            for (std::size_t face = 0; face < 4; ++face)
                std::memcpy(&row[face], &positions[points[(i + face) * N + k]], sizeof(Lanes));
            Lanes const xy01 = __builtin_shufflevector(row[0], row[1], 0, 4, 1, 5);
            Lanes const xy23 = __builtin_shufflevector(row[2], row[3], 0, 4, 1, 5);
            Lanes const z01 = __builtin_shufflevector(row[0], row[1], 2, 6, 3, 7);
            Lanes const z23 = __builtin_shufflevector(row[2], row[3], 2, 6, 3, 7);
            Lanes const x = __builtin_shufflevector(xy01, xy23, 0, 1, 4, 5);
            Lanes const y = __builtin_shufflevector(xy01, xy23, 2, 3, 6, 7);
            Lanes const z = __builtin_shufflevector(z01, z23, 0, 1, 4, 5);
            std::memcpy(corners.x[k] + i, &x, sizeof(Lanes));
            std::memcpy(corners.y[k] + i, &y, sizeof(Lanes));
            std::memcpy(corners.z[k] + i, &z, sizeof(Lanes));
        }
}

} // namespace Veldrin::GeometryAlgorithms
