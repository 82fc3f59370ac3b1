#pragma once

#include <veldrin/math/Vector.h>

#include <cstdint>

/// Voxel coordinates and the tiles they fall into.
///
/// Tiles, and voxels within a tile, are ordered by x, then y, then z: z runs fastest.
namespace VLD::TileTree3D {

using Coordinate = Veldrin::Math::int3;

/// Voxels exist at coordinates from -kCoordinateLimit up to kCoordinateLimit - 1; the tiles of every configuration cut
/// this range without a rest.
inline constexpr int kCoordinateLimit = 2'147'483'600;

/// No tile, no element.
inline constexpr unsigned int kNoTile = 0xFFFFFFFFu;
inline constexpr unsigned int kNoElement = 0xFFFFFFFFu;

[[nodiscard]] constexpr bool isBefore(Coordinate const& a, Coordinate const& b) noexcept
{
    return a.x != b.x ? a.x < b.x : a.y != b.y ? a.y < b.y : a.z < b.z;
}

[[nodiscard]] constexpr bool isWithinLimits(Coordinate const& c) noexcept
{
    auto within = [](int v) { return v >= -kCoordinateLimit && v < kCoordinateLimit; };
    return within(c.x) && within(c.y) && within(c.z);
}

/// Number of the tile of `Width` voxels that holds coordinate `v` of one axis, counted from the lower limit.
template <int Width>
[[nodiscard]] constexpr std::uint32_t tileNumber(int v) noexcept
{
    static_assert(kCoordinateLimit % Width == 0, "tiles start at the lower limit");
    // Unsigned from the lower limit on, so that the division rounds down below zero as well.
    return (static_cast<std::uint32_t>(v) + static_cast<std::uint32_t>(kCoordinateLimit)) / Width;
}

/// Lowest coordinate of the tile of `Width` voxels that holds `v`.
template <int Width>
[[nodiscard]] constexpr int tileStart(int v) noexcept
{
    return static_cast<int>(tileNumber<Width>(v) * Width - static_cast<std::uint32_t>(kCoordinateLimit));
}

/// Lowest coordinates of the tile of `Width` voxels per axis that holds the voxel `c`.
template <int Width>
[[nodiscard]] constexpr Coordinate tileOrigin(Coordinate const& c) noexcept
{
    return {tileStart<Width>(c.x), tileStart<Width>(c.y), tileStart<Width>(c.z)};
}

/// Place of a cell within a block of `Width` cells per axis.
template <int Width>
[[nodiscard]] constexpr unsigned int placeInTile(int x, int y, int z) noexcept
{
    return static_cast<unsigned int>((x * Width + y) * Width + z);
}

/// The cell at a place: the inverse of `placeInTile`.
template <int Width>
[[nodiscard]] constexpr Coordinate cellAtPlace(unsigned int place) noexcept
{
    constexpr unsigned int w = Width;
    return {static_cast<int>(place / (w * w)), static_cast<int>(place / w % w), static_cast<int>(place % w)};
}

} // namespace VLD::TileTree3D
