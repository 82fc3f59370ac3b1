#include <support/Geometry.h>
#include <support/StreamDescription.h>
#include <support/Streams.h>
#include <volume/Samples.h>

#include <veldrin/geometry/Prototypes.h>
#include <veldrin/volume/VldProxyAccess.h>
#include <veldrin/volume/VldProxyComponentChannel.h>
#include <veldrin/volume/VldProxyComponentContainer.h>
#include <veldrin/volume/VldProxyComponentTopology.h>
#include <veldrin/volume/VolumeConversion.h>
#include <veldrin/volume/internal/ProxyDescription.h>
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

support::ReadResult writtenAndRead(support::Objects const& objects, int level = 1)
{
    auto result = support::read(support::written(objects, level));
    EXPECT_TRUE(result.isRead) << testing::PrintToString(result.errors);
    return result;
}

/// A volume of everything that a volume can hold.
Nexil::MutablePtr<VLD::Object> fullVolume()
{
    auto volume = VLD::createObject();
    auto const grid = support::sphere<SmallTiles>({.channelName = "voxel_signed_distance", .voxelSize = 0.25f}, 9,
                                                  {-(1 << 30), 3, 1 << 30});
    grid.addTo(*volume);
    std::uint64_t const count = grid.topology->elementCount();
    auto add = [&]<class T>(char const* name, T const& value, DataElementInitializerType initializer) {
        Nexil::Array<T> values;
        values.resize(count);
        for (std::uint64_t i = 0; i < count; i += 3)
            values[i] = value;
        volume->addComponent(Nexil::makePtr<Channel<SmallTiles>>(
            name, "voxel_tile_tree", Nexil::makePtr<Nexil::Array<T>>(std::move(values)), value, initializer));
    };
    add("flags", true, DataElementInitializerType::Nearest);
    add("velocity", Math::float3{1, 2, 3}, DataElementInitializerType::Linear);
    add("ids", 1ll << 40, DataElementInitializerType::DefaultValue);
    // A second container of the topology, and a channel over an array that another channel has too.
    volume->addComponent(Nexil::makePtr<Container<SmallTiles>>("coarse", grid.topology, 8.0f));
    volume->addComponent(Nexil::makePtr<Channel<SmallTiles>>("twin", "coarse", grid.channel->values<float>(), -1.0f));
    support::sphere<WideTiles>({.channelName = "d", .topologyName = "t", .containerName = "c"}, 20).addTo(*volume);
    support::addPoints<WideTiles>(*volume);
    return volume;
}

TEST(VolumeStream, AVolumeComesBackAsItWas)
{
    auto volume = fullVolume();
    auto const names = support::names(volume->componentRange());
    ObjectPtr const geometry = Geometry::move_vld_volume_to_object(*volume);
    std::string const expected = support::describeObjects({geometry});
    for (int const level : {0, 1, 9}) {
        auto const back = writtenAndRead({geometry}, level);
        ASSERT_EQ(back.objects.size(), 1u);
        EXPECT_TRUE(back.warnings.empty()) << testing::PrintToString(back.warnings);
        EXPECT_EQ(support::describeObjects(back.objects), expected) << level;
        EXPECT_TRUE(Object::isA(*back.objects[0], *Geometry::getVolumePrototype()));
        // As a volume of the volume library it is whole: nothing was lost and everything fits.
        auto const again = Geometry::shallow_copy_object_to_vld_volume(*back.objects[0]);
        ASSERT_TRUE(again);
        EXPECT_EQ(again->componentCount(), names.size());
        for (char const* container : {"voxel_tile_tree", "coarse"})
            EXPECT_TRUE(again->component<Container<SmallTiles>>(container)->checkConsistency(true));
        EXPECT_TRUE(again->component<Container<WideTiles>>("c")->checkConsistency(true));
        EXPECT_TRUE(again->component<PointTopology<WideTiles>>("points")->isConsistent());
        EXPECT_EQ(again->component<Container<SmallTiles>>("voxel_tile_tree")->voxelSize(), 0.25f);
        EXPECT_EQ(again->component<ChannelBase>("ids")->initializer(), DataElementInitializerType::DefaultValue);
    }
}

TEST(VolumeStream, WhatComponentsShareTheyShareAgain)
{
    auto volume = fullVolume();
    auto const small = volume->component<VoxelTopology<SmallTiles>>("voxel_component");
    ObjectPtr const first = Geometry::move_vld_volume_to_object(*volume);
    // A second geometry: one proxy of the first, the same tiles under another name, and a proxy of its own over the points.
    auto second = createObject();
    second->setPropertyAny("voxel_component", first->getProperty("voxel_component"));
    setProperty(*second, "renamed",
                ObjectPtr(Nexil::makePtr<Geometry::VldProxyComponentTopology>(
                    Nexil::makePtr<VoxelTopology<SmallTiles>>("renamed", *small))));
    auto const points = Geometry::getVldTopologyFromProxy(support::part(*first, "points"));
    setProperty(*second, "points", ObjectPtr(Nexil::makePtr<Geometry::VldProxyComponentTopology>(points)));

    auto const back = writtenAndRead({first, ObjectPtr(std::move(second))}).objects;
    auto tiles = [&](std::uint64_t slot, char const* name) {
        return Geometry::getVldTopologyFromProxy(support::part(*back[slot], name));
    };
    auto const topology = Nexil::dynamicPtrCast<VoxelTopology<SmallTiles>>(tiles(0, "voxel_component"));
    ASSERT_TRUE(topology);
    EXPECT_EQ(support::part(*back[0], "voxel_component"), support::part(*back[1], "voxel_component"));
    EXPECT_EQ(tiles(0, "points"), tiles(1, "points"));
    auto const renamed = Nexil::dynamicPtrCast<VoxelTopology<SmallTiles>>(tiles(1, "renamed"));
    EXPECT_EQ(renamed->name(), "renamed");
    EXPECT_EQ(renamed->levels().leafOrigins, topology->levels().leafOrigins);
    EXPECT_EQ(renamed->levels().innerChildren, topology->levels().innerChildren);

    for (char const* name : {"voxel_tile_tree", "coarse"}) {
        auto const container = Geometry::getVldContainerFromProxy(support::part(*back[0], name));
        EXPECT_EQ(Nexil::dynamicPtrCast<Container<SmallTiles>>(container)->topology(), topology) << name;
    }
    auto const distances = support::arrayIn<float>(*back[0], "voxel_signed_distance");
    EXPECT_EQ(support::arrayIn<float>(*back[0], "twin"), distances);
    // Nothing else holds the values any more: two channels, and this pointer.
    EXPECT_EQ(distances.useCount(), 3u);
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
        EXPECT_TRUE(
            Geometry::Internal::describeProxy(*support::part(*geometry, key.c_str()), plain[std::string(key.view())]));
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
    auto coordinates = [](char const* key, std::function<void(Coordinates&)> const& edit) {
        return [=](Object& part) { change<Coordinate>(part, key, edit); };
    };
    auto numbers = [](char const* key, std::function<void(UIntArray&)> const& edit) {
        return [=](Object& part) { change<unsigned int>(part, key, edit); };
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
        {kTiles, "another offset", with("voxelOffsetType", 1u)},
        {kTiles, "more levels", with("voxelInnerLevels", 2u)},
        {kTiles, "a width of another type", with("voxelTileWidth", 2)},
        {kTiles, "a count that is too large", with("count", 0xFFFFFFFFu)},
        {kTiles, "no count", without("count")},
        {kTiles, "no children", without("inner_children")},
        {kTiles, "a null array", with("leaf_parents", Nexil::Ptr<UIntArray>())},
        {kTiles, "a tile too few", coordinates("leaf_origins", [](auto& a) { a.resize(a.size() - 1); })},
        {kTiles, "tiles out of order", coordinates("leaf_origins", [](auto& a) { std::swap(a[0], a[1]); })},
        {kTiles, "a tile twice", coordinates("leaf_origins", [](auto& a) { a[1] = a[0]; })},
        {kTiles, "a tile off its place", coordinates("leaf_origins", [](auto& a) { a[2].z += 1; })},
        {kTiles, "a tile in another's cell", coordinates("leaf_origins", [](auto& a) { a[1].y += 4; })},
        {kTiles, "a tile beyond the limits", coordinates("inner_origins", [](auto& a) { a[1].x = 2147483600; })},
        {kTiles, "an inner tile off its place", coordinates("inner_origins", [](auto& a) { a[0].x += 4; })},
        {kTiles, "a parent that does not exist", numbers("leaf_parents", [](auto& a) { a[0] = 7; })},
        {kTiles, "another tile's parent", numbers("leaf_parents", [](auto& a) { a[2] = 0; })},
        {kTiles, "a child that does not exist", numbers("inner_children", [](auto& a) { a[1] = 99; })},
        {kTiles, "a child in two cells", numbers("inner_children", [](auto& a) { a[7] = 0; })},
        {kTiles, "a forgotten child", numbers("inner_children", [](auto& a) { a[0] = kNoTile; })},
        {"points", "offsets that fall", numbers("offsets", [](auto& a) { a[1] = 4; })},
        {"points", "offsets that start late", numbers("offsets", [](auto& a) { a[0] = 1; })},
        {"points", "an offset too many", numbers("offsets", [](auto& a) { a.push_back(3); })},
        {"points", "a tile off its place", coordinates("leaf_origins", [](auto& a) { a[0].x = 1; })},
        {"voxel_tile_tree", "no size", without("voxelSize")},
        {"voxel_tile_tree", "a size of nothing", with("voxelSize", 0.0f)},
        {"voxel_tile_tree", "a size that is no number", with("voxelSize", std::nanf(""))},
        {"voxel_tile_tree", "a size of another type", with("voxelSize", 1.0)},
        {"voxel_tile_tree", "no topology name", without("topology")},
        {"voxel_tile_tree", "points as its topology", with("target", Nexil::String("points"))},
        {"voxel_tile_tree", "itself as its target", with("target", Nexil::String("voxel_tile_tree"))},
        {"density", "no values", without("data")},
        {"density", "a null array", with("data", Nexil::Ptr<FloatArray>())},
        {"density", "a value too few", [](Object& p) { change<float>(p, "data", [](auto& a) { a.resize(3); }); }},
        {"density", "a default of another type", with("default", 0.0)},
        {"density", "texts", with("data", Nexil::makePtr<Nexil::Array<Nexil::String>>())},
        {"density", "no mode", without("interpolation_mode")},
        {"density", "no container name", without("container")},
        {"density", "another configuration", with("voxelTileDataWidth", 5u)},
        {"density", "no such target", with("target", Nexil::String("nowhere"))},
        {"sizes", "a value for more points than there are",
         [](Object& p) { change<float>(p, "data", [](auto& a) { a.push_back(1); }); }},
        {"density", "the topology as its target", with("target", Nexil::String("voxel_component"))},
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
        auto const back = writtenAndRead({geometryOf(damaged)});
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
            if (isLost) {
                EXPECT_EQ(support::describeObjects({held}),
                          support::describeObjects({ObjectPtr(Nexil::makePtr<Object>(part))}));
            }
        }
        // What is kept is written and read the same again.
        EXPECT_EQ(support::describeObjects(writtenAndRead(back.objects).objects),
                  support::describeObjects(back.objects));
    }
}

TEST(VolumeStream, OnlyAWholeStreamIsWarnedAbout)
{
    auto damaged = plainVolume();
    damaged.at("voxel_component").eraseProperty("count");
    std::string bytes = support::written({geometryOf(damaged), ObjectPtr(createObject())}, 0);
    bytes[bytes.size() - 1] = static_cast<char>(bytes[bytes.size() - 1] ^ 1);
    auto const result = support::read(bytes);
    EXPECT_FALSE(result.isRead);
    EXPECT_EQ(result.errors.size(), 1u);
    EXPECT_EQ(result.warnings.size(), 0u);
}

TEST(VolumeStream, ProxiesWithoutAComponentAndOutsideOfAGeometryArePlain)
{
    ObjectPtr const hollow = Nexil::makePtr<Geometry::VldProxyComponentTopology>(nullptr);
    auto volume = support::sphereVolume<SmallTiles>(5);
    auto const geometry = Geometry::move_vld_volume_to_object(*volume);
    auto holder = createObject();
    setProperty(*holder, "hollow", hollow);
    setProperty(*holder, "hollow_data", ObjectPtr(Nexil::makePtr<Geometry::VldProxyComponentChannel>(nullptr, "t")));
    auto const back = writtenAndRead({support::part(*geometry, "voxel_component"), ObjectPtr(std::move(holder))});
    EXPECT_TRUE(back.warnings.empty());
    EXPECT_EQ(getPropertyAs<unsigned int>(*back.objects[0], "count"),
              getPropertyAs<unsigned int>(*support::part(*geometry, "voxel_component"), "count"));
    EXPECT_EQ(getPropertyAs<Nexil::String>(*support::part(*back.objects[1], "hollow_data"), "target"), "t");
}

TEST(VolumeStream, ArraysThatManyTopologiesReferToAreLookedAtOnce)
{
    // A million tiles under ten thousand names: looked at once each, this would be ten billion tiles.
    Coordinates origins;
    for (int i = 0; i < 1000000; ++i)
        origins.push_back({i * 4, 0, 0});
    UIntArray offsets;
    offsets.resize(origins.size() + 1);
    auto const all = PointTopology<SmallTiles>::create("all", std::move(origins), std::move(offsets));
    auto geometry = createObject();
    for (int i = 0; i < 10000; ++i) {
        std::string const name = "p" + std::to_string(i);
        setProperty(*geometry, name.c_str(),
                    ObjectPtr(Nexil::makePtr<Geometry::VldProxyComponentTopology>(
                        Nexil::makePtr<PointTopology<SmallTiles>>(name.c_str(), *all))));
        if (i % 2 == 0)
            continue;
        // The same with one array of their own is refused, as that would have to be looked at anew.
        Object plain;
        ASSERT_TRUE(Geometry::Internal::describeProxy(*support::part(*geometry, name.c_str()), plain));
        setProperty(plain, "offsets", Nexil::makePtr<UIntArray>(UIntArray{0}));
        setProperty(*geometry, name.c_str(), ObjectPtr(Nexil::makePtr<Object>(std::move(plain))));
    }
    auto const back = writtenAndRead({ObjectPtr(std::move(geometry))});
    EXPECT_EQ(back.warnings.size(), 5000u);
    auto const first = Geometry::getVldTopologyFromProxy(support::part(*back.objects[0], "p0"));
    auto const last = Geometry::getVldTopologyFromProxy(support::part(*back.objects[0], "p9998"));
    EXPECT_EQ(Nexil::dynamicPtrCast<PointTopology<SmallTiles>>(first)->sharedOffsets(),
              Nexil::dynamicPtrCast<PointTopology<SmallTiles>>(last)->sharedOffsets());
}

} // namespace
