#pragma once

#include <vld/Traits.h>

namespace Veldrin::Geometry::Internal {

/// Calls visit.operator()<Traits>() for both configurations of the volume library, in the order in which kinds are tried.
template <class Visit>
void forEachConfiguration(Visit const& visit)
{
    visit.template operator()<VLD::TileTree3D::SmallTiles>();
    visit.template operator()<VLD::TileTree3D::WideTiles>();
}

} // namespace Veldrin::Geometry::Internal
