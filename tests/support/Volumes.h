#pragma once

#include <support/Threads.h>

#include <nexil/Array.h>
#include <vld/Coordinates.h>
#include <vld/Traits.h>
#include <vld/VoxelTopology.h>

#include <gtest/gtest.h>

#include <cstring>

/// Builders and readers of volumes for tests.
namespace support {

using VLD::TileTree3D::Coordinate;

/// Typed tests over both configurations.
using BothConfigurations = ::testing::Types<VLD::TileTree3D::SmallTiles, VLD::TileTree3D::WideTiles>;

/// Calls visit(coordinate) for every voxel of a box.
template <class Visit>
void forEachVoxel(Coordinate const& origin, Coordinate const& size, Visit const& visit)
{
    for (int x = 0; x < size.x; ++x)
        for (int y = 0; y < size.y; ++y)
            for (int z = 0; z < size.z; ++z)
                visit(origin + Coordinate{x, y, z});
}

template <class T>
bool sameBytes(Nexil::Array<T> const& a, Nexil::Array<T> const& b)
{
    return a.size() == b.size() && (a.empty() || std::memcmp(a.data(), b.data(), a.size() * sizeof(T)) == 0);
}

inline bool sameTiles(VLD::TileTree3D::SharedTileLevels const& a, VLD::TileTree3D::SharedTileLevels const& b)
{
    return sameBytes(*a.leafOrigins, *b.leafOrigins) && sameBytes(*a.leafParents, *b.leafParents) &&
           sameBytes(*a.innerOrigins, *b.innerOrigins) && sameBytes(*a.innerChildren, *b.innerChildren);
}

/// Tiles of more elements than 32 bits count, in memory that nobody writes and that is therefore never taken.
inline Nexil::Ptr<VLD::TileTree3D::VoxelTopology<VLD::TileTree3D::WideTiles>> hugeTopology()
{
    using namespace VLD::TileTree3D;
    TileLevels levels;
    Nexil::Internal::resizeUninitialized(levels.leafOrigins, kNoElement / WideTiles::kLeafVoxels + 1);
    Nexil::Internal::resizeUninitialized(levels.leafParents, levels.leafOrigins.size());
    return Nexil::makePtr<VoxelTopology<WideTiles>>("huge", std::move(levels));
}

/// The tiles of a topology, copied, so that they can be changed.
template <class Traits>
VLD::TileTree3D::TileLevels tilesOf(VLD::TileTree3D::VoxelTopology<Traits> const& topology)
{
    return {topology.leafOrigins(), topology.leafParents(), topology.innerOrigins(), topology.innerChildren()};
}

} // namespace support
