#pragma once

#include <veldrin/algorithms/internal/MeshFaces.h>

#include <cstdint>

namespace Veldrin::Geometry::Mesh {

/// How many sets of points the faces connect; points of no face are sets of their own. Parallel, the same for every thread
/// count; a second pass under locks where threads got into each other's way. Memory: 4 bytes a point.
[[nodiscard]] std::uint64_t faceComponentCount(MeshFaces const& faces);

} // namespace Veldrin::Geometry::Mesh
