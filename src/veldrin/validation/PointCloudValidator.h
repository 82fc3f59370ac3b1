#pragma once

#include <veldrin/validation/GeoValidator.h>

namespace Veldrin::Geometry {

/// Judges point clouds: the object is of the point cloud prototype, and all geo properties pass `GeoValidator`.
class VELDRIN_API PointCloudValidator : public GeoValidator {
public:
    [[nodiscard]] Status validate(Object const& object) override;
    [[nodiscard]] Nexil::Array<Failure> findFailures(Object const& object) const;
};

} // namespace Veldrin::Geometry
