#pragma once

#include <nexil/Array.h>
#include <nexil/RuntimeMessage.h>
#include <veldrin/geometry/Export.h>
#include <veldrin/geometry/FaceEdge.h>
#include <veldrin/object/Object.h>

/// What lies around the points and across the edges of a mesh.
///
///     Nexil::Array<Geometry::Mesh::FaceEdge> adjacentEdges, pointFaces;
///     Nexil::Array<unsigned int> pointFaceIndex;
///     if (GeometryAlgorithms::buildFaceVertexAdjacency(*mesh, adjacentEdges, pointFaces, pointFaceIndex, nullptr))
///         for (unsigned int i = pointFaceIndex[p]; i < pointFaceIndex[p + 1]; ++i)
///             ... // corner pointFaces[i].corner of face pointFaces[i].face is at point p
namespace Veldrin::GeometryAlgorithms {

/// Finds the face-vertices at each point, and across each edge of a face the edge of the face on the other side.
///
/// The mesh has V face-vertices: the element count of "face_vertex_component", or the last of "face_offset" where that is
/// less.
///
/// adjacentEdges:  V entries. For the edge that runs from a face-vertex to the next of its face, the edge that runs between
///                 the same two points the other way in another face; of several the one of the lowest face, then of the
///                 lowest corner. `kInvalidIndex` for a face where there is none: on a border, where all other faces run
///                 along the edge in the same direction, and for an edge from a point to itself.
/// pointFaces:     V entries, the face-vertices point by point, each point's in increasing order.
/// pointFaceIndex: as many entries as points, and one: those of point p are pointFaces[pointFaceIndex[p]] up to, not with,
///                 pointFaces[pointFaceIndex[p + 1]].
/// services: hears nothing so far; may be null.
///
/// False, and all outputs untouched, when "face_offset" or "face_vertex" is missing or shorter than the counts ask for,
/// when offsets fall or do not begin at 0, or when a face-vertex names a point beyond "point_component".
/// Errors: std::runtime_error when the job is cancelled leaves the outputs as they were, and so does std::bad_alloc but
/// where one of them had room for its result already: then it may hold unfinished values.
/// Cost: linear in face-vertices and points, n log n in the face-vertices at one point, parallel. Storage that the outputs
/// already have is used again.
/// Temporary memory: for each thread 4 bytes a point, but beyond one thread no more than 12 bytes a face-vertex in all; 32
/// bytes for each face-vertex at one point while that point has more than 16.
/// Threads: same result for every thread count; safe to run at once on one mesh.
[[nodiscard]] VELDRIN_API bool buildFaceVertexAdjacency(Object const& mesh,
                                                        Nexil::Array<Geometry::Mesh::FaceEdge>& adjacentEdges,
                                                        Nexil::Array<Geometry::Mesh::FaceEdge>& pointFaces,
                                                        Nexil::Array<unsigned int>& pointFaceIndex,
                                                        Nexil::RuntimeServices const* services);

} // namespace Veldrin::GeometryAlgorithms
