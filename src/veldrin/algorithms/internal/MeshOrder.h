#pragma once

#include <veldrin/algorithms/internal/MeshFaces.h>

namespace Veldrin::Geometry {

/// How a mesh lies in memory, by which algorithms choose between ways that give the same results.
struct MeshOrder {
    bool isByFace = false;  ///< faces share points with the next one more often than chance has it
    bool isByPoint = false; ///< most faces have points with near numbers
    bool isLocal = false;   ///< and these are near those of the next face: runs of faces keep to runs of points
};

/// Judges by a few faces, spread over the mesh. Constant cost.
[[nodiscard]] MeshOrder judgeOrder(MeshFaces const& faces) noexcept;

} // namespace Veldrin::Geometry
