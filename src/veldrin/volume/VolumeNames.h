#pragma once

#include <nexil/String.h>
#include <veldrin/geometry/Export.h>
#include <veldrin/object/Object.h>

/// Names of the same property on objects of different kinds.
///
/// Properties of an object that has a "point_component" start with "point_", those of any other object, and of a volume,
/// with "voxel_". Mapping a name drops the prefix of the side it comes from, where the name has it, and puts the prefix of
/// the other side in front: "density" becomes "voxel_density", and "voxel_fog_density" on an object with points
/// "point_fog_density". There is no table of names.
/// Errors: std::bad_alloc. Threads: as of the objects.
namespace Veldrin {

/// The name on object `to` of what object `from` calls `name`.
[[nodiscard]] VELDRIN_API Nexil::String mapGeoPropertyName(Nexil::String const& name, Object const& from,
                                                           Object const& to);

/// The name on object `to` of what a volume calls `name`.
[[nodiscard]] VELDRIN_API Nexil::String mapGeoPropertyNameFromVLDVolume(Nexil::String const& name, Object const& to);

/// The name in a volume of what object `from` calls `name`.
[[nodiscard]] VELDRIN_API Nexil::String mapGeoPropertyNameToVLDVolume(Nexil::String const& name, Object const& from);

} // namespace Veldrin
