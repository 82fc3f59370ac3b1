#include <veldrin/volume/ValidUpdatedVolume.h>

#include <veldrin/volume/internal/Configurations.h>
#include <vld/Channel.h>
#include <vld/Container.h>

#include <iostream>

namespace Veldrin::Geometry {

namespace {

    using VLD::TileTree3D::ChannelBase;
    using VLD::TileTree3D::Container;
    using VLD::TileTree3D::VoxelTopology;

    template <class Traits>
    bool isUpdated(VLD::Object const& volume, Container<Traits> const& container, bool print)
    {
        auto const topology = volume.component<VoxelTopology<Traits>>(container.topologyName());
        std::uint64_t const topologySize = topology ? topology->elementCount() : 0;
        bool isValid = topology && topologySize == container.elementCount();
        if (!isValid && print)
            std::cout << "topoName " << container.topologyName().view() << "\n"
                      << "container size " << container.elementCount() << "\n"
                      << "topo size " << topologySize << "\n";
        for (Nexil::String const& name : volume.componentRange()) {
            auto const channel = volume.component<ChannelBase>(name);
            if (!channel || channel->containerName() != container.name() || channel->elementCount() == topologySize)
                continue;
            isValid = false;
            if (print)
                std::cout << "channelName " << name.view() << "\n"
                          << "topo size " << topologySize << "\n"
                          << "channel size " << channel->elementCount() << "\n";
        }
        return isValid;
    }

} // namespace

bool validUpdatedVolume(VLD::Object const& volume, bool print)
{
    bool isValid = true;
    for (Nexil::String const& name : volume.componentRange()) {
        bool isContainer = false;
        Internal::forEachConfiguration([&]<class Traits>() {
            if (auto const container = volume.component<Container<Traits>>(name)) {
                isContainer = true;
                isValid = isUpdated(volume, *container, print);
            }
        });
        if (isContainer)
            break;
    }
    return isValid;
}

bool validUpdatedVolume(VLD::Object const& volume)
{
    return validUpdatedVolume(volume, false);
}

} // namespace Veldrin::Geometry
