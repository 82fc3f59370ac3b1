#include "Samples.h"

#include <support/Geometry.h>

#include <veldrin/geometry/Prototypes.h>
#include <veldrin/volume/VldProxyAccess.h>
#include <veldrin/volume/VldProxyComponentChannel.h>
#include <veldrin/volume/VldProxyComponentContainer.h>
#include <veldrin/volume/VldProxyComponentTopology.h>
#include <veldrin/volume/VldProxyFactory.h>
#include <veldrin/volume/VolumeConversion.h>

#include <thread>

namespace {

using namespace Veldrin;
using namespace VLD::TileTree3D;
using Geometry::VldProxyComponentChannel;
using Geometry::VldProxyComponentContainer;
using Geometry::VldProxyComponentTopology;
using Geometry::Common::DataInterpolationMode;
using FloatArray = Nexil::Array<float>;

Nexil::Ptr<ChannelBase> channel()
{
    return Nexil::makePtr<Channel<SmallTiles>>("c", "tiles", Nexil::makePtr<FloatArray>(FloatArray{1, 2, 3}), 5.0f);
}

Nexil::Any floats(std::initializer_list<float> values)
{
    return Nexil::makePtr<FloatArray>(FloatArray(values));
}

/// What a proxy answers agrees with itself, with the prototype of what it plays, and with what it refuses.
void expectPlays(Object& proxy, Object const& prototype)
{
    auto const keys = proxy.keys();
    EXPECT_EQ(support::names(keys), support::names(prototype.keys()));
    EXPECT_EQ(proxy.size(), keys.size());
    EXPECT_FALSE(proxy.empty());
    EXPECT_TRUE(Object::isA(proxy, prototype));
    for (auto const& key : keys) {
        auto const value = proxy.getProperty(key);
        auto const info = proxy.propertyInfo(key);
        EXPECT_TRUE(proxy.hasProperty(key) && info.exists) << key;
        EXPECT_EQ(info.type, value.type()) << key;
        EXPECT_EQ(info.isArray, Nexil::AnyArray::is_any_array(value)) << key;
        EXPECT_EQ(info.arraySize, Nexil::AnyArray::get_any_array_size(value)) << key;
        EXPECT_FALSE(proxy.setPropertyAny(key, std::string("of no such type"))) << key;
        EXPECT_TRUE(proxy.extractProperty(key).empty()) << key;
        EXPECT_FALSE(proxy.eraseProperty(key)) << key;
        EXPECT_FALSE(proxy.getProperty(key).empty()) << key;
    }
    proxy.eraseAllProperties();
    EXPECT_EQ(proxy.size(), keys.size());
    EXPECT_FALSE(proxy.hasProperty("other"));
    EXPECT_FALSE(proxy.propertyInfo("other").exists);
    EXPECT_TRUE(proxy.getProperty("other").empty());
    EXPECT_FALSE(proxy.setPropertyAny("other", 1));
    EXPECT_FALSE(proxy.setPropertyAny("depends_on", Nexil::makePtr<Nexil::Array<Nexil::String>>()));
}

TEST(VolumeProxies, PlayTheGeoPropertiesThatTheyStandFor)
{
    auto const grid = support::sphere<SmallTiles>({.channelName = "d"});
    VldProxyComponentTopology topology(grid.topology);
    expectPlays(topology, *Geometry::getComponentGeoPropPrototype());
    EXPECT_EQ(getPropertyAs<unsigned int>(topology, "count"), grid.topology->elementCount());
    EXPECT_FALSE(topology.setPropertyAny("count", 3u));

    VldProxyComponentContainer container(grid.container, "t");
    expectPlays(container, *Geometry::getRangeGeoPropPrototype());
    VldProxyComponentChannel data(grid.channel, "t");
    expectPlays(data, *Geometry::getDataGeoPropPrototype(Geometry::sGenericDataGeoProp));

    // Without a component there is nothing to read, and nothing breaks.
    EXPECT_TRUE(VldProxyComponentTopology(nullptr).getProperty("count").empty());
    EXPECT_TRUE(VldProxyComponentTopology(grid.channel).getProperty("count").empty());
    EXPECT_EQ(
        getPropertyAs<Nexil::Ptr<Nexil::Array<unsigned int>>>(VldProxyComponentContainer(nullptr), "indices")->size(),
        0u);
    EXPECT_EQ(getPropertyAs<Nexil::String>(VldProxyComponentChannel(nullptr, "t"), "target"), "t");
    EXPECT_TRUE(VldProxyComponentChannel(nullptr).getProperty("data").empty());
    EXPECT_FALSE(VldProxyComponentChannel(nullptr).propertyInfo("data").type);
}

TEST(VolumeProxies, AWriteReachesAChannelThatNobodyElseHoldsAndACopyOfOneThatOthersHold)
{
    auto held = channel();
    auto const* const address = held.get();
    VldProxyComponentChannel alone(std::move(held), "tiles");
    EXPECT_TRUE(alone.setPropertyAny("data", floats({4, 5, 6})));
    EXPECT_TRUE(alone.setPropertyAny("default", 7.0f));
    EXPECT_TRUE(alone.setPropertyAny("interpolation_mode", DataInterpolationMode::Nearest));
    EXPECT_TRUE(alone.setPropertyAny("target", Nexil::String("other")));
    EXPECT_EQ(alone.getVldComponent().get(), address);
    EXPECT_EQ(*address->values<float>(), (FloatArray{4, 5, 6}));
    EXPECT_EQ(*address->defaultValue().get<float>(), 7.0f);
    EXPECT_EQ(address->initializer(), DataElementInitializerType::Nearest);
    EXPECT_EQ(address->containerName(), "other");
    EXPECT_EQ(getPropertyAs<Nexil::String>(alone, "target"), "other");

    VldProxyComponentChannel copy = alone;
    EXPECT_EQ(copy.getVldComponent().get(), address);
    EXPECT_FALSE(copy.setPropertyAny("data", floats({4, 5})));
    EXPECT_FALSE(copy.setPropertyAny("default", 7.0));
    EXPECT_EQ(copy.getVldComponent().get(), address) << "what is refused copies nothing";
    EXPECT_TRUE(copy.setPropertyAny("default", 8.0f));
    EXPECT_NE(copy.getVldComponent().get(), address);
    EXPECT_EQ(copy.getVldComponent()->values<float>(), address->values<float>()) << "the array stays shared";
    EXPECT_EQ(getPropertyAs<float>(alone, "default"), 7.0f);

    VldProxyComponentChannel third = alone;
    auto const values = address->values<float>();
    EXPECT_TRUE(third.setInPlacePropertyAny("data", floats({7, 8, 9})));
    EXPECT_TRUE(third.setInPlacePropertyAny("target", Nexil::String("third")));
    EXPECT_FALSE(third.setInPlacePropertyAny("data", floats({7})));
    EXPECT_EQ(third.getVldComponent().get(), address);
    EXPECT_EQ(*getPropertyAs<Nexil::Ptr<FloatArray>>(alone, "data"), (FloatArray{7, 8, 9}));
    EXPECT_EQ(*values, (FloatArray{4, 5, 6})) << "an array that somebody holds is never written";
    EXPECT_EQ(getPropertyAs<Nexil::String>(alone, "target"), "other");
}

TEST(VolumeProxies, ATargetThatIsSetIsTheContainersTopologyFromThenOn)
{
    auto const grid = support::sphere<WideTiles>({.channelName = "d"});
    VldProxyComponentContainer proxy(grid.container, "voxel_component");
    EXPECT_FALSE(proxy.setPropertyAny("target", 3));
    EXPECT_TRUE(proxy.setPropertyAny("target", Nexil::String("other")));
    EXPECT_EQ(getPropertyAs<Nexil::String>(proxy, "target"), "other");
    EXPECT_EQ(grid.container->topologyName(), "voxel_component");
    auto const own = Nexil::dynamicPtrCast<Container<WideTiles>>(proxy.getVldComponent());
    EXPECT_EQ(own->topologyName(), "other");
    EXPECT_EQ(own->topology(), grid.topology);
}

TEST(VolumeProxies, ObjectsThatShareChannelsAreWrittenOnManyThreadsAtOnce)
{
    auto volume = support::sphereVolume<SmallTiles>(6);
    Nexil::Ptr<Object> const shared = Geometry::move_vld_volume_to_object(*volume);
    auto const before = support::arrayIn<float>(*shared, Geometry::sVoxelSignedDistance);
    FloatArray const copy = *before;
    std::vector<std::thread> threads;
    std::vector<float> read(4);
    for (std::size_t t = 0; t < read.size(); ++t)
        threads.emplace_back([&, t] {
            for (int round = 0; round < 50; ++round) {
                Nexil::MutablePtr<Object> own(Nexil::Ptr<Object>{shared});
                Nexil::MutablePtr<Object> data(getPropertyAs<Nexil::Ptr<Object>>(*own, Geometry::sVoxelSignedDistance));
                EXPECT_TRUE(data->setPropertyAny("default", float(t)));
                EXPECT_TRUE(data->setPropertyAny("data", Nexil::makePtr<FloatArray>(*before)));
                setProperty(*own, Geometry::sVoxelSignedDistance, std::move(data));
                auto const mine = Geometry::shallow_copy_object_to_vld_volume(*own);
                read[t] += *mine->component<ChannelBase>("voxel_signed_distance")->defaultValue().get<float>();
                EXPECT_EQ(Geometry::getRangeGeoPropIndices(*own, Geometry::sVoxelTileTree)->size(), before->size());
            }
        });
    for (auto& thread : threads)
        thread.join();
    EXPECT_EQ(read, (std::vector<float>{0, 50, 100, 150}));
    EXPECT_EQ(support::arrayIn<float>(*shared, Geometry::sVoxelSignedDistance), before);
    EXPECT_EQ(*before, copy);
}

TEST(VolumeProxies, WhatIsTakenOutOfTheWrongObjectNamesItsType)
{
    auto const grid = support::sphere<SmallTiles>({.channelName = "d"});
    Nexil::Ptr<Object> const topology = Nexil::makePtr<VldProxyComponentTopology>(grid.topology);
    Nexil::Ptr<Object> const container = Nexil::makePtr<VldProxyComponentContainer>(grid.container);
    Nexil::Ptr<Object> const data = Nexil::makePtr<VldProxyComponentChannel>(grid.channel);
    EXPECT_EQ(Geometry::getVldTopologyFromProxy(topology).get(), grid.topology.get());
    EXPECT_EQ(Geometry::getVldContainerFromProxy(container).get(), grid.container.get());
    EXPECT_EQ(Geometry::getVldChannelFromProxy(data).get(), grid.channel.get());

    auto message = [](auto const& take, Nexil::Ptr<Object> const& from) {
        try {
            static_cast<void>(take(from));
        } catch (std::runtime_error const& error) {
            return std::string(error.what());
        }
        return std::string();
    };
    EXPECT_EQ(message(Geometry::getVldTopologyFromProxy, nullptr),
              "Could not find VLD component topology from proxy of type: null");
    EXPECT_EQ(message(Geometry::getVldContainerFromProxy, Nexil::Ptr<Object>(createObject())),
              "Could not find VLD component container from proxy of type: Veldrin::Object");
    EXPECT_EQ(message(Geometry::getVldChannelFromProxy, topology),
              "Could not find VLD component channel from proxy of type: Veldrin::Geometry::VldProxyComponentTopology");
    EXPECT_EQ(message(Geometry::getVldChannelFromProxy, Nexil::makePtr<VldProxyComponentChannel>(nullptr)),
              "Could not find VLD component channel from proxy of type: Veldrin::Geometry::VldProxyComponentChannel");
}

/// "comp" with a range "tree" and data "dens" over it, changed by `change(component, range, data)`.
template <class Change>
Nexil::MutablePtr<Object> description(Change const& change)
{
    auto component = createObject(), range = createObject(), data = createObject(), source = createObject();
    Geometry::populateComponentGeoProperty(7, *component);
    Geometry::populateRangeGeoProperty(nullptr, "comp", *range);
    Geometry::createDataGeoProperty<float>(0.25f, "tree", nullptr, *data);
    change(*component, *range, *data);
    setProperty(*source, "comp", std::move(component));
    setProperty(*source, "tree", std::move(range));
    setProperty(*source, "dens", std::move(data));
    return source;
}

TEST(VolumeProxies, TheFactoryMakesWhatADescriptionAsksFor)
{
    auto const source = description([](Object& component, Object& range, Object& data) {
        setProperty(component, "voxelTileWidth", 2u);
        setProperty(component, "voxelTileDataWidth", 4);
        setProperty(component, "voxelOffsetType", 0ull);
        setProperty(range, "voxelSize", 0.125);
        setProperty(data, "default", Math::float3{1, 2, 3});
        setProperty(data, "interpolation_mode", DataInterpolationMode::Nearest);
    });
    auto destination = createObject();
    Geometry::vldProxyFactory(*source, *destination);
    EXPECT_EQ(support::names(destination->keys()), (std::vector<std::string>{"comp", "tree", "dens"}));
    auto const volume = Geometry::move_object_to_vld_volume(*destination);
    ASSERT_TRUE(volume);
    EXPECT_EQ(volume->component<VoxelTopology<SmallTiles>>("comp")->elementCount(), 0u);
    auto const container = volume->component<Container<SmallTiles>>("tree");
    ASSERT_TRUE(container);
    EXPECT_EQ(container->voxelSize(), 0.125f);
    EXPECT_TRUE(container->checkConsistency(true));
    auto const made = volume->component<Channel<SmallTiles>>("dens");
    ASSERT_TRUE(made);
    EXPECT_EQ(*made->defaultValue().get<Math::float3>(), (Math::float3{1, 2, 3}));
    EXPECT_NE(made->values<Math::float3>(), nullptr);
    EXPECT_EQ(made->initializer(), DataElementInitializerType::Nearest);
    EXPECT_EQ(made->containerName(), "tree");
}

TEST(VolumeProxies, TheFactoryPassesOverWhatItCannotMakeAndWhatHangsOnThat)
{
    struct Case {
        char const* name;
        std::vector<std::string> made;
        void (*change)(Object& component, Object& range, Object& data);
    };
    std::vector<std::string> const all{"comp", "tree", "dens"};
    std::vector<Case> const cases{
        {"nothing given", all, [](Object&, Object&, Object&) {}},
        {"another width", {}, [](Object& c, Object&, Object&) { setProperty(c, "voxelTileWidth", 2u); }},
        {"a width that is no number", {}, [](Object& c, Object&, Object&) { setProperty(c, "voxelTileWidth", "5"); }},
        {"another offset", {}, [](Object& c, Object&, Object&) { setProperty(c, "voxelOffsetType", 1u); }},
        {"no voxel size", {"comp"}, [](Object&, Object& r, Object&) { setProperty(r, "voxelSize", 0.0f); }},
        {"an endless voxel size", {"comp"}, [](Object&, Object& r, Object&) { setProperty(r, "voxelSize", 1e300); }},
        {"a text as default", {"comp", "tree"}, [](Object&, Object&, Object& d) { setProperty(d, "default", "text"); }},
        {"data that targets the component",
         {"comp", "tree"},
         [](Object&, Object&, Object& d) { setProperty(d, "target", Nexil::String("comp")); }},
    };
    for (Case const& c : cases) {
        auto destination = createObject();
        Geometry::vldProxyFactory(*description(c.change), *destination);
        EXPECT_EQ(support::names(destination->keys()), c.made) << c.name;
    }
}

} // namespace
