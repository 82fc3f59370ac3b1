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
using ObjectPtr = Nexil::Ptr<Object>;
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
    EXPECT_FALSE(proxy.setPropertyAny("other", DataInterpolationMode::Linear));
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
    EXPECT_TRUE(VldProxyComponentTopology(support::hugeTopology()).getProperty("count").empty());
    VldProxyComponentContainer const noContainer(nullptr);
    EXPECT_TRUE(getPropertyAs<Nexil::Ptr<Nexil::Array<unsigned int>>>(noContainer, "indices")->empty());
    VldProxyComponentChannel const noChannel(nullptr, "t");
    EXPECT_EQ(getPropertyAs<Nexil::String>(noChannel, "target"), "t");
    EXPECT_TRUE(noChannel.getProperty("data").empty());
    EXPECT_FALSE(noChannel.propertyInfo("data").type);
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

    VldProxyComponentChannel copy = alone;
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
    EXPECT_EQ(*getPropertyAs<Nexil::Ptr<FloatArray>>(alone, "data"), (FloatArray{7, 8, 9}));
    EXPECT_EQ(*values, (FloatArray{4, 5, 6})) << "an array that somebody holds is never written";
    EXPECT_EQ(getPropertyAs<Nexil::String>(alone, "target"), "other");

    auto const grid = support::sphere<WideTiles>({.channelName = "d"});
    VldProxyComponentContainer container(grid.container, "voxel_component");
    EXPECT_TRUE(container.setPropertyAny("target", Nexil::String("other")));
    EXPECT_EQ(getPropertyAs<Nexil::String>(container, "target"), "other");
    EXPECT_EQ(grid.container->topologyName(), "voxel_component");
    auto const own = Nexil::dynamicPtrCast<Container<WideTiles>>(container.getVldComponent());
    EXPECT_EQ(own->topologyName(), "other");
    EXPECT_EQ(own->topology(), grid.topology);
}

TEST(VolumeProxies, ObjectsThatShareChannelsAreWrittenOnManyThreadsAtOnce)
{
    auto volume = support::sphereVolume<SmallTiles>(6);
    ObjectPtr const shared = Geometry::move_vld_volume_to_object(*volume);
    auto const before = support::arrayIn<float>(*shared, Geometry::sVoxelSignedDistance);
    FloatArray const copy = *before;
    std::vector<std::thread> threads;
    std::vector<float> read(4);
    for (std::size_t t = 0; t < read.size(); ++t)
        threads.emplace_back([&, t] {
            for (int round = 0; round < 50; ++round) {
                Nexil::MutablePtr<Object> own(ObjectPtr{shared});
                Nexil::MutablePtr<Object> data(getPropertyAs<ObjectPtr>(*own, Geometry::sVoxelSignedDistance));
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
    ObjectPtr const topology = Nexil::makePtr<VldProxyComponentTopology>(grid.topology);
    EXPECT_EQ(Geometry::getVldTopologyFromProxy(topology).get(), grid.topology.get());
    auto message = [](auto const& take, ObjectPtr const& from) {
        try {
            static_cast<void>(take(from));
        } catch (std::runtime_error const& error) {
            return std::string(error.what());
        }
        return std::string();
    };
    EXPECT_EQ(message(Geometry::getVldTopologyFromProxy, nullptr),
              "Could not find VLD component topology from proxy of type: null");
    EXPECT_EQ(message(Geometry::getVldContainerFromProxy, ObjectPtr(createObject())),
              "Could not find VLD component container from proxy of type: Veldrin::Object");
    EXPECT_EQ(message(Geometry::getVldChannelFromProxy, topology),
              "Could not find VLD component channel from proxy of type: Veldrin::Geometry::VldProxyComponentTopology");
    EXPECT_EQ(message(Geometry::getVldChannelFromProxy, Nexil::makePtr<VldProxyComponentChannel>(nullptr)),
              "Could not find VLD component channel from proxy of type: Veldrin::Geometry::VldProxyComponentChannel");
}

enum Part { Component, Range, Data };

struct Change {
    Part part;
    char const* key;
    Nexil::Any value;
};

/// What the factory makes of "comp" with a range "tree" and data "dens" over it, with the changes.
Nexil::MutablePtr<Object> made(std::vector<Change> const& changes)
{
    auto source = createObject(), destination = createObject();
    Nexil::MutablePtr<Object> parts[] = {createObject(), createObject(), createObject()};
    Geometry::populateComponentGeoProperty(7, *parts[Component]);
    Geometry::populateRangeGeoProperty(nullptr, "comp", *parts[Range]);
    Geometry::createDataGeoProperty<float>(0.25f, "tree", nullptr, *parts[Data]);
    for (Change const& change : changes)
        parts[change.part]->setPropertyAny(change.key, Nexil::Any(change.value));
    setProperty(*source, "comp", std::move(parts[Component]));
    setProperty(*source, "tree", std::move(parts[Range]));
    setProperty(*source, "dens", std::move(parts[Data]));
    Geometry::vldProxyFactory(*source, *destination);
    return destination;
}

TEST(VolumeProxies, TheFactoryMakesWhatADescriptionAsksFor)
{
    auto const volume =
        Geometry::move_object_to_vld_volume(*made({{Component, "voxelTileWidth", 2u},
                                                   {Component, "voxelTileDataWidth", 4},
                                                   {Component, "voxelOffsetType", 0ull},
                                                   {Range, "voxelSize", 0.125},
                                                   {Data, "default", Math::float3{1, 2, 3}},
                                                   {Data, "interpolation_mode", DataInterpolationMode::Nearest}}));
    ASSERT_TRUE(volume);
    auto const container = volume->component<Container<SmallTiles>>("tree");
    ASSERT_TRUE(container);
    EXPECT_EQ(container->voxelSize(), 0.125f);
    EXPECT_EQ(container->topology(), volume->component<VoxelTopology<SmallTiles>>("comp"));
    auto const channel = volume->component<Channel<SmallTiles>>("dens");
    ASSERT_TRUE(channel);
    EXPECT_EQ(*channel->defaultValue().get<Math::float3>(), (Math::float3{1, 2, 3}));
    EXPECT_NE(channel->values<Math::float3>(), nullptr);
    EXPECT_EQ(channel->initializer(), DataElementInitializerType::Nearest);

    // What is not given is read as wide tiles of voxels of size 1.
    auto const wide = Geometry::move_object_to_vld_volume(*made({}))->component<Container<WideTiles>>("tree");
    EXPECT_TRUE(wide && wide->voxelSize() == 1);
}

TEST(VolumeProxies, TheFactoryPassesOverWhatItCannotMakeAndWhatHangsOnThat)
{
    std::vector<std::pair<std::size_t, Change>> const cases{
        // how many of the three are made
        {0, {Component, "voxelTileWidth", 2u}},
        {0, {Component, "voxelTileWidth", Nexil::String("5")}},
        {0, {Component, "voxelOffsetType", 1u}},
        {0, {Component, "voxelOffsetType", false}},
        {1, {Range, "voxelSize", 0.0f}},
        {1, {Range, "voxelSize", 1e300}},
        {2, {Data, "default", Nexil::String("text")}},
        {2, {Data, "interpolation_mode", 1}}, // so that it is no data
        {2, {Data, "target", Nexil::String("comp")}},
        {3, {Data, "default", 1u}},
    };
    for (auto const& [count, change] : cases) {
        std::vector<std::string> expected{"comp", "tree", "dens"};
        expected.resize(count);
        EXPECT_EQ(support::names(made({change})->keys()), expected) << change.key;
    }
}

} // namespace
