#pragma once

#include <nexil/Array.h>
#include <nexil/Ptr.h>
#include <veldrin/geometry/Export.h>
#include <veldrin/object/Object.h>

/// Carries a selection from one component of a geometry over to another.
///
///     bool success = false;
///     auto faces = Geometry::pointsToFaces(mesh, pointMask, Geometry::TagConversionStyle::AllElements, &success);
///
/// A selection is a mask: one flag per element. Every function here takes a mask over its source component and gives a new
/// one over its destination component, as large as that component counts elements.
///
/// mask:    may be of any size; missing flags count as false, surplus ones are ignored.
/// success: when not null, receives whether the topology arrays that the conversion needs are there; where they are not,
///          the result is all false.
/// Ranges that run beyond their index array are cut off there; indices beyond the destination are dropped.
/// Cost: one pass over the topology that it reads, parallel from 1025 elements on; no memory but the result. Where offsets
/// fall, so that ranges overlap, two more passes in order, n log n in the ranges, and 8 bytes for each flag of the mask or
/// corner that is looked at, or 16 for each selected range.
/// Errors: std::bad_alloc, and std::runtime_error when the job is cancelled.
/// Threads: same result for every thread count; safe to run at once on one geometry.
namespace Veldrin::Geometry {

/// When several source elements make up one destination element: whether one of them is enough. Any value but 1 reads as
/// AnyElement. An element that no source element belongs to is never selected.
enum class TagConversionStyle : unsigned int {
    AnyElement = 0, ///< one selected source element selects it
    AllElements = 1 ///< only all of its source elements together do
};

/// Faces with any or all of their corners selected.
[[nodiscard]] VELDRIN_API Nexil::Ptr<Nexil::Array<bool>>
faceVerticesToFaces(Object const& geometry, Nexil::Array<bool> const& mask, TagConversionStyle style, bool* success);

/// Points of selected corners.
[[nodiscard]] VELDRIN_API Nexil::Ptr<Nexil::Array<bool>>
faceVerticesToPoints(Object const& geometry, Nexil::Array<bool> const& mask, bool* success);

/// Corners of selected faces.
[[nodiscard]] VELDRIN_API Nexil::Ptr<Nexil::Array<bool>>
facesToFaceVertices(Object const& geometry, Nexil::Array<bool> const& mask, bool* success);

/// Points of selected faces.
[[nodiscard]] VELDRIN_API Nexil::Ptr<Nexil::Array<bool>> facesToPoints(Object const& geometry,
                                                                       Nexil::Array<bool> const& mask, bool* success);

/// Corners at selected points.
[[nodiscard]] VELDRIN_API Nexil::Ptr<Nexil::Array<bool>>
pointsToFaceVertices(Object const& geometry, Nexil::Array<bool> const& mask, bool* success);

/// Faces with any or all of their points selected.
[[nodiscard]] VELDRIN_API Nexil::Ptr<Nexil::Array<bool>>
pointsToFaces(Object const& geometry, Nexil::Array<bool> const& mask, TagConversionStyle style, bool* success);

/// Strands with any or all of their points selected.
[[nodiscard]] VELDRIN_API Nexil::Ptr<Nexil::Array<bool>>
pointsToStrands(Object const& geometry, Nexil::Array<bool> const& mask, TagConversionStyle style, bool* success);

/// Points of selected strands.
[[nodiscard]] VELDRIN_API Nexil::Ptr<Nexil::Array<bool>> strandsToPoints(Object const& geometry,
                                                                         Nexil::Array<bool> const& mask, bool* success);

} // namespace Veldrin::Geometry
