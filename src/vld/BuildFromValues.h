#pragma once

#include <nexil/Array.h>
#include <nexil/Export.h>
#include <nexil/Ptr.h>
#include <vld/Coordinates.h>
#include <vld/Grid.h>

#include <cstddef>
#include <cstdint>
#include <type_traits>

/// Grids from values that are there already: at scattered voxels, or in a dense box.
///
///     Nexil::Array<Coordinate> voxels{{0, 0, 0}, {-5, 1000, 7}};
///     Nexil::Array<float> values{1, 2};
///     auto grid = buildFromVoxels<SmallTiles>({.channelName = "voxel_fog_density"}, voxels, values, 0.0f);
///     grid.addTo(*volume);
///
/// Errors: an empty grid for a description with an empty or repeated name or a voxel size that is not finite and positive,
/// for coordinates outside the limits, and for more elements than 32 bits count. std::bad_alloc; std::runtime_error when
/// the job is cancelled. Threads: parallel inside; one result, bit for bit, for every number of threads.
namespace VLD::TileTree3D {

namespace Internal {

    /// Values of whatever type, as the bytes they are.
    struct ElementBytes {
        std::byte const* values = nullptr;
        std::byte const* background = nullptr;
        std::size_t elementSize = 0;
    };

    /// Voxels that follow each other in a list and lie in one leaf tile; the next run begins where they end.
    struct VoxelRun {
        unsigned int begin; // from its chunk's first voxel on
        unsigned int tile;  // of those of its chunk
    };

    /// A part of a list of voxels.
    struct VoxelChunk {
        std::uint64_t begin = 0;
        std::uint64_t end = 0;
        Nexil::Array<VoxelRun> runs;
        /// The leaf tile that each of the chunk's tiles is.
        Nexil::Array<unsigned int> leaves;
    };

    /// Where the values of a list of voxels go.
    template <class Traits>
    struct VoxelLayout {
        Nexil::Ptr<VoxelTopology<Traits>> topology;
        Nexil::Array<VoxelChunk> chunks;
    };

    /// Finds the tiles of voxels; the topology is null on failure.
    template <class Traits>
    VELDRIN_PLATFORM_API VoxelLayout<Traits> layOutVoxels(GridDescription const& description,
                                                          Nexil::Array<Coordinate> const& voxels);

    /// Writes all elements: the background, and over it the list's values, the last of a voxel staying.
    template <class Traits>
    VELDRIN_PLATFORM_API void writeVoxels(VoxelLayout<Traits> const& layout, Nexil::Array<Coordinate> const& voxels,
                                          ElementBytes const& bytes, std::byte* elements);

    /// The tiles of a box in which any value differs from the background; null on failure.
    template <class Traits>
    VELDRIN_PLATFORM_API Nexil::Ptr<VoxelTopology<Traits>> layOutBox(GridDescription const& description,
                                                                     Coordinate const& origin, Coordinate const& size,
                                                                     ElementBytes const& bytes);

    template <class Traits>
    VELDRIN_PLATFORM_API void writeBox(VoxelTopology<Traits> const& topology, Coordinate const& origin,
                                       Coordinate const& size, ElementBytes const& bytes, std::byte* elements);

} // namespace Internal

/// A grid of the leaf tiles in which the voxels lie.
///
/// voxels: in any order; of one that comes several times, the last value stays.
/// values: one per voxel; another number of them gives an empty grid.
/// background: all other voxels, and the channel's default.
/// Cost: linear in the list, n log n in its tiles; least where neighbours in the list are neighbours in space.
template <class Traits, class E>
    requires std::is_trivially_copyable_v<E>
[[nodiscard]] Grid<Traits> buildFromVoxels(GridDescription const& description, Nexil::Array<Coordinate> const& voxels,
                                           Nexil::Array<E> const& values, std::type_identity_t<E> const& background)
{
    if (voxels.size() != values.size())
        return {};
    auto layout = Internal::layOutVoxels<Traits>(description, voxels);
    if (!layout.topology)
        return {};
    Nexil::Array<E> elements;
    Nexil::Internal::resizeUninitialized(elements, layout.topology->elementCount());
    Internal::ElementBytes const bytes{reinterpret_cast<std::byte const*>(values.data()),
                                       reinterpret_cast<std::byte const*>(&background), sizeof(E)};
    Internal::writeVoxels(layout, voxels, bytes, reinterpret_cast<std::byte*>(elements.data()));
    return Internal::gridOf(description, std::move(layout.topology), std::move(elements), background);
}

/// A grid of the leaf tiles in which any value of a box differs from the background by its bytes.
///
/// origin, size: the box's lowest voxel, and how many voxels it has along each axis.
/// values: one per voxel of the box, z running fastest, then y; another number of them gives an empty grid.
/// Cost: linear in the box.
template <class Traits, class E>
    requires std::is_trivially_copyable_v<E>
[[nodiscard]] Grid<Traits> buildFromBox(GridDescription const& description, Coordinate const& origin,
                                        Coordinate const& size, Nexil::Array<E> const& values,
                                        std::type_identity_t<E> const& background)
{
    auto isPositive = [](int v) { return v > 0; };
    if (!isPositive(size.x) || !isPositive(size.y) || !isPositive(size.z) ||
        values.size() / static_cast<unsigned int>(size.x) / static_cast<unsigned int>(size.y) !=
            static_cast<unsigned int>(size.z) ||
        values.size() % (std::uint64_t(static_cast<unsigned int>(size.x)) * static_cast<unsigned int>(size.y)) != 0)
        return {};
    Internal::ElementBytes const bytes{reinterpret_cast<std::byte const*>(values.data()),
                                       reinterpret_cast<std::byte const*>(&background), sizeof(E)};
    auto topology = Internal::layOutBox<Traits>(description, origin, size, bytes);
    if (!topology)
        return {};
    Nexil::Array<E> elements;
    Nexil::Internal::resizeUninitialized(elements, topology->elementCount());
    Internal::writeBox(*topology, origin, size, bytes, reinterpret_cast<std::byte*>(elements.data()));
    return Internal::gridOf(description, std::move(topology), std::move(elements), background);
}

} // namespace VLD::TileTree3D
