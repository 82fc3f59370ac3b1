#include <vld/BuildFromValues.h>

#include <nexil/JobCancel.h>
#include <nexil/parallel/Parallel.h>
#include <vld/TileHash.h>
#include <vld/internal/ElementWrites.h>
#include <vld/internal/TileNumbering.h>
#include <vld/internal/TopologyAssembly.h>

#include <algorithm>

namespace VLD::TileTree3D::Internal {

namespace {

    namespace grain {
        constexpr std::uint64_t kVoxels = 65536;
        constexpr std::uint64_t kTiles = 4096;
    } // namespace grain

    /// A chunk, and which tiles it has; none when one of its voxels lies outside the limits.
    struct FoundChunk {
        VoxelChunk chunk;
        TileNumbering tiles;
        bool isWithinLimits = true;
    };

    template <class Traits>
    void findRuns(Nexil::Array<Coordinate> const& voxels, FoundChunk& found)
    {
        constexpr unsigned int w = Traits::kDataWidth;
        auto isApart = [](int v, int start) {
            return static_cast<unsigned int>(v) - static_cast<unsigned int>(start) >= w;
        };
        Coordinate const* const first = voxels.data() + found.chunk.begin;
        std::uint64_t const count = found.chunk.end - found.chunk.begin;
        Coordinate tile{};
        for (std::uint64_t i = 0; i < count; ++i) {
            if (i % grain::kVoxels == 0)
                Nexil::Internal::throwIfJobCancelled();
            Coordinate const voxel = first[i];
            if (i != 0 && !isApart(voxel.x, tile.x) && !isApart(voxel.y, tile.y) && !isApart(voxel.z, tile.z))
                continue;
            // The limits cut no tile.
            if (!isWithinLimits(voxel)) {
                found.isWithinLimits = false;
                return;
            }
            tile = tileOrigin<Traits::kDataWidth>(voxel);
            found.chunk.runs.push_back({static_cast<unsigned int>(i), found.tiles.numberOf(tile)});
        }
    }

    /// Writes the values of those of a chunk's voxels that lie in the leaf tiles [firstLeaf, lastLeaf).
    template <class Traits, class Size>
    void writeChunk(VoxelChunk const& chunk, std::uint64_t firstLeaf, std::uint64_t lastLeaf,
                    Coordinate const* leafOrigins, Coordinate const* voxels, std::byte const* values,
                    std::byte* elements, Size size)
    {
        std::uint64_t const runCount = chunk.runs.size();
        VoxelRun const* const runs = chunk.runs.data();
        unsigned int const* const leaves = chunk.leaves.data();
        for (std::uint64_t r = 0; r < runCount; ++r) {
            if (r % grain::kVoxels == 0)
                Nexil::Internal::throwIfJobCancelled();
            std::uint64_t const leaf = leaves[runs[r].tile];
            if (leaf < firstLeaf || leaf >= lastLeaf)
                continue;
            Coordinate const origin = leafOrigins[leaf];
            std::uint64_t const end = r + 1 == runCount ? chunk.end : chunk.begin + runs[r + 1].begin;
            for (std::uint64_t i = chunk.begin + runs[r].begin; i < end; ++i)
                copyElement(elements,
                            leaf * Traits::kLeafVoxels + VoxelTopology<Traits>::placeInLeaf(origin, voxels[i]), values,
                            i, size);
        }
    }

    /// One chunk per thread, so that most tiles are found in few chunks; what is made of them depends on no cut.
    std::uint64_t chunkCountFor(std::uint64_t voxelCount)
    {
        std::uint64_t const forThreads =
            std::min<std::uint64_t>(Nexil::parallel::threadCount(), voxelCount / grain::kVoxels);
        // Runs count the voxels of their chunk by 32 bits.
        return std::max(forThreads, voxelCount / kNoElement + 1);
    }

} // namespace

template <class Traits>
VoxelLayout<Traits> layOutVoxels(GridDescription const& description, Nexil::Array<Coordinate> const& voxels)
{
    if (!isUsable(description))
        return {};
    std::uint64_t const chunkCount = chunkCountFor(voxels.size());
    Nexil::Array<FoundChunk> found;
    found.resize(chunkCount);
    Nexil::parallel::forRange(chunkCount, 1, [&](std::size_t first, std::size_t last) {
        for (std::size_t i = first; i < last; ++i) {
            found[i].chunk.begin = voxels.size() * i / chunkCount;
            found[i].chunk.end = voxels.size() * (i + 1) / chunkCount;
            findRuns<Traits>(voxels, found[i]);
        }
    });
    Nexil::Array<Coordinate> origins;
    for (FoundChunk const& part : found) {
        if (!part.isWithinLimits)
            return {};
        for (Coordinate const& origin : part.tiles.origins())
            origins.push_back(origin);
    }
    sortUnique(origins);

    TileHash const leaves(origins);
    VoxelLayout<Traits> layout;
    for (FoundChunk& part : found) {
        auto const& tiles = part.tiles.origins();
        Nexil::Internal::resizeUninitialized(part.chunk.leaves, tiles.size());
        Nexil::parallel::forRange(tiles.size(), grain::kTiles, [&](std::size_t begin, std::size_t end) {
            for (std::size_t tile = begin; tile < end; ++tile)
                part.chunk.leaves[tile] = leaves.find(tiles[tile]);
        });
        layout.chunks.push_back(std::move(part.chunk));
    }
    layout.topology = assembleTopology<Traits>(description.topologyName, std::move(origins));
    return layout;
}

template <class Traits>
void writeVoxels(VoxelLayout<Traits> const& layout, Nexil::Array<Coordinate> const& voxels, ElementBytes const& bytes,
                 std::byte* elements)
{
    VoxelTopology<Traits> const& topology = *layout.topology;
    // Each stripe of leaf tiles is written by one thread that goes through the whole list, so that the last value of a voxel
    // stays. Where runs are long, going through them costs little, and stripes are so many that each stays in the cache.
    std::uint64_t runCount = 1;
    for (VoxelChunk const& chunk : layout.chunks)
        runCount += chunk.runs.size();
    std::uint64_t const leafCount = topology.leafCount();
    std::uint64_t const stripeCount = std::min<std::uint64_t>(
        leafCount,
        std::max<std::uint64_t>(Nexil::parallel::threadCount(), std::min<std::uint64_t>(voxels.size() / runCount, 64)));
    withElementSize(bytes.elementSize, [&](auto size) {
        Nexil::parallel::forRange(stripeCount, 1, [&](std::size_t firstStripe, std::size_t lastStripe) {
            std::uint64_t const firstLeaf = leafCount * firstStripe / stripeCount;
            std::uint64_t const lastLeaf = leafCount * lastStripe / stripeCount;
            fillElements(elements, firstLeaf * Traits::kLeafVoxels, lastLeaf * Traits::kLeafVoxels, bytes.background,
                         size);
            for (VoxelChunk const& chunk : layout.chunks)
                writeChunk<Traits>(chunk, firstLeaf, lastLeaf, topology.leafOrigins().data(), voxels.data(),
                                   bytes.values, elements, size);
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
