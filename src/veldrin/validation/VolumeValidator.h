#pragma once

#include <veldrin/validation/GeoValidator.h>

namespace Veldrin::Geometry {

/// Judges volumes: the object is of the volume prototype, converts to a volume of the volume library, and where that has a
/// topology "voxel_component" with a container "voxel_tile_tree", of either configuration, the container is consistent.
///
/// Every failure is "Object is not a valid volume". `GeoValidator` is not asked.
/// Cost: linear in the tiles, parallel; voxels are not read and nothing is copied.
class VELDRIN_API VolumeValidator : public GeoValidator {
public:
    [[nodiscard]] Status validate(Object const& object) override;
    [[nodiscard]] Nexil::Array<Failure> findFailures(Object const& object) const;
};

} // namespace Veldrin::Geometry
