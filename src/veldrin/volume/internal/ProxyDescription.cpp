#include <veldrin/volume/internal/ProxyDescription.h>

#include <veldrin/geometry/DataInterpolationMode.h>
#include <veldrin/geometry/Names.h>
#include <veldrin/geometry/internal/ValueTypes.h>
#include <veldrin/object/Properties.h>
#include <veldrin/volume/VldProxyComponentChannel.h>
#include <veldrin/volume/VldProxyComponentContainer.h>
#include <veldrin/volume/VldProxyComponentTopology.h>
#include <veldrin/volume/VolumeInterpolation.h>
#include <veldrin/volume/internal/Configurations.h>
#include <veldrin/volume/internal/ProxyKeys.h>
#include <vld/Container.h>
#include <vld/PointTopology.h>

#include <cmath>
#include <map>
#include <type_traits>

namespace Veldrin::Geometry::Internal {

namespace {

    using ObjectPtr = Nexil::Ptr<Object>;
    using ComponentPtr = Nexil::Ptr<VLD::Component>;
    template <class T>
    using ArrayPtr = Nexil::Ptr<Nexil::Array<T>>;
    using namespace VLD::TileTree3D;

    TileParameters parametersOf(Object const& description)
    {
        return {getPropertyAs<unsigned int>(description, kTileWidth),
                getPropertyAs<unsigned int>(description, kTileDataWidth),
                getPropertyAs<unsigned int>(description, kOffsetType),
                getPropertyAs<unsigned int>(description, kInnerLevels)};
    }

} // namespace

bool isProxyDescription(Object const& object)
{
    return object.hasProperty(kKind);
}

/// The descriptions of one geometry.
class ProxyRebuilder::Pass {
public:
    Pass(ProxyRebuilder& rebuilder, Object& geometry) : rebuilder_(rebuilder), geometry_(geometry) {}

    void run()
    {
        // What is targeted comes before what targets it.
        std::vector<Described> topologies, containers, channels;
        for (Nexil::String const& key : geometry_.keys()) {
            auto description = getPropertyAs<ObjectPtr>(geometry_, key);
            if (!description || !isProxyDescription(*description))
                continue;
            auto const kind = getPropertyAs<Nexil::String>(*description, kKind);
            auto& list = kind == kContainerKind ? containers : kind == kChannelKind ? channels : topologies;
            list.push_back({key, std::move(description), kind});
        }
        for (Described const& described : topologies)
            replace<VldProxyComponentTopology>(described, nullptr, [&] {
                return described.kind == kVoxelTopologyKind   ? makeVoxelTopology(*described.description)
                       : described.kind == kPointTopologyKind ? makePointTopology(*described.description)
                                                              : nullptr;
            });
        for (Described const& described : containers) {
            auto const target = targetOf(*described.description);
            replace<VldProxyComponentContainer>(described, target,
                                                [&] { return makeContainer(*described.description, target); });
        }
        for (Described const& described : channels) {
            auto const target = targetOf(*described.description);
            replace<VldProxyComponentChannel>(described, target,
                                              [&] { return makeChannel(*described.description, target); });
        }
    }

private:
    struct Described {
        Nexil::String key;
        ObjectPtr description;
        Nexil::String kind;
    };

    [[nodiscard]] ComponentPtr targetOf(Object const& description) const
    {
        auto const place = components_.find(getPropertyAs<Nexil::String>(description, sTarget));
        return place == components_.end() ? nullptr : place->second;
    }

    /// Puts a proxy of the component that make() gives in the place of its description.
    template <class Proxy, class Make>
    void replace(Described const& described, ComponentPtr const& target, Make const& make)
    {
        Rebuilt& rebuilt = rebuilder_.rebuilt_[described.description.get()];
        if (!rebuilt.proxy || !(rebuilt.target == target)) {
            auto component = make();
            if (!component) {
                rebuilder_.damaged_.push_back(described.key);
                return;
            }
            rebuilt = {described.description, target, proxyOf<Proxy>(std::move(component), *described.description)};
        }
        components_[described.key] = componentOf<Proxy>(rebuilt.proxy);
        geometry_.setPropertyAny(described.key, rebuilt.proxy);
    }

    template <class Proxy, class Component>
    static ObjectPtr proxyOf(Component component, Object const& description)
    {
        if constexpr (std::is_same_v<Proxy, VldProxyComponentTopology>)
            return Nexil::makePtr<Proxy>(std::move(component));
        else
            return Nexil::makePtr<Proxy>(std::move(component), getPropertyAs<Nexil::String>(description, sTarget));
    }

    template <class Proxy>
    static ComponentPtr componentOf(ObjectPtr const& proxy)
    {
        return static_cast<Proxy const&>(*proxy).getVldComponent();
    }

    /// Counts a look at arrays; false when there were too many.
    template <class... T>
    bool mayLookAt(Nexil::Array<T> const&... arrays)
    {
        std::uint64_t const bytes = ((arrays.size() * sizeof(T)) + ...);
        auto pay = [this](void const* address, std::uint64_t size) {
            if (rebuilder_.paidArrays_.insert(address).second)
                rebuilder_.bytesToLookAt_ += kLooksPerArray * size;
        };
        (pay(&arrays, arrays.size() * sizeof(T)), ...);
        if (bytes > rebuilder_.bytesToLookAt_)
            return false;
        rebuilder_.bytesToLookAt_ -= bytes;
        return true;
    }

    /// What make() gives for arrays of tiles, asked once for the same arrays.
    template <class Topology, class Make, class... T>
    Nexil::Ptr<Topology> topologyOf(Make const& make, ArrayPtr<T> const&... arrays)
    {
        if (!(arrays && ...))
            return nullptr;
        auto const [place, isNew] = rebuilder_.tiles_.try_emplace({typeid(Topology), {arrays.get()...}});
        Tiles& tiles = place->second;
        if (isNew) {
            tiles.arrays = {Nexil::Any(arrays)...};
            if (mayLookAt(*arrays...))
                tiles.topology = make();
        }
        return Nexil::dynamicPtrCast<Topology>(tiles.topology);
    }

    ComponentPtr makeVoxelTopology(Object const& description)
    {
        auto const name = getPropertyAs<Nexil::String>(description, kName);
        SharedTileLevels const levels{getPropertyAs<ArrayPtr<Coordinate>>(description, kLeafOrigins),
                                      getPropertyAs<ArrayPtr<unsigned int>>(description, kLeafParents),
                                      getPropertyAs<ArrayPtr<Coordinate>>(description, kInnerOrigins),
                                      getPropertyAs<ArrayPtr<unsigned int>>(description, kInnerChildren)};
        ComponentPtr made;
        forEachConfiguration([&]<class Traits>() {
            if (parametersOf(description) != Traits::parameters() || name.empty())
                return;
            using Topology = VoxelTopology<Traits>;
            auto const make = [&] {
                auto& known = rebuilder_.topologyOfInnerTiles_[{typeid(Topology), levels.innerOrigins.get()}];
                auto const like = Nexil::dynamicPtrCast<Topology>(known);
                auto topology = like ? Topology::create(name, levels, *like) : Topology::create(name, levels);
                if (topology)
                    known = topology;
                return topology;
            };
            auto const topology = topologyOf<Topology>(make, levels.leafOrigins, levels.leafParents,
                                                       levels.innerOrigins, levels.innerChildren);
            auto const count = description.getProperty(sCount);
            auto const* const heldCount = count.get<unsigned int>();
            if (topology && heldCount && *heldCount == topology->elementCount())
                made = underName(topology, name);
        });
        return made;
    }

    ComponentPtr makePointTopology(Object const& description)
    {
        auto const name = getPropertyAs<Nexil::String>(description, kName);
        auto const origins = getPropertyAs<ArrayPtr<Coordinate>>(description, kLeafOrigins);
        auto const offsets = getPropertyAs<ArrayPtr<unsigned int>>(description, kOffsets);
        ComponentPtr made;
        forEachConfiguration([&]<class Traits>() {
            if (parametersOf(description) != Traits::parameters() || name.empty())
                return;
            using Topology = PointTopology<Traits>;
            if (auto const topology =
                    topologyOf<Topology>([&] { return Topology::create(name, origins, offsets); }, origins, offsets))
                made = underName(topology, name);
        });
        return made;
    }

    /// The topology itself, or its tiles under another name.
    template <class Topology>
    static ComponentPtr underName(Nexil::Ptr<Topology> const& topology, Nexil::String const& name)
    {
        if (topology->name() == name)
            return topology;
        return Nexil::makePtr<Topology>(name, *topology);
    }

    static ComponentPtr makeContainer(Object const& description, ComponentPtr const& target)
    {
        auto const name = getPropertyAs<Nexil::String>(description, kName);
        float const voxelSize = getPropertyAs<float>(description, kVoxelSize);
        if (name.empty() || !std::isfinite(voxelSize) || !(voxelSize > 0) ||
            !description.getProperty(kTopology).holds<Nexil::String>())
            return nullptr;
        ComponentPtr made;
        forEachConfiguration([&]<class Traits>() {
            auto topology = Nexil::dynamicPtrCast<VoxelTopology<Traits>>(target);
            if (!topology)
                return;
            auto container = Nexil::makeMutable<Container<Traits>>(name, std::move(topology), voxelSize);
            container->setTopologyName(getPropertyAs<Nexil::String>(description, kTopology));
            made = std::move(container);
        });
        return made;
    }

    static Nexil::Ptr<ChannelBase> makeChannel(Object const& description, ComponentPtr const& target)
    {
        Nexil::Ptr<ChannelBase> made;
        forEachConfiguration([&]<class Traits>() {
            if (parametersOf(description) != Traits::parameters())
                return;
            if (auto const container = Nexil::dynamicPtrCast<Container<Traits>>(target))
                made = makeChannelOf<Traits>(description, container->elementCount());
            else if (auto const points = Nexil::dynamicPtrCast<PointTopology<Traits>>(target))
                made = makeChannelOf<Traits>(description, points->elementCount());
        });
        return made;
    }

    template <class Traits>
    static Nexil::Ptr<ChannelBase> makeChannelOf(Object const& description, std::uint64_t elementCount)
    {
        auto const name = getPropertyAs<Nexil::String>(description, kName);
        auto const container = description.getProperty(kContainer);
        auto const* const containerName = container.get<Nexil::String>();
        auto const mode = description.getProperty(sInterp);
        auto const data = description.getProperty(sData);
        auto const defaultValue = description.getProperty(sDefault);
        auto const* const heldMode = mode.get<Common::DataInterpolationMode>();
        if (name.empty() || !containerName || !heldMode || Nexil::AnyArray::get_any_array_size(data) != elementCount)
            return nullptr;
        Nexil::Ptr<ChannelBase> made;
        forEachValueType([&]<class T>(unsigned int, char const*) {
            if constexpr (std::is_trivially_copyable_v<T>) {
                auto const* const values = data.get<ArrayPtr<T>>();
                auto const* const held = defaultValue.get<T>();
                if (values && *values && held)
                    made = Nexil::makePtr<Channel<Traits>>(name, *containerName, *values, *held,
                                                           to_vld_volume_interp(*heldMode));
            }
        });
        return made;
    }

    ProxyRebuilder& rebuilder_;
    Object& geometry_;
    // What stands under each key now, for what targets it.
    std::map<Nexil::String, ComponentPtr> components_;
};

void ProxyRebuilder::rebuild(Object& geometry)
{
    Pass(*this, geometry).run();
}

} // namespace Veldrin::Geometry::Internal
