#pragma once

#include <nexil/Export.h>

/// How the tiles of a volume are cut.
///
/// Space is divided into voxels, voxels into leaf tiles, leaf tiles into inner tiles; only what is wanted of it exists.
/// An inner tile has `TileWidth` children along each axis, a leaf tile `DataWidth` voxels: with `Traits<2, 4, 0, 1>` a
/// leaf holds 4 x 4 x 4 voxels, and an inner tile 2 x 2 x 2 leaves, thus 8 x 8 x 8 voxels.
namespace VLD::TileTree3D {

/// The parameters of a configuration as values, for what is not a template.
struct TileParameters {
    unsigned int tileWidth = 0;
    unsigned int dataWidth = 0;
    unsigned int offsetType = 0;
    unsigned int innerLevels = 0;

    friend constexpr bool operator==(TileParameters const&, TileParameters const&) = default;
};

/// One configuration.
///
/// TileWidth:   children per axis of an inner tile.
/// DataWidth:   voxels per axis of a leaf tile.
/// OffsetType:  0: elements are numbered by 32 bits.
/// InnerLevels: levels of inner tiles between the hashed root and the leaves.
template <unsigned int TileWidth, unsigned int DataWidth, unsigned int OffsetType, unsigned int InnerLevels>
struct VELDRIN_PLATFORM_API Traits {
    static_assert(OffsetType == 0 && InnerLevels == 1, "32-bit offsets and one inner level are what there is");

    static constexpr int kTileWidth = TileWidth;
    static constexpr int kDataWidth = DataWidth;
    /// Voxels per axis of an inner tile.
    static constexpr int kInnerWidth = kTileWidth * kDataWidth;
    static constexpr unsigned int kLeafVoxels = DataWidth * DataWidth * DataWidth;
    static constexpr unsigned int kInnerCells = TileWidth * TileWidth * TileWidth;
    [[nodiscard]] static constexpr TileParameters parameters() noexcept
    {
        return {TileWidth, DataWidth, OffsetType, InnerLevels};
    }
};

/// The two configurations that exist. Small tiles hold a thin shell with less air around it, wide ones need fewer tiles.
using SmallTiles = Traits<2, 4, 0, 1>;
using WideTiles = Traits<5, 5, 0, 1>;

} // namespace VLD::TileTree3D
