#include "MeshFindings.h"

#include <fmt/format.h>
#include <fmt/ranges.h>
#include <nlohmann/json.hpp>

#include <algorithm>
#include <vector>

namespace Zon {

namespace {

    using Veldrin::Geometry::Mesh::Diagnostic;

    constexpr FindingKind kFindingKinds[] = {
        {"isolated_points", "isolated point", "isolated points",
         "drop the points that no face uses, or build the faces they belong to", &Diagnostic::isolatedPoints},
        {"degenerate_faces", "degenerate face", "degenerate faces",
         "drop the faces of fewer than three corners or with a repeated one; they have neither area nor normal",
         &Diagnostic::degenerateFaces},
        {"zero_area_faces", "face without area", "faces without area",
         "merge points that lie in one place and drop the faces that collapse", &Diagnostic::zeroAreaFaces},
        {"non_manifold_faces", "face on an edge of three or more faces", "faces on edges of three or more faces",
         "split the points of such edges so that each joins two faces at most, or drop inner faces",
         &Diagnostic::nonManifoldFaces},
        {"inconsistent_faces", "face turned against a neighbour", "faces turned against neighbours",
         "reverse the corners of the faces on one side so that neighbours run along their edge in opposite directions",
         &Diagnostic::inconsistentFaces}};

    constexpr std::uint64_t kMostShown = 10;

    std::vector<unsigned int> firstOf(Nexil::Array<unsigned int> const& elements)
    {
        return {elements.begin(), elements.begin() + std::min<std::uint64_t>(elements.size(), kMostShown)};
    }

} // namespace

std::span<FindingKind const> findingKinds()
{
    return kFindingKinds;
}

std::string findingText(FindingKind const& kind, Diagnostic const& found)
{
    auto const& elements = found.*kind.elements;
    return fmt::format("{} {}: {}{}", elements.size(), elements.size() == 1 ? kind.one : kind.many,
                       fmt::join(firstOf(elements), ", "), elements.size() > kMostShown ? ", ..." : "");
}

nlohmann::ordered_json findingJson(FindingKind const& kind, Diagnostic const& found)
{
    auto const& elements = found.*kind.elements;
    return {{"count", elements.size()}, {"first", firstOf(elements)}};
}

} // namespace Zon
