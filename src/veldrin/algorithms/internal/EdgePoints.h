#pragma once

#include <nexil/Array.h>
#include <veldrin/algorithms/HalfEdgeDataStructure.h>

namespace Veldrin::Geometry::Mesh {

/// One flag a point: whether any edge ends there.
[[nodiscard]] Nexil::Array<bool> pointsOnEdges(HalfEdgeDataStructure const& edges);

} // namespace Veldrin::Geometry::Mesh
