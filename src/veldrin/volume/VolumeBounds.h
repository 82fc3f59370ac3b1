#pragma once

#include <veldrin/geometry/Export.h>
#include <veldrin/math/BBox.h>
#include <veldrin/math/Vector.h>
#include <veldrin/object/Object.h>
#include <vld/Container.h>
#include <vld/Object.h>
#include <vld/VoxelTopology.h>

/// The box around what is in a volume.
///
/// The content is what has a "voxel_signed_distance" of at most 0, and what has a "voxel_fog_density" above 0; values that
/// are not numbers are none. A voxel contributes its whole cube, a cell without voxels the cube of all of its voxels. Corners
/// that no float hits are rounded outward: the box holds every cube, also far from zero, where floats lie many voxels apart.
/// Channels count that hold `float` or `double`, belong to the container, and have one value per element.
/// Cost: one pass over the tiles, parallel; values are only read where they could make the box larger.
/// Errors: std::bad_alloc; std::runtime_error when the job is cancelled. Threads: same bits for every thread count.
namespace Veldrin::GeometryAlgorithms {

/// Grows `box` by the content of the channels that belong to a container; true when the volume has any of the two.
///
/// topology: the one that the container stands on.
template <class Traits>
VELDRIN_API bool volumeBounds(VLD::Object const& volume, VLD::TileTree3D::Container<Traits> const& container,
                              VLD::TileTree3D::VoxelTopology<Traits> const& topology,
                              Math::bbox<Math::float3, float>& box);

/// Grows `box` by the content of a volume as geometry, over all of its containers. What is no volume leaves it untouched.
VELDRIN_API void getVolumeBounds(Object const& geometry, Math::bbox<Math::float3, float>& box);

} // namespace Veldrin::GeometryAlgorithms
