#pragma once

#include <nexil/Array.h>
#include <nexil/Export.h>
#include <veldrin/math/Vector.h>
#include <vld/Grid.h>

/// Points with radii as volumes: the union of spheres.
///
///     GridDescription description{.channelName = "voxel_signed_distance", .voxelSize = 0.1f};
///     auto grid = buildLevelSetFromPoints<SmallTiles>(description, positions, {0.5f}, 0.3f);
///
/// positions: in the unit of the voxel size.
/// radii:     one per point, or a single one for all of them. A point whose radius is not positive, or that is not finite in
///            all numbers, makes nothing.
/// Errors: an empty grid for a description with an empty or repeated name or a voxel size that is not finite and positive,
/// a band or falloff that is not, another number of radii, spheres beyond the coordinate limits, more elements than 32 bits
/// count, and spheres that touch more tiles than `kMostTouchedTiles`; this, and a sphere that alone has too many
/// elements, is told at once.
/// std::bad_alloc; std::runtime_error when the job is cancelled.
/// Cost: by the leaf tiles near each sphere's surface, and the cells and inner tiles inside of it; where spheres overlap, a
/// tile costs for each of them. Besides the grid itself, up to 32 bytes of temporary memory for each. Threads: parallel
/// inside; one result, bit for bit, for every number of threads.
namespace VLD::TileTree3D {

/// How many tiles spheres may touch, each counted for every sphere, as an average over where they may lie: about 8 GiB of
/// temporary memory. Spheres of radius 2 voxels touch some 28 each.
inline constexpr double kMostTouchedTiles = 1 << 28;

/// The distance to the nearest sphere's surface at the centre of each voxel, negative inside of any, cut off at -band and
/// band. Inside, where spheres overlap, it is the one to the sphere in which the voxel lies deepest. The default is band.
template <class Traits>
[[nodiscard]] VELDRIN_PLATFORM_API Grid<Traits>
buildLevelSetFromPoints(GridDescription const& description, Nexil::Array<Veldrin::Math::float3> const& positions,
                        Nexil::Array<float> const& radii, float band);

/// A density that rises from 0 at a sphere's surface to 1 at a depth of `falloff`; the largest where spheres overlap. The
/// default is 0.
template <class Traits>
[[nodiscard]] VELDRIN_PLATFORM_API Grid<Traits> buildFogFromPoints(GridDescription const& description,
                                                                   Nexil::Array<Veldrin::Math::float3> const& positions,
                                                                   Nexil::Array<float> const& radii, float falloff);

} // namespace VLD::TileTree3D
