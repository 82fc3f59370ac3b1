#pragma once

#include <nexil/Array.h>
#include <nexil/Ptr.h>
#include <veldrin/geometry/Export.h>
#include <veldrin/math/Vector.h>
#include <veldrin/object/Object.h>

/// Turning an object into a geometry: a mesh, a point cloud, strands, a volume or instances.
///
///     using namespace Veldrin;
///     auto positions = Nexil::makePtr<Nexil::Array<Math::float3>>(
///         Nexil::Array<Math::float3>{{0, 0, 0}, {1, 0, 0}, {0, 1, 0}});
///     auto corners = Nexil::makePtr<Nexil::Array<unsigned int>>(Nexil::Array<unsigned int>{0, 1, 2});
///     auto offsets = Nexil::makePtr<Nexil::Array<unsigned int>>(Nexil::Array<unsigned int>{0, 3});
///     auto triangle = createObject();
///     Geometry::populateMesh(std::move(positions), std::move(corners), std::move(offsets), *triangle);
///
/// A geometry has components, which hold element counts, and data geo properties, which hold one value per element.
/// Offset arrays ("face_offset", "strand_offset") have one entry more than their component has elements: face f has the
/// corners face_vertex[face_offset[f]] up to face_vertex[face_offset[f + 1] - 1].
///
/// Properties that the object already has under the same names are replaced in their places; others stay.
/// Arrays are moved into the object: no element is copied, and a pointer that was moved in is empty afterwards. Indices
/// and offsets are not checked; validation does that.
/// Cost: the same for three points and for a billion. Errors: std::bad_alloc.
namespace Veldrin::Geometry {

/// An empty mesh: "point_component", "face_vertex_component", "face_component" with count 0, "point_position" (float3,
/// default 0), "face_vertex" and "face_offset" (unsigned int, default `kInvalidIndex`). "face_offset" holds one 0.
VELDRIN_API void populateMesh(Object& mesh);

/// A mesh from its arrays.
///
/// Returns false, and leaves the object untouched, when an array is null or empty, or longer than 32-bit counts reach.
VELDRIN_API bool populateMesh(Nexil::Ptr<Nexil::Array<Math::float3>> positions,
                              Nexil::Ptr<Nexil::Array<unsigned int>> faceVertex,
                              Nexil::Ptr<Nexil::Array<unsigned int>> faceOffset, Object& mesh);

/// An empty point cloud: "point_component" and "point_position" (float3, default 0).
VELDRIN_API void populatePointCloud(Object& pointCloud);

/// A point cloud from its positions; false, and the object untouched, as for a mesh.
VELDRIN_API bool populatePointCloud(Nexil::Ptr<Nexil::Array<Math::float3>> positions, Object& pointCloud);

/// Empty strands: "point_component", "strand_component", "point_position" (float3, default 0) and "strand_offset"
/// (unsigned int, default `kInvalidIndex`), which holds one 0.
VELDRIN_API void populateStrand(Object& strand);

/// Strands from their arrays; false, and the object untouched, as for a mesh.
VELDRIN_API bool populateStrand(Nexil::Ptr<Nexil::Array<Math::float3>> positions,
                                Nexil::Ptr<Nexil::Array<unsigned int>> strandOffset, Object& strand);

/// An empty volume: "voxel_component", and the range "voxel_tile_tree" that targets it.
VELDRIN_API void populateVolume(Object& volume);

/// An empty volume with "voxel_signed_distance" (float, default 0), which targets "voxel_tile_tree".
VELDRIN_API void populateLevelSet(Object& levelSet);

/// An empty volume with "voxel_fog_density" (float, default 0), which targets "voxel_tile_tree".
VELDRIN_API void populateFogVolume(Object& fogVolume);

/// "instance_shape": data of `Ptr<Object>` elements, empty and without a target. It is what instances are recognised by;
/// whoever fills it says what it targets.
VELDRIN_API void populateInstances(Object& instances);

/// A cube around the origin: 8 points, 6 quads, counter-clockwise from outside, and one normal per face:
/// "face_vertex_normal" with six values, shared out to the 24 corners by "face_vertex_normal_index".
///
/// size: length of an edge.
VELDRIN_API void populateCubeMesh(float size, Object& mesh);

/// A square in the plane y = 0 around the origin, facing +y: rows of quads from +z to -z, in each from -x to +x.
///
/// size:         length of the square's side.
/// subdivisions: quads along a side; 0 counts as 1.
/// Returns false, and leaves the object untouched, for more than 32767 subdivisions: corners would not fit 32 bits.
/// Cost: linear in the quads, parallel. Errors: std::bad_alloc; std::runtime_error when the job is cancelled.
/// Threads: same bits for every thread count.
VELDRIN_API bool populatePlaneMesh(float size, unsigned int subdivisions, Object& mesh);

/// A coarse sphere around the origin: 22 points, 15 quads and 10 triangles, with "point_normal".
///
/// radius: a negative one turns the sphere inside out; its normals still point away from the surface as drawn.
VELDRIN_API void populateSphereMesh(float radius, Object& mesh);

} // namespace Veldrin::Geometry
