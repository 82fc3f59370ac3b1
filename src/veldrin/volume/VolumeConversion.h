#pragma once

#include <nexil/Ptr.h>
#include <veldrin/geometry/Export.h>
#include <veldrin/object/Object.h>
#include <vld/Object.h>

/// From volumes of the volume library to geometry, and back.
///
///     auto geometry = Veldrin::Geometry::move_vld_volume_to_object(*volume);
///     Veldrin::Object::isA(*geometry, *Veldrin::Geometry::getVolumePrototype()); // with the names that grids have
///     auto same = Veldrin::Geometry::move_object_to_vld_volume(*geometry);
///
/// As geometry, each component of a volume is a proxy under the component's own name: a topology plays the component, a
/// container the range that targets it, a channel the data that targets the container. Nothing is copied either way: the
/// proxies hold the components.
/// Cost: by the number of components; the same for ten voxels and for a billion. Errors: std::bad_alloc.
/// Threads: one volume or object is converted by one thread at a time.
namespace Veldrin::Geometry {

/// The geometry of a volume, which is empty afterwards.
///
/// An empty volume, and one that is not `validUpdatedVolume`, is cleared and gives an empty object.
/// Null, and the volume untouched, when a component would have no place in the geometry: a container without a topology of
/// its configuration and name, a channel without such a container or point topology, a component of unknown kind.
/// A cancelled job gives an empty object, and the volume is untouched.
[[nodiscard]] VELDRIN_API Nexil::MutablePtr<Object> move_vld_volume_to_object(VLD::Object& volume);
[[nodiscard]] VELDRIN_API Nexil::Ptr<Object> move_vld_volume_to_object_const(VLD::Object& volume);

/// The volume of a geometry, which has no properties afterwards, also none of those that are no part of the volume.
///
/// An object without properties, and a volume as `populateVolume`, `populateLevelSet` and `populateFogVolume` make it,
/// gives an empty volume.
/// Null, and the object untouched, for any other object without a topology proxy, and when a proxy holds no component, one
/// of another kind or configuration than its target's, is attached to nothing, or when two components have one name.
/// Errors: std::runtime_error when the job is cancelled.
[[nodiscard]] VELDRIN_API Nexil::MutablePtr<VLD::Object> move_object_to_vld_volume(Object& object);
[[nodiscard]] VELDRIN_API Nexil::Ptr<VLD::Object> move_object_to_vld_volume_const(Object& object);

/// The same volume, sharing its components with the object, which is left as it is.
[[nodiscard]] VELDRIN_API Nexil::Ptr<VLD::Object> shallow_copy_object_to_vld_volume(Object const& object);

} // namespace Veldrin::Geometry
