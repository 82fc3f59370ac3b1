#pragma once

#include <veldrin/geometry/Export.h>
#include <veldrin/object/Object.h>

/// What a proxy of a volume's component stands for, as a plain object: the form in which a file holds it.
///
///     Veldrin::Object description;
///     if (Veldrin::Geometry::describeVldProxy(*proxy, description))
///         auto origins = getPropertyAs<Nexil::Ptr<Nexil::Array<Math::int3>>>(description, "leaf_origins");
namespace Veldrin::Geometry {

/// Fills `description`, which is empty, for a proxy; false, and nothing filled, for any other object and for a proxy without
/// a component of its kind.
///
/// A description is a geo property of the kind that the proxy plays. Besides it has the component's kind ("voxel_topology",
/// "point_topology", "container", "channel") under "vld_component", its "name", and what it holds beyond that:
/// - a topology "voxelTileWidth", "voxelTileDataWidth", "voxelOffsetType", "voxelInnerLevels" and its tiles: "leaf_origins",
///   "leaf_parents", "inner_origins" and "inner_children", or "leaf_origins" and "offsets" of points;
/// - a container "topology", the name that it refers to, and "voxelSize"; its "indices" are empty, as they only count up;
/// - a channel its configuration, as a topology, and "container", the name that it belongs to.
/// Cost: constant; arrays of voxels and tiles are shared, not copied.
[[nodiscard]] VELDRIN_API bool describeVldProxy(Object const& proxy, Object& description);

} // namespace Veldrin::Geometry
