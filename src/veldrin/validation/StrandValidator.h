#pragma once

#include <veldrin/validation/GeoValidator.h>

namespace Veldrin::Geometry {

/// Judges strands: the object is of the strand prototype; "strand_offset" holds one entry more than there are strands,
/// begins with 0, never falls and never exceeds the number of points; all geo properties pass `GeoValidator`.
class VELDRIN_API StrandValidator : public GeoValidator {
public:
    [[nodiscard]] Status validate(Object const& object) override;
    [[nodiscard]] Nexil::Array<Failure> findFailures(Object const& object) const;
};

} // namespace Veldrin::Geometry
