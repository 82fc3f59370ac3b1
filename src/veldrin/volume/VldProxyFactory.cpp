#include <veldrin/volume/VldProxyFactory.h>

#include <veldrin/geometry/GeoProperties.h>
#include <veldrin/geometry/Prototypes.h>
#include <veldrin/geometry/internal/ValueTypes.h>
#include <veldrin/object/Properties.h>
#include <veldrin/volume/VldProxyComponentChannel.h>
#include <veldrin/volume/VldProxyComponentContainer.h>
#include <veldrin/volume/VldProxyComponentTopology.h>
#include <veldrin/volume/VolumeInterpolation.h>
#include <veldrin/volume/internal/Configurations.h>
#include <vld/Container.h>

#include <cmath>
#include <type_traits>

namespace Veldrin::Geometry {

namespace {

    using ObjectPtr = Nexil::Ptr<Object>;
    using Common::DataInterpolationMode;
    using VLD::TileTree3D::Channel;
    using VLD::TileTree3D::ChannelBase;
    using VLD::TileTree3D::Container;
    using VLD::TileTree3D::DataElementInitializerType;
    using VLD::TileTree3D::TileLevels;
    using VLD::TileTree3D::VoxelTopology;

    /// A number of any type; `missing` where there is no property, NaN where it is no number.
    double numberOf(Object const& object, char const* key, double missing)
    {
        if (!object.hasProperty(key))
            return missing;
        auto const value = object.getProperty(key);
        double number = std::nan("");
        Internal::forEachValueType([&]<class T>(unsigned int, char const*) {
            if constexpr (std::is_arithmetic_v<T> && !std::is_same_v<T, bool>)
                if (auto const* held = value.get<T>())
                    number = static_cast<double>(*held);
        });
        return number;
    }

    template <class Proxy, class... Arguments>
    void store(Object& destination, Nexil::String const& name, Arguments&&... arguments)
    {
        destination.setPropertyAny(name, ObjectPtr(Nexil::makePtr<Proxy>(std::forward<Arguments>(arguments)...)));
    }

    template <class Traits>
    class Factory {
    public:
        Factory(Object const& source, Object& destination) : source_(source), destination_(destination) {}

        void makeTopology(Nexil::String const& name) const
        {
            Object const& description = *getPropertyAs<ObjectPtr>(source_, name);
            auto const parameters = Traits::parameters();
            if (numberOf(description, "voxelTileWidth", 5) != parameters.tileWidth ||
                numberOf(description, "voxelTileDataWidth", 5) != parameters.dataWidth ||
                numberOf(description, "voxelOffsetType", 0) != parameters.offsetType)
                return;
            auto const topology = Nexil::makePtr<VoxelTopology<Traits>>(name, TileLevels());
            store<VldProxyComponentTopology>(destination_, name, topology);
            auto const dataPrototype = getDataGeoPropPrototype(sGenericDataGeoProp);
            for (auto const& target : getGeoPropNamesByTarget(source_, name))
                if (!Object::isA(*getPropertyAs<ObjectPtr>(source_, target), *dataPrototype))
                    makeContainer(target, topology);
        }

    private:
        void makeContainer(Nexil::String const& name, Nexil::Ptr<VoxelTopology<Traits>> const& topology) const
        {
            double const voxelSize = numberOf(*getPropertyAs<ObjectPtr>(source_, name), "voxelSize", 1);
            auto const size = static_cast<float>(voxelSize);
            if (!std::isfinite(size) || !(size > 0))
                return;
            store<VldProxyComponentContainer>(
                destination_, name, Nexil::makePtr<Container<Traits>>(name, topology, size), topology->name());
            auto const dataPrototype = getDataGeoPropPrototype(sGenericDataGeoProp);
            for (auto const& target : getGeoPropNamesByTarget(source_, name))
                if (Object::isA(*getPropertyAs<ObjectPtr>(source_, target), *dataPrototype))
                    makeChannel(target, name);
        }

        void makeChannel(Nexil::String const& name, Nexil::String const& container) const
        {
            auto const description = getPropertyAs<ObjectPtr>(source_, name);
            auto const defaultValue = description->getProperty(sDefault);
            auto const initializer = to_vld_volume_interp(getPropertyAs<DataInterpolationMode>(*description, sInterp));
            Internal::forEachValueType([&]<class T>(unsigned int, char const*) {
                if constexpr (std::is_trivially_copyable_v<T>)
                    if (auto const* held = defaultValue.get<T>())
                        store<VldProxyComponentChannel>(
                            destination_, name,
                            Nexil::Ptr<ChannelBase>(Nexil::makePtr<Channel<Traits>>(
                                name, container, Nexil::Ptr<Nexil::Array<T>>(), *held, initializer)),
                            container);
            });
        }

        Object const& source_;
        Object& destination_;
    };

} // namespace

void vldProxyFactory(Object const& source, Object& destination)
{
    Object made;
    for (auto const& name : getGeoPropNamesByPrototype(source, *getComponentGeoPropPrototype()))
        Internal::forEachConfiguration([&]<class Traits>() { Factory<Traits>(source, made).makeTopology(name); });
    moveProperties(made, destination);
}

} // namespace Veldrin::Geometry
