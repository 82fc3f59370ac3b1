#pragma once

#include <veldrin/geometry/Export.h>
#include <vld/Object.h>

namespace Veldrin::Geometry {

/// True when the first container of the volume has as many elements as the topology of its configuration and name, and all
/// channels that belong to it have as many as that. False when there is no such topology; true without any container.
///
/// Cost: by the number of components.
[[nodiscard]] VELDRIN_API bool validUpdatedVolume(VLD::Object const& volume);

/// The same; on request prints each difference to standard output, as lines of names and numbers of elements.
[[nodiscard]] VELDRIN_API bool validUpdatedVolume(VLD::Object const& volume, bool print);

} // namespace Veldrin::Geometry
