#include <vld/internal/TopologyAssembly.h>

#include <nexil/parallel/Parallel.h>

#include <algorithm>
#include <cmath>

namespace VLD::TileTree3D::Internal {

namespace {

    namespace grain {
        constexpr std::size_t kTiles = 4096;
    } // namespace grain

    void dropRepeats(Nexil::Array<Coordinate>& sorted)
    {
        auto const* const end = std::unique(sorted.begin(), sorted.end());
        sorted.resize(static_cast<std::uint64_t>(end - sorted.begin()));
    }

} // namespace

void sortUnique(Nexil::Array<Coordinate>& coordinates)
{
    // Not by a pointer to the function, which would be called for every comparison.
    Nexil::parallel::sort(coordinates.begin(), coordinates.end(),
                          [](Coordinate const& a, Coordinate const& b) { return isBefore(a, b); });
    dropRepeats(coordinates);
}

bool isUsable(GridDescription const& description)
{
    auto const& [channel, voxelSize, initializer, topology, container] = description;
    return !channel.empty() && !topology.empty() && !container.empty() && channel != topology && channel != container &&
           topology != container && std::isfinite(voxelSize) && voxelSize > 0;
}

template <class Traits>
Nexil::Ptr<VoxelTopology<Traits>> assembleTopology(Nexil::String name, Nexil::Array<Coordinate> leafOrigins,
                                                   Nexil::Array<Coordinate> furtherInnerOrigins)
{
    TileLevels levels;
    levels.leafOrigins = std::move(leafOrigins);
    std::uint64_t const leafCount = levels.leafOrigins.size();

    // Leaf tiles of one inner tile mostly follow each other, so few of its repeats are ever sorted.
    levels.innerOrigins = std::move(furtherInnerOrigins);
    for (std::uint64_t leaf = 0; leaf < leafCount; ++leaf) {
        Coordinate const inner = tileOrigin<Traits::kInnerWidth>(levels.leafOrigins[leaf]);
        if (levels.innerOrigins.empty() || levels.innerOrigins[levels.innerOrigins.size() - 1] != inner)
            levels.innerOrigins.push_back(inner);
    }
    sortUnique(levels.innerOrigins);
    std::uint64_t const innerCount = levels.innerOrigins.size();
    if (leafCount * Traits::kLeafVoxels + innerCount * Traits::kInnerCells >= kNoElement)
        return nullptr;

    TileHash const hash(levels.innerOrigins);
    Nexil::Internal::resizeUninitialized(levels.leafParents, leafCount);
    Nexil::Internal::resizeUninitialized(levels.innerChildren, innerCount * Traits::kInnerCells);
    std::fill(levels.innerChildren.begin(), levels.innerChildren.end(), kNoTile);
    Nexil::parallel::forRange(leafCount, grain::kTiles, [&](std::size_t begin, std::size_t end) {
        for (std::size_t leaf = begin; leaf < end; ++leaf) {
            Coordinate const& origin = levels.leafOrigins[leaf];
            Coordinate const innerOrigin = tileOrigin<Traits::kInnerWidth>(origin);
            Coordinate const offset = origin - innerOrigin;
            unsigned int const inner = hash.find(innerOrigin);
            levels.leafParents[leaf] = inner;
            std::uint64_t const cell = placeInTile<Traits::kTileWidth>(
                offset.x / Traits::kDataWidth, offset.y / Traits::kDataWidth, offset.z / Traits::kDataWidth);
            levels.innerChildren[std::uint64_t(inner) * Traits::kInnerCells + cell] = static_cast<unsigned int>(leaf);
        }
    });
    return Nexil::makePtr<VoxelTopology<Traits>>(std::move(name), std::move(levels));
}

template Nexil::Ptr<VoxelTopology<SmallTiles>> assembleTopology(Nexil::String, Nexil::Array<Coordinate>,
                                                                Nexil::Array<Coordinate>);
template Nexil::Ptr<VoxelTopology<WideTiles>> assembleTopology(Nexil::String, Nexil::Array<Coordinate>,
                                                               Nexil::Array<Coordinate>);

} // namespace VLD::TileTree3D::Internal
