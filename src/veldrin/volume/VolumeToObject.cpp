#include <veldrin/volume/VolumeConversion.h>

#include <nexil/JobCancel.h>
#include <veldrin/object/Properties.h>
#include <veldrin/volume/ValidUpdatedVolume.h>
#include <veldrin/volume/VldProxyComponentChannel.h>
#include <veldrin/volume/VldProxyComponentContainer.h>
#include <veldrin/volume/VldProxyComponentTopology.h>
#include <veldrin/volume/internal/Configurations.h>
#include <vld/Container.h>
#include <vld/PointTopology.h>

namespace Veldrin::Geometry {

namespace {

    using VLD::TileTree3D::Channel;
    using VLD::TileTree3D::ChannelBase;
    using VLD::TileTree3D::Container;
    using VLD::TileTree3D::PointTopology;
    using VLD::TileTree3D::VoxelTopology;

    template <class Proxy, class... Arguments>
    void store(Object& object, Nexil::String const& name, Arguments&&... arguments)
    {
        object.setPropertyAny(name, Nexil::Ptr<Object>(Nexil::makePtr<Proxy>(std::forward<Arguments>(arguments)...)));
    }

    /// Stores the components of one configuration: topologies, then containers, then channels, each in the volume's order.
    /// Returns how many there were.
    template <class Traits>
    std::uint64_t storeConfiguration(VLD::Object const& volume, Nexil::Array<Nexil::String> const& names,
                                     Object& object)
    {
        std::uint64_t stored = 0;
        for (Nexil::String const& name : names) {
            Nexil::Ptr<VLD::Component> topology = volume.component<VoxelTopology<Traits>>(name);
            if (!topology)
                topology = volume.component<PointTopology<Traits>>(name);
            if (topology) {
                store<VldProxyComponentTopology>(object, name, std::move(topology));
                ++stored;
            }
        }
        for (Nexil::String const& name : names) {
            auto container = volume.component<Container<Traits>>(name);
            if (!container || !volume.component<VoxelTopology<Traits>>(container->topologyName()))
                continue;
            Nexil::String const target = container->topologyName();
            store<VldProxyComponentContainer>(object, name, std::move(container), target);
            ++stored;
        }
        for (Nexil::String const& name : names) {
            auto channel = volume.component<Channel<Traits>>(name);
            if (!channel)
                continue;
            Nexil::String const target = channel->containerName();
            // Where that container found no place above, nothing is made of the volume at all.
            if (!volume.component<PointTopology<Traits>>(target) && !volume.component<Container<Traits>>(target))
                continue;
            store<VldProxyComponentChannel>(object, name, Nexil::Ptr<ChannelBase>(std::move(channel)), target);
            ++stored;
        }
        return stored;
    }

    enum class Outcome { Converted, Failed, Cancelled };

    /// Fills `object`, which is new and stays empty for a volume that is empty or not valid.
    Outcome convert(VLD::Object const& volume, Object& object)
    {
        if (Nexil::isJobCancelled())
            return Outcome::Cancelled;
        if (volume.empty() || !validUpdatedVolume(volume))
            return Outcome::Converted;
        auto const names = volume.componentRange();
        std::uint64_t stored = 0;
        Internal::forEachConfiguration(
            [&]<class Traits>() { stored += storeConfiguration<Traits>(volume, names, object); });
        return stored == names.size() ? Outcome::Converted : Outcome::Failed;
    }

} // namespace

Nexil::MutablePtr<Object> move_vld_volume_to_object(VLD::Object& volume)
{
    auto object = createObject();
    switch (convert(volume, *object)) {
    case Outcome::Failed: return nullptr;
    case Outcome::Cancelled: return object;
    case Outcome::Converted: break;
    }
    volume.clear();
    return object;
}

Nexil::Ptr<Object> move_vld_volume_to_object_const(VLD::Object& volume)
{
    return move_vld_volume_to_object(volume);
}

} // namespace Veldrin::Geometry
