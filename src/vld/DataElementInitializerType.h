#pragma once

namespace VLD::TileTree3D {

/// How a channel's values are taken between its elements.
enum class DataElementInitializerType : unsigned int {
    DefaultValue = 0, ///< the channel's default
    Nearest = 1,      ///< the value of the nearest voxel
    Linear = 2,       ///< weighted between voxels
};

} // namespace VLD::TileTree3D
