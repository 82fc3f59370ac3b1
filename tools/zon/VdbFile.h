#pragma once

#include "ZonFile.h"

#include <nexil/Array.h>
#include <nexil/Ptr.h>
#include <veldrin/math/Vector.h>
#include <veldrin/object/Object.h>

#include <cstddef>
#include <string>
#include <vector>

/// Volumes from and to files of OpenVDB, which alone is behind this header. Where the program was built without it, every
/// function throws a Failure that says so.
namespace Zon {

/// What was taken from a file, and what was left out, one text each.
struct VdbVolumes {
    Objects objects;
    std::vector<std::string> leftOut;
};

/// One object per grid of float, double, int, bool or vec3s values, in small tiles; the grid's name is its "name".
///
/// A level set becomes "voxel_signed_distance", a fog volume "voxel_fog_density", any other grid its own name behind
/// "voxel_". Voxels keep their coordinates. The grid's transform is kept as "vdb_transform" (x, y, z of the centre of its
/// voxel 0, 0, 0, and the voxel size) where that is another than the centre of ours. Which values are active follows from
/// them (all but the background, and its negative in a level set); where it does not, a bool channel "..._active" tells.
/// Grids of other types and trees of another shape, and those whose transform is not one positive scale and a translation,
/// are left out. So are grids in which regions of one value cover too many blocks of 8 x 8 x 8 voxels, each of which becomes
/// a tile: 2^21 are taken for all grids of a file, and 64 more for every block of voxels of their own.
/// Errors: Failure with the file's name and the reason.
[[nodiscard]] VdbVolumes readVdb(std::string const& path);

/// How many grids were written, and what was left out, one text each.
struct VdbReport {
    std::size_t gridCount = 0;
    std::vector<std::string> leftOut;
};

/// Every channel of those five types in every volume as a grid; the inverse of `readVdb`.
///
/// Writes no file when there is no grid. Errors: Failure.
[[nodiscard]] VdbReport writeVdb(Objects const& objects, std::string const& path);

/// The level set of a closed surface of triangles: distances up to `halfBand` voxels to each side.
///
/// triangles: three indices each, into the positions.
/// Errors: Failure with the reason, also, before it is tried, for more voxels than the memory of the machine holds.
[[nodiscard]] Nexil::Ptr<Veldrin::Object> levelSetOfMesh(Nexil::Array<Veldrin::Math::float3> const& positions,
                                                         Nexil::Array<unsigned int> const& triangles, float voxelSize,
                                                         float halfBand);

} // namespace Zon
