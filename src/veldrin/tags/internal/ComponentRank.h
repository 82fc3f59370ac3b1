#pragma once

#include <nexil/String.h>
#include <veldrin/geometry/Names.h>

/// In which order components give way when selections of two of them meet: the lower one is carried over to the higher.
namespace Veldrin::Geometry {

enum class ComponentRank : signed char {
    None = 0, ///< of nothing that resolved
    Face = 1,
    FaceVertex = 2,
    Strand = 3,
    Point = 4
};

/// The component's name; "" for `None`.
[[nodiscard]] inline char const* componentOf(ComponentRank rank) noexcept
{
    char const* const names[] = {sNullString, sFaceComp, sFaceVertexComp, sStrandComp, sPointComp};
    return names[static_cast<int>(rank)];
}

/// `None` for every name that is not one of the four.
[[nodiscard]] inline ComponentRank rankOf(Nexil::String const& component) noexcept
{
    for (auto const rank :
         {ComponentRank::Face, ComponentRank::FaceVertex, ComponentRank::Strand, ComponentRank::Point})
        if (component == componentOf(rank))
            return rank;
    return ComponentRank::None;
}

} // namespace Veldrin::Geometry
