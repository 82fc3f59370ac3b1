#include "Samples.h"

#include <support/FailingMemory.h>
#include <support/Geometry.h>

#include <veldrin/geometry/Prototypes.h>
#include <veldrin/tags/TagData.h>
#include <veldrin/volume/ValidUpdatedVolume.h>
#include <veldrin/volume/VldProxyAccess.h>
#include <veldrin/volume/VldProxyComponentChannel.h>
#include <veldrin/volume/VldProxyComponentContainer.h>
#include <veldrin/volume/VldProxyComponentTopology.h>
#include <veldrin/volume/VolumeConversion.h>

#include <map>
#include <vector>

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

using Components = std::vector<Nexil::Ptr<VLD::Component>>;

Nexil::MutablePtr<VLD::Object> volumeOf(Components const& components)
{
    auto volume = VLD::createObject();
    for (auto const& component : components)
        EXPECT_TRUE(volume->addComponent(component));
    return volume;
}

std::map<char const*, Components> volumes()
{
    auto const small = support::sphere<SmallTiles>({.channelName = "e", .topologyName = "t", .containerName = "c"});
    auto const wide = support::sphere<WideTiles>({.channelName = "d"});
    auto const points = support::points<WideTiles>();
    auto const sizes = channel<WideTiles>("sizes", "points", 3);
    return {{"nothing", {}},
            {"small tiles", {small.topology, small.container, small.channel}},
            {"both configurations",
             {wide.topology, wide.container, wide.channel, small.topology, small.container, small.channel}},
            {"a topology without a container", {wide.topology}},
            {"two containers of one topology, in any order",
             {small.channel, Nexil::makePtr<Container<SmallTiles>>("other", small.topology, 3.0f), small.container,
              channel<SmallTiles>("f", "other", small.topology->elementCount()), small.topology}},
            {"points beside voxels", {points, sizes, wide.topology, wide.container, wide.channel}},
            {"points alone", {points, sizes}}};
}

TEST(VolumeConversion, ThereAndBackGivesTheSameComponents)
{
    for (auto const& [name, components] : volumes()) {
        SCOPED_TRACE(name);
        auto volume = volumeOf(components);
        auto const before = componentsOf(*volume);
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
    auto const values = volume->component<ChannelBase>("voxel_signed_distance")->values<float>();
    auto const object = move_vld_volume_to_object(*volume);

    EXPECT_TRUE(Object::isA(*object, *getVolumePrototype()));
    EXPECT_TRUE(Object::isA(*object, *getLevelSetPrototype()));
    EXPECT_FALSE(Object::isA(*object, *getFogVolumePrototype()));
    EXPECT_EQ(getTargetChain(*object, sVoxelSignedDistance),
              (Nexil::Array<Nexil::String>{"voxel_signed_distance", "voxel_tile_tree", "voxel_component"}));
    EXPECT_EQ(getElementCount(*object, sVoxelComp), values->size());
    EXPECT_EQ(getGeoPropsByName(*object, "voxel_s*"), (Nexil::Array<Nexil::String>{"voxel_signed_distance"}));
    EXPECT_EQ(support::arrayIn<float>(*object, sVoxelSignedDistance), values) << "the channel's own array";
    auto const indices = getRangeGeoPropIndices(*object, sVoxelTileTree);
    ASSERT_EQ(indices->size(), values->size());
    for (std::uint64_t i = 0; i < indices->size(); ++i)
        ASSERT_EQ((*indices)[i], i);
    EXPECT_EQ(getRangeGeoPropIndices(*object, sVoxelTileTree), indices) << "made once";
    EXPECT_NE(support::dump(*object).find("default: 1 (float)"), std::string::npos);

    Nexil::Array<bool> few;
    few.resize(values->size());
    auto const mask = Nexil::makePtr<Nexil::Array<bool>>(std::move(few));
    auto tag = createObject();
    populateTag(sVoxelTileTree, mask, *tag);
    setProperty(*object, "voxel_few_tag", std::move(tag));
    Nexil::Ptr<Nexil::Array<bool>> read;
    Nexil::String component;
    EXPECT_TRUE(getTagData(*object, "voxel_few_tag", read, component));
    EXPECT_EQ(read, mask);
    EXPECT_EQ(component, sVoxelComp);
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

TEST(VolumeConversion, AnOutdatedVolumeIsClearedAndGivesAnEmptyObject)
{
    auto volume = support::sphereVolume<SmallTiles>();
    volume->addComponent(channel<SmallTiles>("short", "voxel_tile_tree", 1));
    EXPECT_TRUE(Geometry::move_vld_volume_to_object(*volume)->empty());
    EXPECT_TRUE(volume->empty());
}

TEST(VolumeConversion, AVolumeWithAComponentThatHasNoPlaceStaysWhole)
{
    auto const grid = support::sphere<SmallTiles>({.channelName = "d"});
    auto const empty = Nexil::makePtr<Container<SmallTiles>>("x", nullptr, 1.0f);
    std::map<char const*, Components> const misfits{
        {"a channel of no container", {channel<SmallTiles>("x", "nothing", 0)}},
        {"a channel of a topology", {channel<SmallTiles>("x", "voxel_component", 0)}},
        {"a channel of the other configuration",
         {channel<WideTiles>("x", "voxel_tile_tree", grid.topology->elementCount())}},
        {"a second container, without a topology", {empty}},
        {"a channel of that", {channel<SmallTiles>("y", "x", 0), empty}},
    };
    for (auto const& [name, components] : misfits) {
        SCOPED_TRACE(name);
        auto volume = volumeOf({grid.topology, grid.container, grid.channel});
        for (auto const& component : components)
            volume->addComponent(component);
        auto const before = componentsOf(*volume);
        EXPECT_FALSE(Geometry::move_vld_volume_to_object(*volume));
        EXPECT_EQ(componentsOf(*volume), before);
    }
}

TEST(VolumeConversion, AnObjectThatIsNoVolumeStaysWhole)
{
    using namespace Veldrin::Geometry;
    using Held = Nexil::MutablePtr<Object>;
    auto const one = channel<SmallTiles>("x", "c", 1);
    auto const other = support::sphere<WideTiles>({.channelName = "d"});
    auto converted = [] { return move_vld_volume_to_object(*support::sphereVolume<SmallTiles>()); };
    auto with = [&](auto proxy) {
        auto object = converted();
        setProperty(*object, "misfit", ObjectPtr(Nexil::makePtr<decltype(proxy)>(std::move(proxy))));
        return object;
    };
    auto changed = [](Held object, char const* name, char const* key, Nexil::Any value) {
        Held part(support::part(*object, name));
        EXPECT_TRUE(part->setPropertyAny(key, std::move(value)));
        setProperty(*object, name, std::move(part));
        return object;
    };
    auto renamed = [&](char const* from, char const* holder) {
        auto object = converted();
        object->setPropertyAny("renamed", object->extractProperty(from));
        return changed(std::move(object), holder, sTarget, Nexil::String("renamed"));
    };
    auto levelSet = [&] { return support::filled(&populateLevelSet); };
    std::pair<char const*, Held> const misfits[] = {
        {"a topology proxy of nothing", with(VldProxyComponentTopology(nullptr))},
        {"a topology proxy of a channel", with(VldProxyComponentTopology(one))},
        {"a container proxy of nothing", with(VldProxyComponentContainer(nullptr, "voxel_component"))},
        {"a container of other tiles", with(VldProxyComponentContainer(other.container, "voxel_component"))},
        {"a channel of other tiles", with(VldProxyComponentChannel(other.channel, "voxel_tile_tree"))},
        {"a channel proxy of nothing", with(VldProxyComponentChannel(nullptr, "voxel_tile_tree"))},
        {"a channel whose target is not there", with(VldProxyComponentChannel(one, "nothing"))},
        {"two components of one name",
         with(VldProxyComponentChannel(channel<SmallTiles>("voxel_component", "c", 1), "voxel_tile_tree"))},
        {"a topology under another name, which its container targets", renamed(sVoxelComp, sVoxelTileTree)},
        {"a container under another name, which a channel targets", renamed(sVoxelTileTree, sVoxelSignedDistance)},
        {"a mesh", support::filled([](Object& o) { populateCubeMesh(1, o); })},
        {"a mesh that is also an empty volume", support::filled([](Object& o) {
             populateMesh(o);
             populateVolume(o);
         })},
        {"plain elements", changed(levelSet(), sVoxelComp, sCount, 3u)},
        {"a plain value", changed(levelSet(), sVoxelSignedDistance, sData, Nexil::makePtr<FloatArray>(FloatArray{1}))},
        {"a plain range", changed(levelSet(), sVoxelTileTree, sIndices,
                                  Nexil::makePtr<Nexil::Array<unsigned int>>(Nexil::Array<unsigned int>{1}))},
        {"a property of another kind", support::filled([](Object& o) {
             populateVolume(o);
             setProperty(o, "values", Nexil::makePtr<FloatArray>(FloatArray{1}));
         })},
    };
    for (auto const& [what, misfit] : misfits) {
        SCOPED_TRACE(what);
        Object object = *misfit;
        std::string const before = support::dump(object);
        EXPECT_FALSE(move_object_to_vld_volume(object));
        EXPECT_FALSE(shallow_copy_object_to_vld_volume(object));
        EXPECT_EQ(support::dump(object), before);
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

TEST(VolumeConversion, AnUpdatedVolumeIsToldByItsSizesAndItsDifferencesArePrinted)
{
    auto const grid = support::sphere<SmallTiles>({.channelName = "d"});
    auto const count = grid.topology->elementCount();
    auto const other = support::sphere<SmallTiles>({.channelName = "d"}, 5).topology;
    std::string const size = std::to_string(count), otherSize = std::to_string(other->elementCount());
    struct Case {
        bool isValid;
        std::string printed;
        Components components;
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
        auto const volume = volumeOf(c.components);
        ::testing::internal::CaptureStdout();
        EXPECT_EQ(Geometry::validUpdatedVolume(*volume), c.isValid);
        EXPECT_EQ(::testing::internal::GetCapturedStdout(), "");
        ::testing::internal::CaptureStdout();
        EXPECT_EQ(Geometry::validUpdatedVolume(*volume, true), c.isValid);
        EXPECT_EQ(::testing::internal::GetCapturedStdout(), c.printed);
    }
}

} // namespace
