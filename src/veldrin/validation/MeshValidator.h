#pragma once

#include <veldrin/validation/GeoValidator.h>

namespace Veldrin::Geometry {

/// Judges meshes. In this order:
///
/// 1. the object is of the mesh prototype;
/// 2. "point_position" holds at least as many positions as there are points;
/// 3. every entry of "face_vertex" is a point; `kInvalidIndex` is none;
/// 4. "face_offset" holds one entry more than there are faces, begins with 0, never falls and never exceeds the number of
///    face-vertices; the last entry may be less than that;
/// 5. all geo properties pass `GeoValidator`.
///
/// Cost: one pass over "face_vertex" and one over "face_offset", at the speed of memory; positions are not read.
class VELDRIN_API MeshValidator : public GeoValidator {
public:
    [[nodiscard]] Status validate(Object const& object) override;
    [[nodiscard]] Nexil::Array<Failure> findFailures(Object const& object) const;
};

/// What `MeshValidator` says of `mesh`.
[[nodiscard]] VELDRIN_API GeoValidator::Status validateMesh(Object const& mesh);

} // namespace Veldrin::Geometry
