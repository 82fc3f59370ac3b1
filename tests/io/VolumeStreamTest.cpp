#include <support/Geometry.h>
#include <support/Streams.h>
#include <volume/Samples.h>

#include <veldrin/volume/VldProxyAccess.h>
#include <veldrin/volume/VldProxyComponentChannel.h>
#include <veldrin/volume/VldProxyComponentTopology.h>
#include <veldrin/volume/VldProxyDescription.h>
#include <veldrin/volume/VolumeConversion.h>
#include <vld/BuildFromValues.h>

#include <functional>
#include <map>

namespace {

using namespace Veldrin;
using namespace VLD::TileTree3D;
using ObjectPtr = Nexil::Ptr<Object>;
using FloatArray = Nexil::Array<float>;
using UIntArray = Nexil::Array<unsigned int>;
using Coordinates = Nexil::Array<Coordinate>;

support::ReadResult writtenAndRead(support::Objects const& objects)
{
    auto result = support::read(support::written(objects, 1));
    EXPECT_TRUE(result.isRead) << testing::PrintToString(result.errors);
    return result;
}

TEST(VolumeStream, WhatComponentsShareTheyShareAgain)
{
    auto const back =
        support::read(support::fileBytes(VELDRIN_TEST_CORPUS "/streams/valid/v6_volume_shared.zon")).objects;
    ASSERT_EQ(back.size(), 2u);
    auto tiles = [&](std::uint64_t slot, char const* name) {
        return Nexil::dynamicPtrCast<VoxelTopology<SmallTiles>>(
            Geometry::getVldTopologyFromProxy(support::part(*back[slot], name)));
    };
    auto const topology = tiles(0, "voxel_component");
    ASSERT_TRUE(topology);
    EXPECT_EQ(topology, tiles(1, "voxel_component"));
    EXPECT_EQ(tiles(1, "again")->name(), "again");
    EXPECT_EQ(tiles(1, "again")->levels().leafOrigins, topology->levels().leafOrigins);
    auto const container = Nexil::dynamicPtrCast<Container<SmallTiles>>(
        Geometry::getVldContainerFromProxy(support::part(*back[0], "voxel_tile_tree")));
    EXPECT_EQ(container->topology(), topology);
    EXPECT_TRUE(container->checkConsistency(true));
    // Nothing else holds the values any more: the channel, and this pointer.
    EXPECT_EQ(support::arrayIn<float>(*back[0], "voxel_signed_distance").useCount(), 2u);
}

/// A geometry of a small volume as plain objects, by name.
std::map<std::string, Object> plainVolume()
{
    auto volume = VLD::createObject();
    Nexil::Array<Coordinate> const voxels{{0, 0, 0}, {4, 0, 0}, {100, 0, -7}};
    buildFromVoxels<SmallTiles>({.channelName = "density"}, voxels, FloatArray{1, 2, 3}, 0.0f).addTo(*volume);
    support::addPoints<SmallTiles>(*volume);
    auto const geometry = Geometry::move_vld_volume_to_object(*volume);
    std::map<std::string, Object> plain;
    for (auto const& key : geometry->keys())
        EXPECT_TRUE(Geometry::describeVldProxy(*support::part(*geometry, key.c_str()), plain[std::string(key.view())]));
    return plain;
}

ObjectPtr geometryOf(std::map<std::string, Object> const& plain)
{
    auto geometry = createObject();
    // By name: channels and containers stand before what they target.
    for (auto const& [name, part] : plain)
        setProperty(*geometry, name.c_str(), ObjectPtr(Nexil::makePtr<Object>(part)));
    return geometry;
}

template <class T>
void change(Object& part, char const* key, std::function<void(Nexil::Array<T>&)> const& edit)
{
    Nexil::Array<T> values = *getPropertyAs<Nexil::Ptr<Nexil::Array<T>>>(part, key);
    edit(values);
    setProperty(part, key, Nexil::makePtr<Nexil::Array<T>>(std::move(values)));
}

TEST(VolumeStream, WhatIsDamagedStaysPlainTogetherWithWhatTargetsIt)
{
    struct Damage {
        char const* part;
        char const* what;
        std::function<void(Object&)> inflict;
    };
    char const* const kTiles = "voxel_component";
    char const* const kTree = "voxel_tile_tree";
    auto numbers = [](char const* key, std::function<void(UIntArray&)> const& edit) {
        return [=](Object& part) { change<unsigned int>(part, key, edit); };
    };
    auto values = [](std::function<void(FloatArray&)> const& edit) {
        return [=](Object& part) { change<float>(part, "data", edit); };
    };
    auto without = [](char const* key) { return [key](Object& part) { part.eraseProperty(key); }; };
    auto with = [](char const* key, Nexil::Any const& value) {
        return [=](Object& part) { part.setPropertyAny(key, Nexil::Any(value)); };
    };
    std::vector<Damage> const damages{
        {kTiles, "another kind", with("vld_component", Nexil::String("octree"))},
        {kTiles, "a kind that is no text", with("vld_component", 3)},
        {kTiles, "no name", without("name")},
        {kTiles, "another configuration", with("voxelTileWidth", 5u)},
        {kTiles, "more levels", with("voxelInnerLevels", 2u)},
        {kTiles, "a count that is too large", with("count", 0xFFFFFFFFu)},
        {kTiles, "no count", without("count")},
        {kTiles, "no children", without("inner_children")},
        {kTiles, "a null array", with("leaf_parents", Nexil::Ptr<UIntArray>())},
        {kTiles, "a child in two cells", numbers("inner_children", [](auto& a) { a[7] = 0; })},
        {"points", "offsets that fall", numbers("offsets", [](auto& a) { a[1] = 4; })},
        {kTree, "a size of nothing", with("voxelSize", 0.0f)},
        {kTree, "a size without end", with("voxelSize", HUGE_VALF)},
        {kTree, "a size of another type", with("voxelSize", 1.0)},
        {kTree, "no topology name", without("topology")},
        {kTree, "points as its topology", with("target", Nexil::String("points"))},
        {kTree, "itself as its target", with("target", Nexil::String(kTree))},
        {"density", "a null array", with("data", Nexil::Ptr<FloatArray>())},
        {"density", "a value too few", values([](auto& a) { a.resize(3); })},
        {"density", "a default of another type", with("default", 0.0)},
        {"density", "texts", with("data", Nexil::makePtr<Nexil::Array<Nexil::String>>())},
        {"density", "no mode", without("interpolation_mode")},
        {"density", "no container name", without("container")},
        {"density", "another configuration", with("voxelTileDataWidth", 5u)},
        {"density", "the topology as its target", with("target", Nexil::String("voxel_component"))},
        {"sizes", "a value for more points than there are", values([](auto& a) { a.push_back(1); })},
    };
    std::map<std::string, std::vector<std::string>> const targeting{
        {"voxel_component", {"voxel_component", "voxel_tile_tree", "density"}},
        {"points", {"points", "sizes"}},
        {"voxel_tile_tree", {"voxel_tile_tree", "density"}},
        {"density", {"density"}},
        {"sizes", {"sizes"}}};
    auto const plain = plainVolume();
    EXPECT_TRUE(writtenAndRead({geometryOf(plain)}).warnings.empty());
    for (Damage const& damage : damages) {
        SCOPED_TRACE(std::string(damage.part) + ": " + damage.what);
        auto damaged = plain;
        damage.inflict(damaged.at(damage.part));
        auto const geometry = geometryOf(damaged);
        auto const back = writtenAndRead({geometry});
        std::vector<std::string> warnings;
        auto const& lost = targeting.at(damage.part);
        for (std::string const& name : lost)
            warnings.push_back("Volume component '" + name + "' is damaged. It is kept as a plain object.");
        EXPECT_EQ(back.warnings, warnings);
        for (auto const& [name, part] : damaged) {
            auto const held = support::part(*back.objects[0], name.c_str());
            bool const isLost = std::find(lost.begin(), lost.end(), name) != lost.end();
            Object const& object = *held;
            EXPECT_EQ(typeid(object) == typeid(Object), isLost) << name;
        }
        // What is kept is written and read the same again.
        EXPECT_EQ(support::contentOf(writtenAndRead(back.objects).objects), support::contentOf(back.objects));
        // Only a whole stream is warned about.
        std::string cut = support::written({geometry, ObjectPtr(createObject())}, 0);
        cut.back() = static_cast<char>(cut.back() ^ 1);
        EXPECT_EQ(support::read(cut).warnings.size(), 0u);
    }
}

TEST(VolumeStream, ProxiesWithoutAComponentAndOutsideOfAGeometryArePlain)
{
    auto const geometry = Geometry::move_vld_volume_to_object(*support::sphereVolume<SmallTiles>(5));
    auto const tiles = support::part(*geometry, "voxel_component");
    ObjectPtr const hollow = Nexil::makePtr<Geometry::VldProxyComponentTopology>(nullptr);
    ObjectPtr const hollowData = Nexil::makePtr<Geometry::VldProxyComponentChannel>(nullptr, "t");
    auto const back = writtenAndRead({tiles, hollow, hollowData});
    EXPECT_TRUE(back.warnings.empty());
    EXPECT_EQ(getPropertyAs<unsigned int>(*back.objects[0], "count"), getPropertyAs<unsigned int>(*tiles, "count"));
    EXPECT_EQ(getPropertyAs<Nexil::String>(*back.objects[2], "target"), "t");
}

ObjectPtr proxyOf(Nexil::Ptr<VLD::Component> topology)
{
    return Nexil::makePtr<Geometry::VldProxyComponentTopology>(std::move(topology));
}

template <class Topology>
Nexil::Ptr<Topology> topologyIn(support::Objects const& objects, char const* name)
{
    return Nexil::dynamicPtrCast<Topology>(Geometry::getVldTopologyFromProxy(support::part(*objects[0], name)));
}

TEST(VolumeStream, TopologiesThatShareSomeOfTheirArraysComeBackAndShareThem)
{
    using Voxels = VoxelTopology<SmallTiles>;
    using Points = PointTopology<SmallTiles>;
    auto const first =
        buildFromVoxels<SmallTiles>({.channelName = "c"}, {{0, 0, 0}, {4, 0, 0}, {20, 0, 0}}, UIntArray{1, 2, 3}, 0u)
            .topology;
    SharedTileLevels other = first->levels();
    other.leafParents = Nexil::makePtr<UIntArray>(first->leafParents());
    auto geometry = createObject();
    setProperty(*geometry, "a", proxyOf(first));
    setProperty(*geometry, "b", proxyOf(Voxels::create("b", other)));
    setProperty(
        *geometry, "c",
        proxyOf(Points::create("c", first->levels().leafOrigins, Nexil::makePtr<UIntArray>(UIntArray{0, 5, 5, 9}))));
    auto const back = writtenAndRead({ObjectPtr(std::move(geometry))});
    EXPECT_TRUE(back.warnings.empty());
    auto const a = topologyIn<Voxels>(back.objects, "a"), b = topologyIn<Voxels>(back.objects, "b");
    auto const c = topologyIn<Points>(back.objects, "c");
    ASSERT_TRUE(a && b && c);
    EXPECT_TRUE(support::sameTiles(a->levels(), first->levels()) && support::sameTiles(b->levels(), other));
    EXPECT_EQ(c->offsets(), (UIntArray{0, 5, 5, 9}));
    EXPECT_EQ(a->levels().leafOrigins, b->levels().leafOrigins);
    EXPECT_EQ(a->levels().leafOrigins, c->sharedLeafOrigins());
    EXPECT_NE(a->levels().leafParents, b->levels().leafParents);
    EXPECT_EQ(b->findElement({21, 0, 0}), first->findElement({21, 0, 0}));
}

TEST(VolumeStream, FewArraysInManyTopologiesAreNotLookedAtForEach)
{
    // 60 arrays of places and 60 of offsets, of which each fits each: 3600 topologies of 20 000 tiles in a file of 120 arrays.
    auto geometry = createObject();
    std::vector<Nexil::Ptr<Coordinates>> places;
    std::vector<Nexil::Ptr<UIntArray>> offsets;
    for (int i = 0; i < 60; ++i) {
        Coordinates origins;
        for (int tile = 0; tile < 20000; ++tile)
            origins.push_back({tile * 4, i * 4, 0});
        places.push_back(Nexil::makePtr<Coordinates>(std::move(origins)));
        UIntArray counts;
        counts.resize(20001);
        offsets.push_back(Nexil::makePtr<UIntArray>(std::move(counts)));
    }
    for (auto const& origins : places)
        for (auto const& counts : offsets)
            setProperty(*geometry, std::to_string(geometry->size()).c_str(),
                        proxyOf(PointTopology<SmallTiles>::create("p", origins, counts)));
    auto const refused = writtenAndRead({ObjectPtr(std::move(geometry))}).warnings.size();
    EXPECT_GT(refused, 1000u);
    EXPECT_LT(refused, 3500u);
}

} // namespace
