#pragma once

#include <nexil/Array.h>
#include <veldrin/geometry/Export.h>
#include <veldrin/object/Object.h>

/// What is wrong with a mesh, element by element.
///
///     auto const found = Geometry::Mesh::diagnose(*mesh);
///     if (found == Geometry::Mesh::Diagnostic{})
///         ... // clean
namespace Veldrin::Geometry::Mesh {

/// Elements that failed a check of `diagnose`, in increasing order. All five empty: nothing was found.
struct Diagnostic {
    /// Points at which no edge ends: no face uses them, or only as a repeated corner.
    Nexil::Array<unsigned int> isolatedPoints;
    /// Faces of fewer than three corners, with a repeated corner, or with an index out of range.
    Nexil::Array<unsigned int> degenerateFaces;
    /// Faces that are not degenerate and whose normal `computeMeshFaceNormals` falls back to (0, 1, 0): their area vector,
    /// in single precision, is not longer than 1.1754944e-38 or no number.
    Nexil::Array<unsigned int> zeroAreaFaces;
    /// Faces with an edge that three or more faces use.
    Nexil::Array<unsigned int> nonManifoldFaces;
    /// Faces with an edge that two faces use and both run in the same direction.
    Nexil::Array<unsigned int> inconsistentFaces;

    friend bool operator==(Diagnostic const&, Diagnostic const&) = default;
};

/// Looks through a mesh; what makes an edge is told at `HalfEdgeDataStructure`.
///
/// An object that is no mesh, or whose "point_position", "face_vertex" or "face_offset" is missing or shorter than its
/// counts ask for, gives an empty record. Borders are no fault and are not reported.
/// Cost:    that of the edge table and one pass over faces and points, and a second one over the faces where edges are at
///          fault; memory one byte a point and a face besides.
/// Errors:  std::bad_alloc; std::runtime_error when the job is cancelled.
/// Threads: parallel, the same for every thread count; safe to run at once on one mesh.
[[nodiscard]] VELDRIN_API Diagnostic diagnose(Object const& mesh);

} // namespace Veldrin::Geometry::Mesh
