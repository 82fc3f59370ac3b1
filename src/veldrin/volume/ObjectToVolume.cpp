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

    /// A proxy and the name it stands under.
    template <class Proxy>
    struct Held {
        Nexil::String name;
        Nexil::Ptr<Proxy> proxy;
    };

    /// The proxies of one kind that an object holds, by what they target, in the order in which the object has them.
    template <class Proxy>
    using ByTarget = std::multimap<Nexil::String, Held<Proxy>>;

    struct Proxies {
        Nexil::Array<Held<VldProxyComponentTopology>> topologies;
        ByTarget<VldProxyComponentContainer> containers;
        ByTarget<VldProxyComponentChannel> channels;

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
        static bool keep(Nexil::String const& name, ObjectPtr const& part,
                         Nexil::Array<Held<VldProxyComponentTopology>>& kept)
        {
            auto proxy = Nexil::dynamicPtrCast<VldProxyComponentTopology>(part);
            if (!proxy)
                return false;
            kept.push_back({name, std::move(proxy)});
            return true;
        }

        template <class Proxy>
        static bool keep(Nexil::String const& name, ObjectPtr const& part, ByTarget<Proxy>& kept)
        {
            auto proxy = Nexil::dynamicPtrCast<Proxy>(part);
            if (!proxy)
                return false;
            Nexil::String target = getGeoPropTargetName(*proxy);
            kept.emplace(std::move(target), Held<Proxy>{name, std::move(proxy)});
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
                auto const component = held.proxy->getVldComponent();
                Internal::forEachConfiguration([&]<class Traits>() {
                    if (Nexil::dynamicPtrCast<VoxelTopology<Traits>>(component)) {
                        add(component);
                        addContainers<Traits>(held.name, component->name());
                    } else if (Nexil::dynamicPtrCast<PointTopology<Traits>>(component)) {
                        add(component);
                        addChannels<Traits>(held.name, component->name());
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
                add(Nexil::dynamicPtrCast<Channel<Traits>>(place->second.proxy->getVldComponent()));
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
