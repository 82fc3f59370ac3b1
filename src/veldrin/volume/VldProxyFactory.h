#pragma once

#include <veldrin/geometry/Export.h>
#include <veldrin/object/Object.h>

namespace Veldrin::Geometry {

/// Makes tile-tree components without tiles for the volume that `source` describes by ordinary properties, and stores their
/// proxies in `destination`, each under the name that its description has in `source`:
///
/// - a topology for each component, of the configuration that its "voxelTileWidth", "voxelTileDataWidth" and
///   "voxelOffsetType" name: (5, 5, 0), which is also what missing ones read as, or (2, 4, 0). With any other the component,
///   and what targets it, is passed over.
/// - a container for each property that targets such a component and is no data geo property, with its "voxelSize": any
///   number type; 1 where it is missing. One that is not finite and positive is passed over, with what targets it.
/// - a channel for each data geo property that targets such a container, with its "default", which gives the element type,
///   and its "interpolation_mode". One whose default is no plain value type is passed over.
///
/// Properties of `destination` under the same names are replaced; others stay.
/// Cost: by the number of properties of `source`. Errors: std::bad_alloc. Threads: as of the objects.
VELDRIN_API void vldProxyFactory(Object const& source, Object& destination);

} // namespace Veldrin::Geometry
