#include <vld/BuildFromValues.h>

#include <nexil/parallel/Parallel.h>
#include <vld/internal/ElementWrites.h>
#include <vld/internal/TopologyAssembly.h>

#include <algorithm>
#include <array>
#include <bit>

namespace VLD::TileTree3D::Internal {

namespace {

    namespace grain {
        constexpr std::size_t kVoxels = 16384;
        constexpr std::size_t kTiles = 256;
    } // namespace grain

    /// Tile numbers along each axis, from the lowest tile of the list on.
    using TileNumbers = std::array<std::uint32_t, 3>;

    template <class Traits>
    TileNumbers numbersOf(Coordinate const& voxel)
    {
        return {tileNumber<Traits::kDataWidth>(voxel.x), tileNumber<Traits::kDataWidth>(voxel.y),
                tileNumber<Traits::kDataWidth>(voxel.z)};
    }

    struct Extent {
        TileNumbers low{0xFFFFFFFFu, 0xFFFFFFFFu, 0xFFFFFFFFu};
        TileNumbers high{0, 0, 0};
        bool isWithin = true;

        void join(Extent const& other)
        {
            for (std::size_t axis = 0; axis < 3; ++axis) {
                low[axis] = std::min(low[axis], other.low[axis]);
                high[axis] = std::max(high[axis], other.high[axis]);
            }
            isWithin = isWithin && other.isWithin;
        }
    };

    template <class Traits>
    Extent extentOf(Nexil::Array<Coordinate> const& voxels)
    {
        return Nexil::parallel::reduceInOrder(
            voxels.size(), grain::kVoxels, Extent(),
            [&](std::size_t begin, std::size_t end, Extent extent) {
                for (std::size_t i = begin; i < end; ++i) {
                    TileNumbers const tile = numbersOf<Traits>(voxels[i]);
                    extent.join({tile, tile, isWithinLimits(voxels[i])});
                }
                return extent;
            },
            [](Extent left, Extent const& right) {
                left.join(right);
                return left;
            });
    }

    /// A tile as one number where the list's extent allows it, which it mostly does: sorting is then twice as fast.
    struct NarrowKey {
        using Type = std::uint64_t;
        TileNumbers low;
        unsigned int yBits, zBits;

        Type operator()(TileNumbers const& tile) const
        {
            return (std::uint64_t(tile[0] - low[0]) << yBits | (tile[1] - low[1])) << zBits | (tile[2] - low[2]);
        }
    };

    struct WideKey {
        using Type = TileNumbers;
        Type operator()(TileNumbers const& tile) const { return tile; }
    };

    template <class Key>
    struct KeyedRun {
        Key key;
        VoxelRun run;
    };

    /// All runs of the list. Blocks of fixed length find theirs at once; a run ends where its block does.
    template <class Traits, class Key>
    Nexil::Array<KeyedRun<typename Key::Type>> sortedRuns(Nexil::Array<Coordinate> const& voxels, Key const& keyOf)
    {
        using Run = KeyedRun<typename Key::Type>;
        std::uint64_t const count = voxels.size();
        std::uint64_t const blockCount = (count + grain::kVoxels - 1) / grain::kVoxels;
        Nexil::Array<Nexil::Array<Run>> blocks;
        blocks.resize(blockCount);
        Nexil::parallel::forRange(blockCount, 1, [&](std::size_t first, std::size_t last) {
            for (std::size_t block = first; block < last; ++block) {
                std::uint64_t const end = std::min<std::uint64_t>(count, (block + 1) * grain::kVoxels);
                Nexil::Array<Run>& runs = blocks[block];
                for (std::uint64_t i = block * grain::kVoxels; i < end; ++i) {
                    auto const key = keyOf(numbersOf<Traits>(voxels[i]));
                    if (runs.empty() || runs[runs.size() - 1].key != key)
                        runs.push_back({key, {i, i}});
                    runs[runs.size() - 1].run.end = i + 1;
                }
            }
        });
        std::uint64_t runCount = 0;
        for (auto const& block : blocks)
            runCount += block.size();
        Nexil::Array<Run> runs;
        runs.reserve(runCount);
        for (auto const& block : blocks)
            for (Run const& run : block)
                runs.push_back(run);
        Nexil::parallel::sort(runs.begin(), runs.end(), [](Run const& a, Run const& b) {
            return a.key == b.key ? a.run.begin < b.run.begin : a.key < b.key;
        });
        return runs;
    }

    template <class Traits, class Key>
    VoxelLayout<Traits> layOut(GridDescription const& description, Nexil::Array<Coordinate> const& voxels,
                               Key const& keyOf)
    {
        auto const keyed = sortedRuns<Traits>(voxels, keyOf);
        VoxelLayout<Traits> layout;
        layout.runs.reserve(keyed.size());
        Nexil::Array<Coordinate> origins;
        for (std::uint64_t i = 0; i < keyed.size(); ++i) {
            if (i == 0 || keyed[i].key != keyed[i - 1].key) {
                layout.runOffsets.push_back(i);
                origins.push_back(tileOrigin<Traits::kDataWidth>(voxels[keyed[i].run.begin]));
            }
            layout.runs.push_back(keyed[i].run);
        }
        layout.runOffsets.push_back(keyed.size());
        layout.topology = assembleTopology<Traits>(description.topologyName, std::move(origins));
        return layout;
    }

} // namespace

template <class Traits>
VoxelLayout<Traits> layOutVoxels(GridDescription const& description, Nexil::Array<Coordinate> const& voxels)
{
    if (!isUsable(description))
        return {};
    Extent const extent = extentOf<Traits>(voxels);
    if (!extent.isWithin)
        return {};
    auto bits = [&](std::size_t axis) {
        return voxels.empty() ? 0u : static_cast<unsigned int>(std::bit_width(extent.high[axis] - extent.low[axis]));
    };
    if (bits(0) + bits(1) + bits(2) <= 64 && bits(1) + bits(2) < 64)
        return layOut<Traits>(description, voxels, NarrowKey{extent.low, bits(1), bits(2)});
    return layOut<Traits>(description, voxels, WideKey{});
}

template <class Traits>
void writeVoxels(VoxelLayout<Traits> const& layout, Nexil::Array<Coordinate> const& voxels, ElementBytes const& bytes,
                 std::byte* elements)
{
    VoxelTopology<Traits> const& topology = *layout.topology;
    withElementSize(bytes.elementSize, [&](auto size) {
        Nexil::parallel::forRange(topology.leafCount(), grain::kTiles, [&](std::size_t begin, std::size_t end) {
            fillElements(elements, begin * Traits::kLeafVoxels, end * Traits::kLeafVoxels, bytes.background, size);
            for (std::size_t leaf = begin; leaf < end; ++leaf) {
                Coordinate const origin = topology.leafOrigins()[leaf];
                for (std::uint64_t r = layout.runOffsets[leaf]; r < layout.runOffsets[leaf + 1]; ++r)
                    for (std::uint64_t i = layout.runs[r].begin; i < layout.runs[r].end; ++i)
                        copyElement(elements, leaf * Traits::kLeafVoxels + topology.placeInLeaf(origin, voxels[i]),
                                    bytes.values, i, size);
            }
        });
        fillElements(elements, topology.voxelCount(), topology.elementCount(), bytes.background, size);
    });
}

template VELDRIN_PLATFORM_API VoxelLayout<SmallTiles> layOutVoxels(GridDescription const&,
                                                                   Nexil::Array<Coordinate> const&);
template VELDRIN_PLATFORM_API VoxelLayout<WideTiles> layOutVoxels(GridDescription const&,
                                                                  Nexil::Array<Coordinate> const&);
template VELDRIN_PLATFORM_API void writeVoxels(VoxelLayout<SmallTiles> const&, Nexil::Array<Coordinate> const&,
                                               ElementBytes const&, std::byte*);
template VELDRIN_PLATFORM_API void writeVoxels(VoxelLayout<WideTiles> const&, Nexil::Array<Coordinate> const&,
                                               ElementBytes const&, std::byte*);

} // namespace VLD::TileTree3D::Internal
