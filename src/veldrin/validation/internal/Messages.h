#pragma once

#include <veldrin/validation/GeoValidator.h>

#include <optional>

/// Failures with their exact texts.
namespace Veldrin::Geometry::Internal {

using Failure = GeoValidator::Failure;
using ErrorCode = GeoValidator::ErrorCode;

/// kind: "mesh", "point cloud", "strand" or "volume".
[[nodiscard]] inline Failure notOfKind(char const* kind)
{
    return {{}, {ErrorCode::InvalidObject, Nexil::String("Object is not a valid ") + kind}};
}

[[nodiscard]] inline Failure invalidField(Nexil::String const& property, char const* field)
{
    return {property, {ErrorCode::InvalidProperty, property + " contains an invalid property " + field}};
}

/// What is too short is mostly the property itself.
[[nodiscard]] inline Failure tooFewElements(Nexil::String const& property, Nexil::String const& what)
{
    return {property, {ErrorCode::InvalidElementCount, what + " has an invalid number of elements"}};
}

/// holder: whose indices are wrong.
[[nodiscard]] inline Failure invalidIndex(Nexil::String const& property, Nexil::String const& holder,
                                          Nexil::String const& target)
{
    return {property, {ErrorCode::InvalidIndex, holder + " contains an invalid index into " + target}};
}

[[nodiscard]] inline Failure missingTarget(Nexil::String const& property)
{
    return {property, {ErrorCode::MissingTarget, property + " has no target"}};
}

[[nodiscard]] inline Failure invalidTarget(Nexil::String const& property, Nexil::String const& target)
{
    return {property, {ErrorCode::InvalidTarget, property + " has an invalid target " + target}};
}

[[nodiscard]] inline Failure targetsItself(Nexil::String const& property)
{
    return {property, {ErrorCode::InvalidTarget, property + " target itself"}};
}

} // namespace Veldrin::Geometry::Internal
