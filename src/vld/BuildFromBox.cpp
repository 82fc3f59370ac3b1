#include <vld/BuildFromValues.h>

#include <nexil/parallel/Parallel.h>
#include <vld/internal/ElementWrites.h>
#include <vld/internal/TopologyAssembly.h>

#include <algorithm>

namespace VLD::TileTree3D::Internal {

namespace {

    namespace grain {
        constexpr std::size_t kTiles = 256;
    } // namespace grain

    /// A box of voxels and where its values lie.
    struct Box {
        Coordinate origin;
        Coordinate size;

        [[nodiscard]] std::uint64_t placeOf(int x, int y, int z) const
        {
            auto offset = [](int v, int start) { return static_cast<std::uint64_t>(v - start); };
            return (offset(x, origin.x) * static_cast<unsigned int>(size.y) + offset(y, origin.y)) *
                       static_cast<unsigned int>(size.z) +
                   offset(z, origin.z);
        }
    };

    /// Calls visit(x, y, zBegin, zEnd) for every row of voxels that the box and the leaf tile share, until it says false.
    template <class Traits, class Visit>
    bool visitSharedRows(Box const& box, Coordinate const& leaf, Visit const& visit)
    {
        auto low = [](int boxStart, int tileStart) { return std::max(boxStart, tileStart); };
        // Both ends stay within the limits: those of the tile do.
        auto high = [](int boxStart, int boxSize, int tileStart) {
            return std::min<long long>(static_cast<long long>(boxStart) + boxSize, tileStart + Traits::kDataWidth);
        };
        auto const xEnd = static_cast<int>(high(box.origin.x, box.size.x, leaf.x));
        auto const yEnd = static_cast<int>(high(box.origin.y, box.size.y, leaf.y));
        auto const zEnd = static_cast<int>(high(box.origin.z, box.size.z, leaf.z));
        for (int x = low(box.origin.x, leaf.x); x < xEnd; ++x)
            for (int y = low(box.origin.y, leaf.y); y < yEnd; ++y)
                if (!visit(x, y, low(box.origin.z, leaf.z), zEnd))
                    return false;
        return true;
    }

    template <class Traits>
    bool differsFromBackground(Box const& box, Coordinate const& leaf, ElementBytes const& bytes)
    {
        return !visitSharedRows<Traits>(box, leaf, [&](int x, int y, int zBegin, int zEnd) {
            std::byte const* value = bytes.values + box.placeOf(x, y, zBegin) * bytes.elementSize;
            for (int z = zBegin; z < zEnd; ++z, value += bytes.elementSize)
                if (std::memcmp(value, bytes.background, bytes.elementSize) != 0)
                    return false;
            return true;
        });
    }

} // namespace

template <class Traits>
Nexil::Ptr<VoxelTopology<Traits>> layOutBox(GridDescription const& description, Coordinate const& origin,
                                            Coordinate const& size, ElementBytes const& bytes)
{
    auto fits = [](int start, int count) {
        return start >= -kCoordinateLimit && static_cast<long long>(start) + count <= kCoordinateLimit;
    };
    if (!isUsable(description) || !fits(origin.x, size.x) || !fits(origin.y, size.y) || !fits(origin.z, size.z))
        return nullptr;
    Box const box{origin, size};
    constexpr int w = Traits::kDataWidth;
    Coordinate const first = tileOrigin<w>(origin);
    auto tilesAlong = [](int start, int count) {
        return std::uint64_t(tileNumber<w>(start + (count - 1)) - tileNumber<w>(start)) + 1;
    };
    std::uint64_t const tilesY = tilesAlong(origin.y, size.y);
    std::uint64_t const tilesZ = tilesAlong(origin.z, size.z);
    std::uint64_t const tileCount = tilesAlong(origin.x, size.x) * tilesY * tilesZ;
    auto originOf = [&](std::uint64_t tile) {
        return Coordinate{first.x + static_cast<int>(tile / tilesZ / tilesY) * w,
                          first.y + static_cast<int>(tile / tilesZ % tilesY) * w,
                          first.z + static_cast<int>(tile % tilesZ) * w};
    };

    Nexil::Array<unsigned char> isWanted;
    Nexil::Internal::resizeUninitialized(isWanted, tileCount);
    Nexil::parallel::forRange(tileCount, grain::kTiles, [&](std::size_t begin, std::size_t end) {
        for (std::size_t tile = begin; tile < end; ++tile)
            isWanted[tile] = differsFromBackground<Traits>(box, originOf(tile), bytes) ? 1 : 0;
    });
    Nexil::Array<Coordinate> origins;
    for (std::uint64_t tile = 0; tile < tileCount; ++tile)
        if (isWanted[tile] != 0)
            origins.push_back(originOf(tile));
    return assembleTopology<Traits>(description.topologyName, std::move(origins));
}

template <class Traits>
void writeBox(VoxelTopology<Traits> const& topology, Coordinate const& origin, Coordinate const& size,
              ElementBytes const& bytes, std::byte* elements)
{
    Box const box{origin, size};
    withElementSize(bytes.elementSize, [&](auto elementSize) {
        Nexil::parallel::forRange(topology.leafCount(), grain::kTiles, [&](std::size_t begin, std::size_t end) {
            fillElements(elements, begin * Traits::kLeafVoxels, end * Traits::kLeafVoxels, bytes.background,
                         elementSize);
            for (std::size_t leaf = begin; leaf < end; ++leaf) {
                Coordinate const leafOrigin = topology.leafOrigins()[leaf];
                visitSharedRows<Traits>(box, leafOrigin, [&](int x, int y, int zBegin, int zEnd) {
                    std::uint64_t const place =
                        leaf * Traits::kLeafVoxels + topology.placeInLeaf(leafOrigin, {x, y, zBegin});
                    std::memcpy(elements + place * elementSize, bytes.values + box.placeOf(x, y, zBegin) * elementSize,
                                static_cast<std::size_t>(zEnd - zBegin) * elementSize);
                    return true;
                });
            }
        });
        fillElements(elements, topology.voxelCount(), topology.elementCount(), bytes.background, elementSize);
    });
}

template VELDRIN_PLATFORM_API Nexil::Ptr<VoxelTopology<SmallTiles>> layOutBox(GridDescription const&, Coordinate const&,
                                                                              Coordinate const&, ElementBytes const&);
template VELDRIN_PLATFORM_API Nexil::Ptr<VoxelTopology<WideTiles>> layOutBox(GridDescription const&, Coordinate const&,
                                                                             Coordinate const&, ElementBytes const&);
template VELDRIN_PLATFORM_API void writeBox(VoxelTopology<SmallTiles> const&, Coordinate const&, Coordinate const&,
                                            ElementBytes const&, std::byte*);
template VELDRIN_PLATFORM_API void writeBox(VoxelTopology<WideTiles> const&, Coordinate const&, Coordinate const&,
                                            ElementBytes const&, std::byte*);

} // namespace VLD::TileTree3D::Internal
