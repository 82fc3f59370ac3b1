#pragma once

#include <cstddef>

/// Arithmetic over blocks of values that lie component by component.
///
/// Loops without branches over plain arrays, which compilers turn into vector code: square root, quotient and arc cosine
/// take a quarter of the time or less than one by one, and give the same bits. Arrays must not overlap.
namespace Veldrin::GeometryAlgorithms {

/// Faces computed together. A power of two that keeps all arrays of a block in the nearest cache.
inline constexpr std::size_t kBlockSize = 64;

/// Positions of the corners of `kBlockSize` faces that have N each.
template <unsigned int N>
struct CornerBlock {
    float x[N][kBlockSize];
    float y[N][kBlockSize];
    float z[N][kBlockSize];
};

/// Sum of the cross products of the fan of triangles (0, k - 1, k) of each face, as `fanVector` gives it.
template <unsigned int N>
void fanVectors(CornerBlock<N> const& corners, float* x, float* y, float* z) noexcept;

/// Sum of cross(p[k], p[k + 1]) over the closed loop of corners of each face, as `newellVector` gives it.
template <unsigned int N>
void newellVectors(CornerBlock<N> const& corners, float* x, float* y, float* z) noexcept;

/// Angle at corner k of face i, in radians, to angles[k][i]. An edge not longer than the smallest normal float counts as it
/// is, not as a unit vector.
template <unsigned int N>
void cornerAngles(CornerBlock<N> const& corners, float (&angles)[N][kBlockSize]) noexcept;

/// Scales each vector to length 1; one not longer than the smallest normal float becomes (0, 1, 0).
void unitsOrFallback(float* x, float* y, float* z, std::size_t count) noexcept;

/// Scales each vector to length 1; one not longer than the smallest normal float stays as it is.
void unitsOrSelf(float* x, float* y, float* z, std::size_t count) noexcept;

/// Multiplies each vector (x, y, z) by half the length of (u, v, w).
void scaleByHalfLength(float* x, float* y, float* z, float const* u, float const* v, float const* w,
                       std::size_t count) noexcept;

/// Arc cosine of each value, in radians; what lies outside [-1, 1] counts as the nearer end. Within 3 units in the last
/// place. The polynomial is that of S. L. Moshier's Cephes library (asinf, 1992).
void arcCosines(float* values, std::size_t count) noexcept;

} // namespace Veldrin::GeometryAlgorithms
