#pragma once

#include <veldrin/algorithms/MeshDiagnostic.h>

#include <nlohmann/json_fwd.hpp>

#include <span>
#include <string>

/// What a diagnosis of a mesh found, as reports tell it.
namespace Zon {

struct FindingKind {
    char const* key; ///< in JSON
    char const* one; ///< for people
    char const* many;
    char const* remedy; ///< what a person can do about it, in one line
    Nexil::Array<unsigned int> Veldrin::Geometry::Mesh::Diagnostic::*elements;
};

/// All kinds, in the order in which reports list them.
[[nodiscard]] std::span<FindingKind const> findingKinds();

/// "3 isolated points: 5, 8, 9", with the first ten.
[[nodiscard]] std::string findingText(FindingKind const& kind, Veldrin::Geometry::Mesh::Diagnostic const& found);

/// "count" and "first", of at most ten.
[[nodiscard]] nlohmann::ordered_json findingJson(FindingKind const& kind,
                                                 Veldrin::Geometry::Mesh::Diagnostic const& found);

} // namespace Zon
