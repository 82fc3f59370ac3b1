#pragma once

#include <nexil/Ptr.h>
#include <veldrin/volume/VolumeConversion.h>
#include <vld/Channel.h>
#include <vld/Container.h>
#include <vld/Object.h>

#include <vector>

/// Walking over the parts of a volume.
namespace Zon {

/// Calls visit(container) for every container of either configuration that has its topology.
template <class Visit>
void forEachContainer(VLD::Object const& volume, Visit const& visit)
{
    using namespace VLD::TileTree3D;
    for (auto const& name : volume.componentRange()) {
        if (auto const small = volume.component<Container<SmallTiles>>(name); small && small->topology())
            visit(*small);
        if (auto const wide = volume.component<Container<WideTiles>>(name); wide && wide->topology())
            visit(*wide);
    }
}

/// The channels that belong to a container and have one value for each of its elements, in the volume's order.
template <class Traits>
std::vector<Nexil::Ptr<VLD::TileTree3D::ChannelBase>> channelsOf(VLD::Object const& volume,
                                                                 VLD::TileTree3D::Container<Traits> const& container)
{
    std::vector<Nexil::Ptr<VLD::TileTree3D::ChannelBase>> channels;
    for (auto const& name : volume.componentRange())
        if (auto channel = volume.component<VLD::TileTree3D::Channel<Traits>>(name);
            channel && channel->containerName() == container.name() &&
            channel->elementCount() == container.elementCount())
            channels.push_back(channel);
    return channels;
}

} // namespace Zon
