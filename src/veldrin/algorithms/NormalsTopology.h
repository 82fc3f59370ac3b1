#pragma once

#include <nexil/Array.h>
#include <nexil/RuntimeMessage.h>
#include <veldrin/geometry/Export.h>
#include <veldrin/object/Object.h>

/// Which corners at a point share a normal.
///
///     Nexil::Array<unsigned int> groups;
///     unsigned int groupCount = 0;
///     float const creaseRadians = 0.5f;
///     GeometryAlgorithms::computeMeshNormalsTopology(*mesh, {}, creaseRadians, groups, groupCount, nullptr);
namespace Veldrin::GeometryAlgorithms {

/// Puts the face-vertices of each point into groups that are bordered by the mesh's hard edges.
///
/// An edge is hard when no face lies across it; when the edge found across from it faces another one, as only where the
/// mesh is not manifold or not consistently oriented; when the normals on its two sides differ; and, where these are not
/// all known, when the angle between the unit normals of the two faces is not less than `maxAngle`. Every other edge is
/// smooth. Two face-vertices of a point are in one group when smooth edges at the point lead from one to the other.
///
/// normalIndices: per face-vertex, the normal that it has already; `kInvalidIndex`, or an entry that is missing, is not
///                known. The normals along an edge are those of its two face-vertices on either side.
/// maxAngle: radians. At 0 every edge that is not decided by normals is hard.
/// result: resized to the element count of "face_vertex_component"; the group of each face-vertex, `kInvalidIndex` for one
///         that belongs to no face. Groups are numbered from 0 in the order of their first face-vertex.
/// count:  number of groups.
/// services: hears nothing so far; may be null.
///
/// Both outputs are untouched where `buildFaceVertexAdjacency` gives false, or "point_position" is missing or shorter than
/// the points.
/// Errors: std::bad_alloc; std::runtime_error when the job is cancelled. Either leaves the outputs as they were.
/// Cost: that of the adjacency and of the face normals, and one pass in order. Temporary memory: theirs and their results.
/// Threads: same result for every thread count; safe to run at once on one mesh.
VELDRIN_API void computeMeshNormalsTopology(Object const& mesh, Nexil::Array<unsigned int> const& normalIndices,
                                            float maxAngle, Nexil::Array<unsigned int>& result, unsigned int& count,
                                            Nexil::RuntimeServices const* services);

} // namespace Veldrin::GeometryAlgorithms
