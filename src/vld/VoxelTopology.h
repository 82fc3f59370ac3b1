#pragma once

#include <nexil/Array.h>
#include <nexil/Export.h>
#include <nexil/Ptr.h>
#include <nexil/String.h>
#include <vld/Component.h>
#include <vld/Coordinates.h>
#include <vld/TileHash.h>
#include <vld/Traits.h>

#include <cstdint>
#include <mutex>

/// Which tiles a volume has: the part that all its channels share.
///
/// Elements are what channels hold one value for each: first the voxels of all leaf tiles, tile after tile, then the
/// cells of all inner tiles. A cell with a leaf tile in it has an element too, whose value nobody looks at; the value of
/// one without stands for all of its voxels.
namespace VLD::TileTree3D {

/// The tiles as plain arrays. `parents` and `children` are places in the other level's arrays.
struct TileLevels {
    Nexil::Array<Coordinate> leafOrigins;
    Nexil::Array<unsigned int> leafParents;
    Nexil::Array<Coordinate> innerOrigins;
    /// `Traits::kInnerCells` per inner tile; `kNoTile` for a cell without a leaf.
    Nexil::Array<unsigned int> innerChildren;
};

/// The same as shared arrays, none of them null.
struct SharedTileLevels {
    Nexil::Ptr<Nexil::Array<Coordinate>> leafOrigins;
    Nexil::Ptr<Nexil::Array<unsigned int>> leafParents;
    Nexil::Ptr<Nexil::Array<Coordinate>> innerOrigins;
    Nexil::Ptr<Nexil::Array<unsigned int>> innerChildren;
};

/// A cube of voxels: `width` along each axis from `origin` on.
struct VoxelCube {
    Coordinate origin;
    int width = 0;

    friend constexpr bool operator==(VoxelCube const&, VoxelCube const&) = default;
};

/// Immutable once made, and shared by everything that stands on it.
///
/// Threads: safe from any number of them.
template <class Traits>
class VELDRIN_PLATFORM_API VoxelTopology final : public Component {
public:
    /// Takes tiles that are known to fit together, as builders make them. What comes from elsewhere goes through
    /// `create`, or is asked for `isConsistent` before anything is looked up in it.
    /// Cost: linear in the inner tiles.
    VoxelTopology(Nexil::String name, TileLevels levels);
    VoxelTopology(Nexil::String name, SharedTileLevels levels);
    /// The same tiles under another name, shared. Cost: constant.
    VoxelTopology(Nexil::String name, VoxelTopology const& tiles);
    ~VoxelTopology() override;
    VoxelTopology(VoxelTopology const&);

    /// Takes any tiles; null when they are not consistent or the name is empty.
    [[nodiscard]] static Nexil::Ptr<VoxelTopology> create(Nexil::String name, TileLevels levels);
    /// The same from shared arrays, which stay shared; null also when one of them is null.
    [[nodiscard]] static Nexil::Ptr<VoxelTopology> create(Nexil::String name, SharedTileLevels levels);
    /// The same; where both have one array of inner origins, what finds tiles by them is shared with `like`, too.
    [[nodiscard]] static Nexil::Ptr<VoxelTopology> create(Nexil::String name, SharedTileLevels levels,
                                                          VoxelTopology const& like);

    [[nodiscard]] Nexil::Array<Coordinate> const& leafOrigins() const noexcept { return *levels_.leafOrigins; }
    [[nodiscard]] Nexil::Array<unsigned int> const& leafParents() const noexcept { return *levels_.leafParents; }
    [[nodiscard]] Nexil::Array<Coordinate> const& innerOrigins() const noexcept { return *levels_.innerOrigins; }
    [[nodiscard]] Nexil::Array<unsigned int> const& innerChildren() const noexcept { return *levels_.innerChildren; }
    /// All four of them.
    [[nodiscard]] SharedTileLevels const& levels() const noexcept { return levels_; }

    [[nodiscard]] unsigned int leafCount() const noexcept { return static_cast<unsigned int>(leafOrigins().size()); }
    [[nodiscard]] unsigned int innerCount() const noexcept { return static_cast<unsigned int>(innerOrigins().size()); }
    /// Number of leaf voxels: elements from here on are cells of inner tiles.
    [[nodiscard]] std::uint64_t voxelCount() const noexcept { return leafOrigins().size() * Traits::kLeafVoxels; }
    /// Voxels of leaf tiles and cells of inner tiles; below 2^32 in a consistent topology.
    [[nodiscard]] std::uint64_t elementCount() const noexcept
    {
        return voxelCount() + innerOrigins().size() * Traits::kInnerCells;
    }

    /// The leaf tile that holds a voxel, or `kNoTile`.
    [[nodiscard]] unsigned int findLeaf(Coordinate const& voxel) const noexcept
    {
        Coordinate const origin = tileOrigin<Traits::kInnerWidth>(voxel);
        unsigned int const inner = hash_->find(origin);
        return inner == kNoTile ? kNoTile : innerChildren()[cellElement(inner, origin, voxel)];
    }

    /// The element that holds a voxel's value: of the voxel itself where there is a leaf tile, else of the inner cell that
    /// stands for it; `kNoElement` outside all tiles.
    [[nodiscard]] unsigned int findElement(Coordinate const& voxel) const noexcept
    {
        Coordinate const origin = tileOrigin<Traits::kInnerWidth>(voxel);
        unsigned int const inner = hash_->find(origin);
        if (inner == kNoTile)
            return kNoElement;
        std::uint64_t const cell = cellElement(inner, origin, voxel);
        unsigned int const leaf = innerChildren()[cell];
        if (leaf == kNoTile)
            return static_cast<unsigned int>(voxelCount() + cell);
        return leaf * Traits::kLeafVoxels + placeInLeaf(leafOrigins()[leaf], voxel);
    }

    /// The voxels that an element stands for: one in a leaf tile, `Traits::kDataWidth` per axis for an inner cell.
    [[nodiscard]] VoxelCube elementCube(unsigned int element) const noexcept
    {
        if (element < voxelCount())
            return {leafOrigins()[element / Traits::kLeafVoxels] +
                        cellAtPlace<Traits::kDataWidth>(element % Traits::kLeafVoxels),
                    1};
        auto const cell = static_cast<unsigned int>(element - voxelCount());
        return {innerOrigins()[cell / Traits::kInnerCells] +
                    cellAtPlace<Traits::kTileWidth>(cell % Traits::kInnerCells) * int(Traits::kDataWidth),
                Traits::kDataWidth};
    }

    /// True for the cell of an inner tile that has a leaf tile in it.
    [[nodiscard]] bool isCellWithLeaf(unsigned int element) const noexcept
    {
        return element >= voxelCount() && innerChildren()[element - voxelCount()] != kNoTile;
    }

    [[nodiscard]] static constexpr unsigned int placeInLeaf(Coordinate const& leafOrigin,
                                                            Coordinate const& voxel) noexcept
    {
        return placeInTile<Traits::kDataWidth>(voxel.x - leafOrigin.x, voxel.y - leafOrigin.y, voxel.z - leafOrigin.z);
    }

    /// True when the tiles fit together: origins increasing, unique, aligned and within the limits; every leaf tile in the
    /// cell of one inner tile that points back at it, and no other cell pointing anywhere; fewer than 2^32 - 1 elements.
    ///
    /// report: prints what is wrong to standard output. Cost: linear in the tiles, parallel.
    [[nodiscard]] bool isConsistent(bool report) const;

    /// 0, 1, ... up to `elementCount()` - 1. Made at the first call and shared from then on; never for more elements than
    /// 32 bits count: the array is empty then.
    [[nodiscard]] Nexil::Ptr<Nexil::Array<unsigned int>> elementIndices() const;

    /// Bytes held, the object itself included and the array of indices left out.
    [[nodiscard]] std::uint64_t byteSize() const noexcept;

private:
    [[nodiscard]] static std::uint64_t cellElement(unsigned int inner, Coordinate const& innerOrigin,
                                                   Coordinate const& voxel) noexcept
    {
        // Offsets within a tile are not negative; an unsigned division by a constant is the cheapest there is.
        auto cell = [](int v, int start) {
            return static_cast<int>(static_cast<unsigned int>(v - start) / Traits::kDataWidth);
        };
        return std::uint64_t(inner) * Traits::kInnerCells +
               placeInTile<Traits::kTileWidth>(cell(voxel.x, innerOrigin.x), cell(voxel.y, innerOrigin.y),
                                               cell(voxel.z, innerOrigin.z));
    }

    /// The array of indices once somebody asked for it. A copy of the topology makes its own.
    struct IndexCache {
        IndexCache() = default;
        IndexCache(IndexCache const&) noexcept {}

        std::mutex mutex;
        Nexil::Ptr<Nexil::Array<unsigned int>> indices;
    };

    SharedTileLevels levels_;
    Nexil::Ptr<TileHash> hash_;
    mutable IndexCache indexCache_;
};

extern template class VoxelTopology<SmallTiles>;
extern template class VoxelTopology<WideTiles>;

} // namespace VLD::TileTree3D
