#pragma once

#include <nexil/Array.h>
#include <nexil/Ptr.h>
#include <nexil/String.h>
#include <veldrin/geometry/Export.h>
#include <veldrin/object/Object.h>

/// Prototypes: one empty example of each kind of geometry and of geo property. An object is of a kind when it holds
/// everything that the kind's prototype holds:
///
///     if (Object::isA(*object, *Geometry::getMeshPrototype()))
///         ... // "point_position" holds float3, "face_vertex" and "face_offset" unsigned int, and so on
///
/// All prototypes are built together at the first question and shared from then on; nobody writes them, a writer works
/// on a copy of its own.
/// Cost: copying a pointer. Errors: std::bad_alloc from the first question.
/// Threads: safe from any thread, the first question included.
namespace Veldrin::Geometry {

/// The prototypes of volume, instances, mesh, strand and point cloud, in this order.
[[nodiscard]] VELDRIN_API Nexil::Ptr<Nexil::Array<Nexil::Ptr<Object>>> getGeometryTypes();

[[nodiscard]] VELDRIN_API Nexil::Ptr<Object> getVolumePrototype();
[[nodiscard]] VELDRIN_API Nexil::Ptr<Object> getInstancesPrototype();
[[nodiscard]] VELDRIN_API Nexil::Ptr<Object> getMeshPrototype();
[[nodiscard]] VELDRIN_API Nexil::Ptr<Object> getStrandPrototype();
[[nodiscard]] VELDRIN_API Nexil::Ptr<Object> getPointCloudPrototype();
[[nodiscard]] VELDRIN_API Nexil::Ptr<Object> getLevelSetPrototype();
[[nodiscard]] VELDRIN_API Nexil::Ptr<Object> getFogVolumePrototype();

/// A component: "count" (unsigned int).
[[nodiscard]] VELDRIN_API Nexil::Ptr<Object> getComponentGeoPropPrototype();

/// A range: "indices", "target" and "depends_on".
[[nodiscard]] VELDRIN_API Nexil::Ptr<Object> getRangeGeoPropPrototype();

/// What data stored under `name` has to be.
///
/// The data geo property of that name of the first of the five geometry prototypes that declares it, with its element
/// type and default. For any other name, and for "generic_data_geo_property", the generic one, which accepts every
/// element type: its "data" is a pointer to an array of `Any`, its "default" an empty value. The empty name has an equal
/// one of its own.
[[nodiscard]] VELDRIN_API Nexil::Ptr<Object> getDataGeoPropPrototype(Nexil::String const& name);

/// Gives all prototypes up, as a host does before it unloads the library; those that callers hold live on. The next
/// question builds new ones.
///
/// Threads: not while another thread asks for a prototype.
VELDRIN_API void clearGeometryPrototypes();

} // namespace Veldrin::Geometry
