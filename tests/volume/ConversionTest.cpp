#include "Samples.h"

#include <support/FailingMemory.h>
#include <support/Geometry.h>

#include <nexil/JobCancel.h>
#include <veldrin/geometry/Prototypes.h>
#include <veldrin/volume/ValidUpdatedVolume.h>
#include <veldrin/volume/VldProxyAccess.h>
#include <veldrin/volume/VldProxyComponentChannel.h>
#include <veldrin/volume/VldProxyComponentContainer.h>
#include <veldrin/volume/VldProxyComponentTopology.h>
#include <veldrin/volume/VolumeConversion.h>

#include <functional>
#include <map>

namespace {

using namespace Veldrin;
using namespace VLD::TileTree3D;
using ObjectPtr = Nexil::Ptr<Object>;
using FloatArray = Nexil::Array<float>;

/// Names and addresses of all components.
std::map<Nexil::String, VLD::Component const*> componentsOf(VLD::Object const& volume)
{
    std::map<Nexil::String, VLD::Component const*> components;
    for (auto const& name : volume.componentRange())
        components[name] = volume.component<VLD::Component>(name).get();
    return components;
}

template <class Traits>
Nexil::Ptr<Channel<Traits>> channel(char const* name, char const* container, std::uint64_t count)
{
    FloatArray values;
    values.resize(count);
    return Nexil::makePtr<Channel<Traits>>(name, container, Nexil::makePtr<FloatArray>(std::move(values)), 0.0f);
}

struct Sample {
    char const* name;
    std::function<void(VLD::Object&)> fill;
};

std::vector<Sample> const kVolumes{
    {"small tiles", [](VLD::Object& v) { support::sphere<SmallTiles>({.channelName = "d"}).addTo(v); }},
    {"wide tiles", [](VLD::Object& v) { support::sphere<WideTiles>({.channelName = "d"}).addTo(v); }},
    {"both configurations",
     [](VLD::Object& v) {
         support::sphere<WideTiles>({.channelName = "d"}).addTo(v);
         support::sphere<SmallTiles>({.channelName = "e", .topologyName = "t", .containerName = "c"}).addTo(v);
     }},
    {"a topology without a container",
     [](VLD::Object& v) { v.addComponent(support::sphere<WideTiles>({.channelName = "d"}).topology); }},
    {"two containers of one topology, in any order",
     [](VLD::Object& v) {
         auto const grid = support::sphere<SmallTiles>({.channelName = "d"});
         v.addComponent(grid.channel);
         v.addComponent(Nexil::makePtr<Container<SmallTiles>>("other", grid.topology, 3.0f));
         v.addComponent(grid.container);
         v.addComponent(channel<SmallTiles>("e", "other", grid.topology->elementCount()));
         v.addComponent(grid.topology);
     }},
    {"points beside voxels",
     [](VLD::Object& v) {
         support::addPoints<WideTiles>(v);
         support::sphere<WideTiles>({.channelName = "d"}).addTo(v);
     }},
    {"points alone", [](VLD::Object& v) { support::addPoints<SmallTiles>(v); }},
};

TEST(VolumeConversion, ThereAndBackGivesTheSameComponents)
{
    for (Sample const& sample : kVolumes) {
        SCOPED_TRACE(sample.name);
        auto volume = VLD::createObject();
        sample.fill(*volume);
        auto const before = componentsOf(*volume);
        ASSERT_FALSE(before.empty());

        auto object = Geometry::move_vld_volume_to_object(*volume);
        ASSERT_TRUE(object);
        EXPECT_TRUE(volume->empty());
        EXPECT_EQ(object->size(), before.size());

        auto const shared = Geometry::shallow_copy_object_to_vld_volume(*object);
        ASSERT_TRUE(shared);
        EXPECT_EQ(componentsOf(*shared), before);
        EXPECT_EQ(object->size(), before.size());

        auto const back = Geometry::move_object_to_vld_volume(*object);
        ASSERT_TRUE(back);
        EXPECT_EQ(componentsOf(*back), before);
        EXPECT_TRUE(object->empty());
    }
    auto volume = support::sphereVolume<SmallTiles>();
    auto const constant = Geometry::move_vld_volume_to_object_const(*volume);
    Nexil::MutablePtr<Object> object(Nexil::Ptr<Object>{constant});
    EXPECT_EQ(Geometry::move_object_to_vld_volume_const(*object)->componentCount(), 3u);
    EXPECT_TRUE(object->empty());
    EXPECT_EQ(constant->size(), 3u);
}

TEST(VolumeConversion, EveryReaderOfGeometryReadsAVolume)
{
    using namespace Veldrin::Geometry;
    auto volume = support::sphereVolume<WideTiles>();
    auto const topology = volume->component<VoxelTopology<WideTiles>>("voxel_component");
    auto const values = volume->component<ChannelBase>("voxel_signed_distance")->values<float>();
    auto const object = move_vld_volume_to_object(*volume);

    EXPECT_TRUE(Object::isA(*object, *getVolumePrototype()));
    EXPECT_TRUE(Object::isA(*object, *getLevelSetPrototype()));
    EXPECT_FALSE(Object::isA(*object, *getFogVolumePrototype()));
    EXPECT_FALSE(Object::isA(*object, *getMeshPrototype()));
    EXPECT_EQ(getTargetChain(*object, sVoxelSignedDistance),
              (Nexil::Array<Nexil::String>{"voxel_signed_distance", "voxel_tile_tree", "voxel_component"}));
    EXPECT_EQ(getTargetComponent(*object, sVoxelSignedDistance), "voxel_component");
    EXPECT_EQ(getElementCount(*object, sVoxelComp), topology->elementCount());
    EXPECT_EQ(getGeoPropNamesByPrototype(*object, *getComponentGeoPropPrototype()),
              (Nexil::Array<Nexil::String>{"voxel_component"}));
    EXPECT_EQ(getGeoPropsByName(*object, "voxel_s*"), (Nexil::Array<Nexil::String>{"voxel_signed_distance"}));

    auto const data = getDataGeoProperty(*object, sVoxelSignedDistance);
    ASSERT_TRUE(data);
    EXPECT_EQ(getPropertyAs<Nexil::Ptr<FloatArray>>(*data, sData), values) << "the channel's own array";
    EXPECT_EQ(getPropertyAs<float>(*data, sDefault), 1.0f);
    EXPECT_EQ(getPropertyAs<Common::DataInterpolationMode>(*data, sInterp), Common::DataInterpolationMode::Linear);
    auto const indices = getRangeGeoPropIndices(*object, sVoxelTileTree);
    ASSERT_EQ(indices->size(), topology->elementCount());
    for (std::uint64_t i = 0; i < indices->size(); ++i)
        ASSERT_EQ((*indices)[i], i);
    EXPECT_EQ(getRangeGeoPropIndices(*object, sVoxelTileTree), indices) << "made once";
    EXPECT_NE(support::dump(*object).find("voxel_tile_tree"), std::string::npos);
}

TEST(VolumeConversion, CostsTheSameForAnyNumberOfVoxels)
{
    auto allocations = [](int radius) {
        auto volume = support::sphereVolume<SmallTiles>(radius);
        std::uint64_t const before = support::allocationCount();
        auto object = Geometry::move_vld_volume_to_object(*volume);
        bool const isVolume = Object::isA(*object, *Geometry::getLevelSetPrototype());
        std::uint64_t const count = Geometry::getElementCount(*object, Geometry::sVoxelComp);
        auto const back = Geometry::move_object_to_vld_volume(*object);
        std::uint64_t const made = support::allocationCount() - before;
        EXPECT_TRUE(isVolume && back->componentCount() == 3 && count > 0);
        return made;
    };
    allocations(2); // makes the prototypes
    EXPECT_EQ(allocations(4), allocations(60));
    EXPECT_LT(allocations(4), 200u);
}

TEST(VolumeConversion, AnEmptyOrOutdatedVolumeIsClearedAndGivesAnEmptyObject)
{
    auto volume = VLD::createObject();
    EXPECT_TRUE(Geometry::move_vld_volume_to_object(*volume)->empty());
    volume = support::sphereVolume<SmallTiles>();
    volume->addComponent(channel<SmallTiles>("short", "voxel_tile_tree", 1));
    EXPECT_TRUE(Geometry::move_vld_volume_to_object(*volume)->empty());
    EXPECT_TRUE(volume->empty());
}

TEST(VolumeConversion, AVolumeWithAComponentThatHasNoPlaceStaysWhole)
{
    std::vector<Sample> const misfits{
        {"a channel of no container", [](VLD::Object& v) { v.addComponent(channel<SmallTiles>("x", "nothing", 0)); }},
        {"a channel of a topology",
         [](VLD::Object& v) { v.addComponent(channel<SmallTiles>("x", "voxel_component", 0)); }},
        {"a channel of the other configuration",
         [](VLD::Object& v) {
             auto const count = v.component<ChannelBase>("voxel_signed_distance")->elementCount();
             v.addComponent(channel<WideTiles>("x", "voxel_tile_tree", count));
         }},
        {"a second container, without a topology",
         [](VLD::Object& v) { v.addComponent(Nexil::makePtr<Container<SmallTiles>>("x", nullptr, 1.0f)); }},
        {"a channel of that",
         [](VLD::Object& v) {
             v.addComponent(channel<SmallTiles>("y", "x", 0));
             v.addComponent(Nexil::makePtr<Container<SmallTiles>>("x", nullptr, 1.0f));
         }},
    };
    for (Sample const& misfit : misfits) {
        SCOPED_TRACE(misfit.name);
        auto volume = support::sphereVolume<SmallTiles>();
        misfit.fill(*volume);
        auto const before = componentsOf(*volume);
        EXPECT_FALSE(Geometry::move_vld_volume_to_object(*volume));
        EXPECT_EQ(componentsOf(*volume), before);
    }
}

TEST(VolumeConversion, AnObjectThatIsNoVolumeStaysWhole)
{
    struct Case {
        char const* name;
        std::function<void(Object&)> change;
    };
    auto topology = [] { return support::sphere<WideTiles>({.channelName = "d"}).topology; };
    auto put = [](Object& object, char const* name, auto proxy) {
        setProperty(object, name, Nexil::makePtr<decltype(proxy)>(std::move(proxy)));
    };
    std::vector<Case> const cases{
        {"a mesh",
         [](Object& o) {
             o.eraseAllProperties();
             Geometry::populateCubeMesh(1, o);
         }},
        {"a mesh that is also an empty volume",
         [](Object& o) {
             o.eraseAllProperties();
             Geometry::populateMesh(o);
             Geometry::populateVolume(o);
         }},
        {"an ordinary level set with values",
         [](Object& o) {
             o.eraseAllProperties();
             Geometry::populateLevelSet(o);
             auto data = Nexil::MutablePtr<Object>(support::part(o, Geometry::sVoxelSignedDistance));
             setProperty(*data, Geometry::sData, Nexil::makePtr<FloatArray>(FloatArray{1}));
             setProperty(o, Geometry::sVoxelSignedDistance, std::move(data));
         }},
        {"a topology proxy of nothing", [&](Object& o) { put(o, "x", Geometry::VldProxyComponentTopology(nullptr)); }},
        {"a topology proxy of a channel",
         [&](Object& o) { put(o, "x", Geometry::VldProxyComponentTopology(channel<WideTiles>("x", "c", 1))); }},
        {"a container proxy of nothing",
         [&](Object& o) { put(o, "x", Geometry::VldProxyComponentContainer(nullptr, "voxel_component")); }},
        {"a container of the other configuration",
         [&](Object& o) {
             put(o, "x",
                 Geometry::VldProxyComponentContainer(Nexil::makePtr<Container<WideTiles>>("x", topology(), 1.0f),
                                                      "voxel_component"));
         }},
        {"a channel of the other configuration",
         [&](Object& o) {
             put(o, "x", Geometry::VldProxyComponentChannel(channel<WideTiles>("x", "c", 1), "voxel_tile_tree"));
         }},
        {"a channel proxy of nothing",
         [&](Object& o) { put(o, "x", Geometry::VldProxyComponentChannel(nullptr, "voxel_tile_tree")); }},
        {"a channel whose target is not there",
         [&](Object& o) {
             put(o, "x", Geometry::VldProxyComponentChannel(channel<SmallTiles>("x", "c", 1), "nothing"));
         }},
        {"two components of one name",
         [&](Object& o) {
             put(o, "x",
                 Geometry::VldProxyComponentChannel(channel<SmallTiles>("voxel_component", "c", 1), "voxel_tile_tree"));
         }},
    };
    for (Case const& c : cases) {
        SCOPED_TRACE(c.name);
        auto volume = support::sphereVolume<SmallTiles>();
        auto object = Geometry::move_vld_volume_to_object(*volume);
        c.change(*object);
        std::string const before = support::dump(*object);
        EXPECT_FALSE(Geometry::move_object_to_vld_volume(*object));
        EXPECT_FALSE(Geometry::shallow_copy_object_to_vld_volume(*object));
        EXPECT_EQ(support::dump(*object), before);
    }
}

TEST(VolumeConversion, WhatWasOnlyPopulatedGivesAnEmptyVolume)
{
    for (auto* const populate :
         {+[](Object&) {}, &Geometry::populateVolume, &Geometry::populateLevelSet, &Geometry::populateFogVolume}) {
        auto object = support::filled(populate);
        auto const volume = Geometry::move_object_to_vld_volume(*object);
        ASSERT_TRUE(volume);
        EXPECT_TRUE(volume->empty());
        EXPECT_TRUE(object->empty());
    }
}

TEST(VolumeConversion, ACancelledJobLeavesItsSourceAlone)
{
    auto volume = support::sphereVolume<SmallTiles>();
    auto const before = componentsOf(*volume);
    auto other = support::sphereVolume<SmallTiles>();
    auto object = Geometry::move_vld_volume_to_object(*other);
    Nexil::setJobCancelHook([] { return true; });
    auto const converted = Geometry::move_vld_volume_to_object(*volume);
    EXPECT_THROW(static_cast<void>(Geometry::move_object_to_vld_volume(*object)), std::runtime_error);
    Nexil::setJobCancelHook(nullptr);
    ASSERT_TRUE(converted);
    EXPECT_TRUE(converted->empty());
    EXPECT_EQ(componentsOf(*volume), before);
    EXPECT_EQ(object->size(), 3u);
}

TEST(VolumeConversion, AnUpdatedVolumeIsToldByItsSizesAndItsDifferencesArePrinted)
{
    auto const grid = support::sphere<SmallTiles>({.channelName = "d"});
    auto const count = grid.topology->elementCount();
    auto const other = support::sphere<SmallTiles>({.channelName = "d"}, 5).topology;
    std::string const size = std::to_string(count), otherSize = std::to_string(other->elementCount());
    struct Case {
        bool isValid;
        std::string printed;
        std::vector<Nexil::Ptr<VLD::Component>> components;
    };
    auto const stray = Nexil::makePtr<Container<WideTiles>>("stray", nullptr, 1.0f);
    std::vector<Case> const cases{
        {true, "", {}},
        {true, "", {grid.topology, channel<SmallTiles>("c", "x", 3)}},
        {true, "", {grid.topology, grid.container, grid.channel, channel<SmallTiles>("c", "x", 3)}},
        {true, "", {grid.topology, grid.container, stray}},
        {false, "topoName \ncontainer size 0\ntopo size 0\n", {grid.topology, stray, grid.container}},
        {false, "topoName voxel_component\ncontainer size " + size + "\ntopo size 0\n", {grid.container}},
        {false,
         "topoName voxel_component\ncontainer size " + size + "\ntopo size " + otherSize +
             "\nchannelName d\ntopo size " + otherSize + "\nchannel size " + size + "\n",
         {other, grid.container, grid.channel}},
        {false,
         "channelName c\ntopo size " + size + "\nchannel size 3\n",
         {grid.topology, grid.container, channel<SmallTiles>("c", "voxel_tile_tree", 3), grid.channel}},
    };
    for (Case const& c : cases) {
        auto volume = VLD::createObject();
        for (auto const& component : c.components)
            ASSERT_TRUE(volume->addComponent(component));
        ::testing::internal::CaptureStdout();
        EXPECT_EQ(Geometry::validUpdatedVolume(*volume), c.isValid);
        EXPECT_EQ(::testing::internal::GetCapturedStdout(), "");
        ::testing::internal::CaptureStdout();
        EXPECT_EQ(Geometry::validUpdatedVolume(*volume, true), c.isValid);
        EXPECT_EQ(::testing::internal::GetCapturedStdout(), c.printed);
    }
}

} // namespace
