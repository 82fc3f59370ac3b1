#pragma once

#include <veldrin/geometry/Names.h>

namespace Veldrin::Geometry::Mesh {

/// One edge of a face: the face, and the corner within it that the edge starts from. Names no edge by default.
struct FaceEdge {
    /// `kInvalidIndex` when there is no such edge, as beyond a border.
    unsigned int face = kInvalidIndex;
    unsigned int corner = 0;

    friend constexpr bool operator==(FaceEdge const&, FaceEdge const&) = default;
};

} // namespace Veldrin::Geometry::Mesh
