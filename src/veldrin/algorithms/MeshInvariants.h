#pragma once

#include <veldrin/algorithms/HalfEdgeDataStructure.h>
#include <veldrin/geometry/Export.h>
#include <veldrin/math/Vector.h>
#include <veldrin/object/Object.h>

/// Numbers that tell the shape of a mesh whatever its positions: how many pieces, holes and hollows it has.
///
///     Geometry::Mesh::HalfEdgeDataStructure const edges(*mesh);
///     int const chi = Geometry::Mesh::eulerCharacteristic(*mesh, edges); // 2 for a closed surface without handles
///
/// Points that no face uses count: each is a piece of its own. What counts as an edge stands at `HalfEdgeDataStructure`;
/// corners whose index is not below the element count of "point_component" are ignored. Counts are cut to 32 bits.
/// Cost:    that of the edge table, `connectedComponents` less; memory 12 to 24 bytes a point besides.
/// Errors:  std::bad_alloc; std::runtime_error when the job is cancelled. An object that is no mesh, or whose "face_offset"
///          or "face_vertex" is missing or shorter than its counts ask for, has the result that each function names.
/// Threads: parallel, the same for every thread count; safe to run at once on one mesh.
namespace Veldrin::Geometry::Mesh {

/// Points - edges + faces; 0 where there is no mesh.
[[nodiscard]] VELDRIN_API int eulerCharacteristic(Object const& mesh);

/// The same from an edge table of the same mesh that is there already.
[[nodiscard]] VELDRIN_API int eulerCharacteristic(Object const& mesh, HalfEdgeDataStructure const& edges);

/// Pieces: sets of points that faces connect. -1 where there is no mesh.
[[nodiscard]] VELDRIN_API int connectedComponents(Object const& mesh);

/// Pieces b0, independent loops b1 and hollows b2; (0, 0, 0) where there is no mesh.
///
/// b2 counts the pieces with faces but without a border, an edge that one face alone uses, where pieces are told apart by
/// their points; b1 is b0 + b2 - the Euler characteristic (Henri Poincare, "Analysis situs", 1895). Where two closed shells
/// share no more than a point they are one piece, and b1 can be negative: two cubes with a common corner have (1, -1, 1).
[[nodiscard]] VELDRIN_API Math::int3 bettiNumbers(Object const& mesh);

} // namespace Veldrin::Geometry::Mesh
