#pragma once

#include <veldrin/validation/GeoValidator.h>

#include <cstdint>
#include <optional>

namespace Veldrin::Geometry::Internal {

/// What is wrong with the offsets that the geo property `name` holds over its component: one more than the component
/// counts, the first 0, none less than the one before, none above `elementCount`.
[[nodiscard]] std::optional<GeoValidator::Failure> offsetFailure(Object const& geometry, char const* name,
                                                                 std::uint64_t elementCount);

} // namespace Veldrin::Geometry::Internal
