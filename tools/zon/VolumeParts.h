#pragma once

#include <nexil/Ptr.h>
#include <veldrin/volume/VolumeConversion.h>
#include <vld/Channel.h>
#include <vld/Container.h>
#include <vld/Object.h>

#include <vector>

/// Walking over the parts of a volume.
namespace Zon {

/// Calls visit(component) for every component of a kind, of either configuration.
template <template <class> class Kind, class Visit>
void forEachOf(VLD::Object const& volume, Visit const& visit)
{
    using namespace VLD::TileTree3D;
    for (auto const& name : volume.componentRange()) {
        if (auto const small = volume.component<Kind<SmallTiles>>(name))
            visit(*small);
        if (auto const wide = volume.component<Kind<WideTiles>>(name))
            visit(*wide);
    }
}

/// Calls visit(container) for every container that has its topology.
template <class Visit>
void forEachContainer(VLD::Object const& volume, Visit const& visit)
{
    forEachOf<VLD::TileTree3D::Container>(volume, [&](auto const& container) {
        if (container.topology())
            visit(container);
    });
}

/// The channels that belong to a container or to points and have one value for each of its elements, in the volume's order.
template <template <class> class Owner, class Traits>
std::vector<Nexil::Ptr<VLD::TileTree3D::ChannelBase>> channelsOf(VLD::Object const& volume, Owner<Traits> const& owner)
{
    std::vector<Nexil::Ptr<VLD::TileTree3D::ChannelBase>> channels;
    for (auto const& name : volume.componentRange())
        if (auto channel = volume.component<VLD::TileTree3D::Channel<Traits>>(name);
            channel && channel->containerName() == owner.name() && channel->elementCount() == owner.elementCount())
            channels.push_back(channel);
    return channels;
}

} // namespace Zon
