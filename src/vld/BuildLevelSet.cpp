#include <vld/BuildLevelSet.h>

#include <nexil/parallel/Parallel.h>
#include <vld/internal/TopologyAssembly.h>

#include <atomic>
#include <cmath>
#include <limits>
#include <numbers>
#include <optional>

namespace VLD::TileTree3D::Internal {

namespace {

    namespace grain {
        constexpr std::size_t kTiles = 64;
        constexpr std::size_t kBlocks = 16;
    } // namespace grain

    // So that an empty box of any size takes no memory.
    constexpr std::uint64_t kMostChunks = 1 << 16;

    enum class Side { Outside, Inside, Near };

    /// Tells on which side of the surface whole cubes of voxels lie.
    class Judge {
    public:
        Judge(VoxelBox const& box, float band, double voxelSize, DistanceField const& field)
            : low_(box.origin),
              high_{box.origin.x + (box.size.x - 1), box.origin.y + (box.size.y - 1), box.origin.z + (box.size.z - 1)},
              band_(band), voxelSize_(voxelSize), field_(field)
        {
        }

        /// Outside, also outside of the box; Inside only where the whole cube lies in it; Near where voxels must tell.
        [[nodiscard]] Side sideOf(Coordinate const& origin, int width) const
        {
            if (isApart(origin.x, width, low_.x, high_.x) || isApart(origin.y, width, low_.y, high_.y) ||
                isApart(origin.z, width, low_.z, high_.z))
                return Side::Outside;
            double const distance = field_.at(field_.function, centreOf(origin, width, voxelSize_));
            // To the centres of the voxels in the corners, and a little for what the function rounds.
            double const reach = (width - 1) * 0.5 * std::numbers::sqrt3 * voxelSize_;
            double const limit = (band_ + reach) * (1 + 1e-6);
            if (distance >= limit)
                return Side::Outside;
            if (distance <= -limit && isWithin(origin.x, width, low_.x, high_.x) &&
                isWithin(origin.y, width, low_.y, high_.y) && isWithin(origin.z, width, low_.z, high_.z))
                return Side::Inside;
            return Side::Near;
        }

        /// Makes the voxels of a leaf tile that lie outside of the box outside of the surface.
        template <int Width>
        void clip(Coordinate const& origin, float* distances) const
        {
            if (isWithin(origin.x, Width, low_.x, high_.x) && isWithin(origin.y, Width, low_.y, high_.y) &&
                isWithin(origin.z, Width, low_.z, high_.z))
                return;
            for (unsigned int place = 0; place < Width * Width * Width; ++place) {
                Coordinate const voxel = origin + cellAtPlace<Width>(place);
                if (!isWithin(voxel.x, 1, low_.x, high_.x) || !isWithin(voxel.y, 1, low_.y, high_.y) ||
                    !isWithin(voxel.z, 1, low_.z, high_.z))
                    distances[place] = band_;
            }
        }

    private:
        // Starts of cubes are at least their width away from the largest integer, as the limits are.
        static bool isApart(int start, int width, int low, int high)
        {
            return start > high || start + (width - 1) < low;
        }
        static bool isWithin(int start, int width, int low, int high)
        {
            return start >= low && start + (width - 1) <= high;
        }

        Coordinate low_;
        Coordinate high_;
        float band_;
        double voxelSize_;
        DistanceField const& field_;
    };

    /// Inner tiles of a box along each axis, cut into blocks of `kBlockTiles` per axis that are judged as one.
    template <class Traits>
    class Blocks {
    public:
        static constexpr int kBlockTiles = 64 / Traits::kInnerWidth;
        static constexpr int kBlockWidth = kBlockTiles * Traits::kInnerWidth;

        explicit Blocks(VoxelBox const& box) : first_(tileOrigin<Traits::kInnerWidth>(box.origin))
        {
            for (int axis = 0; axis < 3; ++axis) {
                std::uint32_t const low = tileNumber<Traits::kInnerWidth>(box.origin[axis]);
                std::uint32_t const high = tileNumber<Traits::kInnerWidth>(box.origin[axis] + (box.size[axis] - 1));
                tiles_[axis] = static_cast<int>(high - low + 1);
                counts_[axis] = (tiles_[axis] + kBlockTiles - 1) / kBlockTiles;
            }
        }

        [[nodiscard]] std::uint64_t count() const { return along(0) * along(1) * along(2); }

        /// First inner tile of a block, in tiles from the box's first one.
        [[nodiscard]] Coordinate firstTile(std::uint64_t block) const
        {
            return Coordinate{static_cast<int>(block / along(2) / along(1)),
                              static_cast<int>(block / along(2) % along(1)), static_cast<int>(block % along(2))} *
                   kBlockTiles;
        }

        [[nodiscard]] Coordinate originOf(Coordinate const& tile) const
        {
            return first_ + tile * int(Traits::kInnerWidth);
        }

        /// Calls visit(origin) for the inner tiles of a block.
        template <class Visit>
        void forEachTile(Coordinate const& firstTile, Visit const& visit) const
        {
            auto end = [&](int axis) { return std::min(firstTile[axis] + kBlockTiles, tiles_[axis]); };
            for (int x = firstTile.x; x < end(0); ++x)
                for (int y = firstTile.y; y < end(1); ++y)
                    for (int z = firstTile.z; z < end(2); ++z)
                        visit(originOf({x, y, z}));
        }

        /// True when all tiles of a block exist, so that its whole cube can be judged.
        [[nodiscard]] bool isWhole(Coordinate const& firstTile) const
        {
            return firstTile.x + kBlockTiles <= tiles_.x && firstTile.y + kBlockTiles <= tiles_.y &&
                   firstTile.z + kBlockTiles <= tiles_.z;
        }

    private:
        [[nodiscard]] std::uint64_t along(int axis) const { return static_cast<std::uint64_t>(counts_[axis]); }

        Coordinate first_;
        Coordinate tiles_;
        Coordinate counts_;
    };

    struct FoundTiles {
        Nexil::Array<Coordinate> leaves;
        Nexil::Array<Coordinate> insides;
    };

    template <class Traits>
    void findInTile(Judge const& judge, Coordinate const& inner, FoundTiles& found)
    {
        Side const side = judge.sideOf(inner, Traits::kInnerWidth);
        if (side == Side::Inside)
            found.insides.push_back(inner);
        if (side != Side::Near)
            return;
        bool hasInsideCell = false;
        for (unsigned int cell = 0; cell < Traits::kInnerCells; ++cell) {
            Coordinate const leaf = inner + cellAtPlace<Traits::kTileWidth>(cell) * int(Traits::kDataWidth);
            Side const leafSide = judge.sideOf(leaf, Traits::kDataWidth);
            if (leafSide == Side::Near)
                found.leaves.push_back(leaf);
            hasInsideCell |= leafSide == Side::Inside;
        }
        if (hasInsideCell)
            found.insides.push_back(inner);
    }

    /// No more elements than the tiles will have.
    template <class Traits>
    std::uint64_t elementsOf(FoundTiles const& found)
    {
        return found.leaves.size() * Traits::kLeafVoxels + found.insides.size() * Traits::kInnerCells;
    }

    /// Leaf tiles near the surface, and inner tiles that have cells inside; nothing when they have too many elements.
    template <class Traits>
    std::optional<FoundTiles> findTiles(VoxelBox const& box, Judge const& judge, std::uint64_t mostElements)
    {
        Blocks<Traits> const blocks(box);
        std::uint64_t const chunkBlocks = std::max<std::uint64_t>(grain::kBlocks, blocks.count() / kMostChunks + 1);
        std::uint64_t const chunkCount = (blocks.count() + chunkBlocks - 1) / chunkBlocks;
        Nexil::Array<FoundTiles> chunks;
        chunks.resize(chunkCount);
        std::atomic<std::uint64_t> elementCount{0};
        Nexil::parallel::forRange(chunkCount, 1, [&](std::size_t first, std::size_t last) {
            for (std::uint64_t block = first * chunkBlocks; block < std::min(last * chunkBlocks, blocks.count());
                 ++block) {
                // More than can be numbered is told before it fills the memory.
                if (elementCount.load(std::memory_order_relaxed) > mostElements)
                    return;
                Nexil::Internal::throwIfJobCancelled();
                FoundTiles& found = chunks[block / chunkBlocks];
                std::uint64_t const before = elementsOf<Traits>(found);
                Coordinate const tile = blocks.firstTile(block);
                Side const side = blocks.isWhole(tile)
                                      ? judge.sideOf(blocks.originOf(tile), Blocks<Traits>::kBlockWidth)
                                      : Side::Near;
                if (side == Side::Inside)
                    blocks.forEachTile(tile, [&](Coordinate const& inner) { found.insides.push_back(inner); });
                else if (side == Side::Near)
                    blocks.forEachTile(tile, [&](Coordinate const& inner) { findInTile<Traits>(judge, inner, found); });
                elementCount.fetch_add(elementsOf<Traits>(found) - before, std::memory_order_relaxed);
            }
        });
        if (elementCount.load() > mostElements)
            return std::nullopt;
        FoundTiles all;
        for (FoundTiles const& found : chunks) {
            for (Coordinate const& leaf : found.leaves)
                all.leaves.push_back(leaf);
            for (Coordinate const& inner : found.insides)
                all.insides.push_back(inner);
        }
        sortUnique(all.leaves);
        return all;
    }

    bool isUsable(VoxelBox const& box, std::uint64_t blockWidth)
    {
        for (int axis = 0; axis < 3; ++axis)
            if (box.size[axis] <= 0 || box.origin[axis] < -kCoordinateLimit ||
                static_cast<long long>(box.origin[axis]) + box.size[axis] > kCoordinateLimit)
                return false;
        // So that 64 bits count the blocks.
        auto const along = [&](int axis) { return static_cast<std::uint64_t>(box.size[axis]) / blockWidth + 2; };
        return along(0) * along(1) <= std::numeric_limits<std::uint64_t>::max() / along(2);
    }

} // namespace

template <class Traits>
Grid<Traits> buildLevelSet(GridDescription const& description, VoxelBox const& box, float band,
                           DistanceField const& field, std::uint64_t mostElements)
{
    if (!isUsable(description) || !isUsable(box, Blocks<Traits>::kBlockWidth) || !std::isfinite(band) || !(band > 0))
        return {};
    double const voxelSize = description.voxelSize;
    Judge const judge(box, band, voxelSize, field);
    auto found = findTiles<Traits>(box, judge, mostElements);
    if (!found)
        return {};
    auto topology =
        assembleTopology<Traits>(description.topologyName, std::move(found->leaves), std::move(found->insides));
    if (!topology)
        return {};

    Nexil::Array<float> distances;
    Nexil::Internal::resizeUninitialized(distances, topology->elementCount());
    Nexil::parallel::forRange(topology->leafCount(), grain::kTiles, [&](std::size_t begin, std::size_t end) {
        for (std::size_t leaf = begin; leaf < end; ++leaf) {
            Coordinate const& origin = topology->leafOrigins()[leaf];
            float* const values = distances.data() + leaf * Traits::kLeafVoxels;
            field.fill(field.function, origin, Traits::kDataWidth, voxelSize, band, values);
            judge.clip<Traits::kDataWidth>(origin, values);
        }
    });
    Nexil::parallel::forRange(topology->innerCount(), grain::kTiles, [&](std::size_t begin, std::size_t end) {
        for (std::size_t inner = begin; inner < end; ++inner) {
            float* const cells = distances.data() + topology->voxelCount() + inner * Traits::kInnerCells;
            Coordinate const& origin = topology->innerOrigins()[inner];
            bool const isInside = judge.sideOf(origin, Traits::kInnerWidth) == Side::Inside;
            for (unsigned int cell = 0; cell < Traits::kInnerCells; ++cell) {
                bool const isCellInside =
                    isInside || judge.sideOf(origin + cellAtPlace<Traits::kTileWidth>(cell) * int(Traits::kDataWidth),
                                             Traits::kDataWidth) == Side::Inside;
                cells[cell] = isCellInside ? -band : band;
            }
        }
    });
    return gridOf(description, std::move(topology), std::move(distances), band);
}

template VELDRIN_PLATFORM_API Grid<SmallTiles> buildLevelSet(GridDescription const&, VoxelBox const&, float,
                                                             DistanceField const&, std::uint64_t);
template VELDRIN_PLATFORM_API Grid<WideTiles> buildLevelSet(GridDescription const&, VoxelBox const&, float,
                                                            DistanceField const&, std::uint64_t);

} // namespace VLD::TileTree3D::Internal
