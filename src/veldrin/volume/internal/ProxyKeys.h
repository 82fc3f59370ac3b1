#pragma once

/// What the properties of a component description are called, and the kinds of components. These texts are in files.
namespace Veldrin::Geometry::Internal {

inline constexpr char kKind[] = "vld_component";
inline constexpr char kName[] = "name";
inline constexpr char kTileWidth[] = "voxelTileWidth";
inline constexpr char kTileDataWidth[] = "voxelTileDataWidth";
inline constexpr char kOffsetType[] = "voxelOffsetType";
inline constexpr char kInnerLevels[] = "voxelInnerLevels";
inline constexpr char kLeafOrigins[] = "leaf_origins";
inline constexpr char kLeafParents[] = "leaf_parents";
inline constexpr char kInnerOrigins[] = "inner_origins";
inline constexpr char kInnerChildren[] = "inner_children";
inline constexpr char kOffsets[] = "offsets";
inline constexpr char kTopology[] = "topology";
inline constexpr char kVoxelSize[] = "voxelSize";
inline constexpr char kContainer[] = "container";

inline constexpr char kVoxelTopologyKind[] = "voxel_topology";
inline constexpr char kPointTopologyKind[] = "point_topology";
inline constexpr char kContainerKind[] = "container";
inline constexpr char kChannelKind[] = "channel";

} // namespace Veldrin::Geometry::Internal
