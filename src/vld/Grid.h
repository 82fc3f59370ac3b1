#pragma once

#include <nexil/Array.h>
#include <nexil/Ptr.h>
#include <nexil/String.h>
#include <vld/Channel.h>
#include <vld/Container.h>
#include <vld/DataElementInitializerType.h>
#include <vld/Object.h>
#include <vld/VoxelTopology.h>

namespace VLD::TileTree3D {

/// What a new grid is called, how large its voxels are, and how its channel is read between voxels.
///
/// The default names are those by which a volume is recognised as geometry.
struct GridDescription {
    Nexil::String channelName;
    float voxelSize = 1;
    DataElementInitializerType initializer = DataElementInitializerType::Linear;
    Nexil::String topologyName = "voxel_component";
    Nexil::String containerName = "voxel_tile_tree";
};

/// What builders make: a topology, a container of it, and one channel that belongs to that. All three null where a
/// builder fails.
template <class Traits>
struct Grid {
    Nexil::Ptr<VoxelTopology<Traits>> topology;
    Nexil::Ptr<Container<Traits>> container;
    Nexil::Ptr<Channel<Traits>> channel;

    [[nodiscard]] explicit operator bool() const noexcept { return static_cast<bool>(channel); }

    /// Adds all three; false, and nothing added, for a failed grid, an empty name, or a name that the volume has already.
    bool addTo(Object& volume) const
    {
        if (!channel)
            return false;
        Object grown = volume;
        if (!grown.addComponent(topology) || !grown.addComponent(container) || !grown.addComponent(channel))
            return false;
        volume = std::move(grown);
        return true;
    }
};

namespace Internal {

    /// The grid of a topology and its values.
    template <class Traits, class E>
    Grid<Traits> gridOf(GridDescription const& description, Nexil::Ptr<VoxelTopology<Traits>> topology,
                        Nexil::Array<E> elements, E const& background)
    {
        Grid<Traits> grid;
        grid.topology = std::move(topology);
        grid.container =
            Nexil::makePtr<Container<Traits>>(description.containerName, grid.topology, description.voxelSize);
        grid.channel = Nexil::makePtr<Channel<Traits>>(description.channelName, description.containerName,
                                                       Nexil::makePtr<Nexil::Array<E>>(std::move(elements)), background,
                                                       description.initializer);
        return grid;
    }

} // namespace Internal

} // namespace VLD::TileTree3D
