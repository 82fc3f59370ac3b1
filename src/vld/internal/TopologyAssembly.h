#pragma once

#include <nexil/Array.h>
#include <nexil/Ptr.h>
#include <nexil/String.h>
#include <vld/Coordinates.h>
#include <vld/Grid.h>
#include <vld/VoxelTopology.h>

#include <cstdint>

/// The steps that all builders share: from sorted leaf tiles to a topology.
namespace VLD::TileTree3D::Internal {

/// Sorts, and drops what comes twice.
void sortUnique(Nexil::Array<Coordinate>& coordinates);

/// The topology of the given leaf tiles, the inner tiles above them, and further inner tiles. All origins are aligned and
/// within the limits; leaf origins are increasing and unique.
/// Null when there are more elements than 32 bits count.
template <class Traits>
[[nodiscard]] Nexil::Ptr<VoxelTopology<Traits>> assembleTopology(Nexil::String name,
                                                                 Nexil::Array<Coordinate> leafOrigins,
                                                                 Nexil::Array<Coordinate> furtherInnerOrigins = {});

/// True when a grid can be made by it: no name empty or used twice, a voxel size that is finite and positive.
[[nodiscard]] bool isUsable(GridDescription const& description);

} // namespace VLD::TileTree3D::Internal
