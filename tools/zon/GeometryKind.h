#pragma once

#include <veldrin/object/Object.h>

#include <string_view>

namespace Zon {

/// Kinds of geometry, the more particular ones first.
enum class GeometryKind { LevelSet, FogVolume, Volume, Instances, Mesh, Strands, PointCloud, None };

/// "level set", "mesh" and so on; "object" for none.
[[nodiscard]] std::string_view nameOf(GeometryKind kind);

/// The most particular kind that the object is.
[[nodiscard]] GeometryKind kindOf(Veldrin::Object const& object);

/// That, or the kind that an object which is of none was meant to be: the one that has a property it has too.
[[nodiscard]] GeometryKind intendedKindOf(Veldrin::Object const& object);

} // namespace Zon
