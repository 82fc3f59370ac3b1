#pragma once

#include <veldrin/math/Vector.h>
#include <vld/Coordinates.h>

#include <cmath>

namespace VLD::TileTree3D::Internal {

/// The voxel that holds a position; false, and `voxel` untouched, for one outside the limits or not a number.
[[nodiscard]] inline bool voxelOfPoint(Veldrin::Math::double3 const& position, float voxelSize,
                                       Coordinate& voxel) noexcept
{
    double const size = voxelSize;
    double const x = std::floor(position.x / size);
    double const y = std::floor(position.y / size);
    double const z = std::floor(position.z / size);
    auto isInside = [](double v) { return v >= -kCoordinateLimit && v < kCoordinateLimit; };
    if (!isInside(x) || !isInside(y) || !isInside(z))
        return false;
    voxel = {static_cast<int>(x), static_cast<int>(y), static_cast<int>(z)};
    return true;
}

} // namespace VLD::TileTree3D::Internal
