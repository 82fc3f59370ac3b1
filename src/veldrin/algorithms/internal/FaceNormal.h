#pragma once

#include <veldrin/math/Vector.h>

#include <algorithm>
#include <cmath>
#include <cstdint>
#include <limits>

/// Normals of single faces, the arithmetic that all kernels share: single precision, one fixed order of operations.
///
/// Inlined always: where a kernel knows the number of corners, what is left of these is a few instructions, and left to
/// itself the compiler calls them once a source uses them in many places, at thrice the time.
namespace Veldrin::GeometryAlgorithms {

/// Stands in for the normal of what has none.
inline constexpr Math::float3 kFallbackNormal{0, 1, 0};

/// The vector scaled to length 1, or the fallback normal when it is not longer than the smallest normal float.
[[nodiscard, gnu::always_inline]] inline Math::float3 unitOrFallback(Math::float3 const& v) noexcept
{
    float const length = std::sqrt(v.x * v.x + v.y * v.y + v.z * v.z);
    if (!(length > std::numeric_limits<float>::min()))
        return kFallbackNormal;
    float const scale = 1 / length;
    return {v.x * scale, v.y * scale, v.z * scale};
}

[[nodiscard, gnu::always_inline]] inline Math::float3 difference(Math::float3 const& a, Math::float3 const& b) noexcept
{
    return {a.x - b.x, a.y - b.y, a.z - b.z};
}

/// Positions by point, and the check that keeps a face of a hostile mesh from reaching beyond them.
struct Positions {
    Math::float3 const* data;
    std::uint64_t count;

    [[nodiscard]] Math::float3 const& operator[](unsigned int point) const noexcept { return data[point]; }

    /// At least three corners, and a position for each.
    [[nodiscard, gnu::always_inline]] bool cover(unsigned int const* points, std::uint64_t n) const noexcept
    {
        if (n < 3)
            return false;
        unsigned int highest = 0;
        for (std::uint64_t k = 0; k < n; ++k)
            highest = std::max(highest, points[k]);
        return highest < count;
    }
};

/// Sum of the cross products of the fan of triangles (0, k - 1, k): twice the area of a planar polygon, along its normal.
[[nodiscard, gnu::always_inline]] inline Math::float3 fanVector(Positions const& positions, unsigned int const* points,
                                                                std::uint64_t n) noexcept
{
    Math::float3 const origin = positions[points[0]];
    Math::float3 previous = difference(positions[points[1]], origin);
    Math::float3 sum{};
    for (std::uint64_t k = 2; k < n; ++k) {
        Math::float3 const next = difference(positions[points[k]], origin);
        Math::float3 const term = cross(previous, next);
        sum = {sum.x + term.x, sum.y + term.y, sum.z + term.z};
        previous = next;
    }
    return sum;
}

/// Sum of cross(p[k], p[k + 1]) over the closed loop of corners, whose half length is the face's area (Newell's method;
/// I. E. Sutherland, R. F. Sproull, R. A. Schumacker, "A Characterization of Ten Hidden-Surface Algorithms", 1974).
[[nodiscard, gnu::always_inline]] inline Math::float3 newellVector(Positions const& positions,
                                                                   unsigned int const* points, std::uint64_t n) noexcept
{
    Math::float3 sum{};
    Math::float3 p = positions[points[0]];
    for (std::uint64_t k = 0; k < n; ++k) {
        Math::float3 const next = positions[points[k + 1 == n ? 0 : k + 1]];
        Math::float3 const term = cross(p, next);
        sum = {sum.x + term.x, sum.y + term.y, sum.z + term.z};
        p = next;
    }
    return sum;
}

} // namespace Veldrin::GeometryAlgorithms
