#include <veldrin/volume/VolumeConversion.h>

#include <nexil/JobCancel.h>
#include <veldrin/geometry/GeoProperties.h>
#include <veldrin/geometry/Prototypes.h>
#include <veldrin/object/Properties.h>
#include <veldrin/volume/VldProxyComponentChannel.h>
#include <veldrin/volume/VldProxyComponentContainer.h>
#include <veldrin/volume/VldProxyComponentTopology.h>
#include <veldrin/volume/internal/Configurations.h>
#include <vld/Container.h>
#include <vld/PointTopology.h>

#include <map>
#include <utility>

namespace Veldrin::Geometry {

namespace {

    using ObjectPtr = Nexil::Ptr<Object>;
    using VLD::TileTree3D::Channel;
    using VLD::TileTree3D::Container;
    using VLD::TileTree3D::PointTopology;
    using VLD::TileTree3D::VoxelTopology;

    /// The proxies of one kind that an object holds, with the names they stand under, by what they target.
    template <class Proxy>
    using Held = std::multimap<Nexil::String, std::pair<Nexil::String, Nexil::Ptr<Proxy>>>;

    struct Proxies {
        Held<VldProxyComponentTopology> topologies;
        Held<VldProxyComponentContainer> containers;
        Held<VldProxyComponentChannel> channels;

        explicit Proxies(Object const& object)
        {
            for (Nexil::String const& name : object.keys()) {
                // Nothing else is read: behind another type may stand data that reading would have to build.
                if (object.propertyInfo(name).type != Nexil::TypeId::of<ObjectPtr>())
                    continue;
                auto const part = getPropertyAs<ObjectPtr>(object, name);
                if (!keep(name, part, topologies) && !keep(name, part, containers))
                    keep(name, part, channels);
            }
        }

        [[nodiscard]] bool empty() const { return topologies.empty() && containers.empty() && channels.empty(); }
        [[nodiscard]] std::uint64_t count() const { return topologies.size() + containers.size() + channels.size(); }

    private:
        template <class Proxy>
        static bool keep(Nexil::String const& name, ObjectPtr const& part, Held<Proxy>& kept)
        {
            auto proxy = Nexil::dynamicPtrCast<Proxy>(part);
            if (!proxy)
                return false;
            Nexil::String target = getGeoPropTargetName(*proxy);
            kept.emplace(std::move(target), std::pair(name, std::move(proxy)));
            return true;
        }
    };

    /// Collects what belongs together, one configuration after the other.
    class Collector {
    public:
        Collector(Proxies const& proxies, VLD::Object& volume) : proxies_(proxies), volume_(volume) {}

        /// False when a proxy is left over, or a component does not fit where its proxy stands.
        bool run()
        {
            for (auto const& held : proxies_.topologies) {
                Nexil::String const& name = held.second.first;
                auto const component = held.second.second->getVldComponent();
                Internal::forEachConfiguration([&]<class Traits>() {
                    if (Nexil::dynamicPtrCast<VoxelTopology<Traits>>(component)) {
                        add(component);
                        addContainers<Traits>(name, component->name());
                    } else if (Nexil::dynamicPtrCast<PointTopology<Traits>>(component)) {
                        add(component);
                        addChannels<Traits>(name, component->name());
                    }
                });
            }
            return isSound_ && volume_.componentCount() == proxies_.count();
        }

    private:
        // What is targeted under one name is looked for under its own name in a volume: where they differ it would be lost.
        template <class Traits>
        void addContainers(Nexil::String const& topologyName, Nexil::String const& ownName)
        {
            auto const [first, last] = proxies_.containers.equal_range(topologyName);
            for (auto place = first; place != last; ++place) {
                auto const& [name, proxy] = place->second;
                auto const container = Nexil::dynamicPtrCast<Container<Traits>>(proxy->getVldComponent());
                isSound_ = isSound_ && container && topologyName == ownName;
                if (!isSound_)
                    return;
                add(container);
                addChannels<Traits>(name, container->name());
            }
        }

        template <class Traits>
        void addChannels(Nexil::String const& targetName, Nexil::String const& ownName)
        {
            auto const [first, last] = proxies_.channels.equal_range(targetName);
            for (auto place = first; place != last; ++place) {
                isSound_ = isSound_ && targetName == ownName;
                add(Nexil::dynamicPtrCast<Channel<Traits>>(place->second.second->getVldComponent()));
            }
        }

        void add(Nexil::Ptr<VLD::Component> component)
        {
            isSound_ = volume_.addComponent(std::move(component)) && isSound_;
        }

        Proxies const& proxies_;
        VLD::Object& volume_;
        bool isSound_ = true;
    };

    /// True for a volume that was populated and nothing more: it has no other component, and no values.
    bool isFreshlyPopulated(Object const& object)
    {
        if (!Object::isA(object, *getVolumePrototype()) || getElementCount(object, sVoxelComp) != 0)
            return false;
        for (auto const& name : getGeoPropNamesByPrototype(object, *getComponentGeoPropPrototype()))
            if (name != sVoxelComp)
                return false;
        for (Nexil::String const& name : object.keys()) {
            if (object.propertyInfo(name).arraySize != 0)
                return false;
            if (auto const part = getPropertyAs<ObjectPtr>(object, name))
                if (part->propertyInfo(sData).arraySize != 0 || part->propertyInfo(sIndices).arraySize != 0)
                    return false;
        }
        return true;
    }

    Nexil::MutablePtr<VLD::Object> convert(Object const& object)
    {
        Nexil::Internal::throwIfJobCancelled();
        auto volume = VLD::createObject();
        Proxies const proxies(object);
        bool const isConverted =
            proxies.empty() ? object.empty() || isFreshlyPopulated(object) : Collector(proxies, *volume).run();
        return isConverted ? std::move(volume) : nullptr;
    }

} // namespace

Nexil::MutablePtr<VLD::Object> move_object_to_vld_volume(Object& object)
{
    auto volume = convert(object);
    if (volume)
        object.eraseAllProperties();
    return volume;
}

Nexil::Ptr<VLD::Object> move_object_to_vld_volume_const(Object& object)
{
    return move_object_to_vld_volume(object);
}

Nexil::Ptr<VLD::Object> shallow_copy_object_to_vld_volume(Object const& object)
{
    return convert(object);
}

} // namespace Veldrin::Geometry
