#pragma once

#include <nexil/Array.h>
#include <veldrin/geometry/Export.h>
#include <veldrin/math/Vector.h>
#include <veldrin/object/Object.h>

#include <cstdint>

/// Unit normals of faces and of points.
///
///     Nexil::Array<Math::float3> normals;
///     GeometryAlgorithms::computeMeshVertexNormals(*mesh, true, false, normals); // weighted by corner angles
///
/// Positions and arithmetic are in single precision, each sum in one fixed order. What has no normal gets (0, 1, 0): a
/// face of fewer than three corners, a face that names a point beyond the positions, and any vector not longer than
/// 1.1754944e-38. Lengths are taken in single precision too: area vectors from 1.8e19 on (edges of some 4e9) overflow, and
/// such normals, like those of points that are not finite, may be zero or no number.
/// Outputs are untouched when "face_offset", "face_vertex" or "point_position" is missing or shorter than the counts of
/// the components ask for. Where offsets fall, which no valid mesh's do, a face begins behind those before it.
/// Errors: std::runtime_error when the job is cancelled leaves the output as it was, and so does std::bad_alloc but where
/// the output had room for the result already: then it may hold unfinished values.
/// Threads: same bits for every thread count; safe to run at once on one mesh.
namespace Veldrin::GeometryAlgorithms {

/// From this many points on, vertex normals are computed in parallel.
inline constexpr std::uint64_t kParallelMeshVertexNormalsThreshold = 16384;

/// Computes one unit normal per face: the direction of the vector sum over the face's fan of triangles, so that concave
/// and non-planar polygons get the normal of their area vector.
///
/// normals: resized to the element count of "face_component"; storage that it already has is used again.
/// Cost: one pass over the corners, parallel from 1025 faces on; no temporary memory.
VELDRIN_API void computeMeshFaceNormals(Object const& mesh, Nexil::Array<Math::float3>& normals);

/// Computes one unit normal per point: the direction of the sum of the unit normals of the faces around it, each times a
/// weight of 1, of the face's area, of the angle of the face's corner at the point (radians), or of both. A point used
/// twice by a face counts twice; a point without a face gets (0, 1, 0).
///
/// angleWeighted: weights by angle (G. Thuermer, C. A. Wuethrich, "Computing Vertex Normals from Polygonal Facets", 1998).
///                Angles are within 4 units in the last place of the arc cosine of the same cosine.
/// areaWeighted:  weights by area.
/// normals: resized to the element count of "point_component"; storage that it already has is used again.
/// Cost: one pass over the corners; parallel from `kParallelMeshVertexNormalsThreshold` points on. Where neighbours have near
/// numbers, as in most meshes, each thread then adds for a part of the faces and for points of its own; elsewhere one adds
/// what the others compute, or each of more than four goes over all corners for its own points.
/// Temporary memory: for each thread 20 bytes a corner of 64 faces when weighted by angle, otherwise none. On more than one
/// thread besides 2 bytes for 32 points and 8 bytes for 1024 faces, or, where threads do not add for their own points, 12
/// bytes a face and 4 bytes a corner when weighted by angle: for 32768 faces, or for all with more than four threads.
VELDRIN_API void computeMeshVertexNormals(Object const& mesh, bool angleWeighted, bool areaWeighted,
                                          Nexil::Array<Math::float3>& normals);

} // namespace Veldrin::GeometryAlgorithms
