#include "Samples.h"

#include <support/Geometry.h>

#include <veldrin/volume/VolumeBounds.h>
#include <veldrin/volume/VolumeConversion.h>
#include <vld/BuildFromValues.h>

#include <cmath>
#include <functional>
#include <random>

namespace {

using namespace Veldrin;
using namespace VLD::TileTree3D;
using Box = Math::bbox<Math::float3, float>;

template <class Traits>
class VolumeBounds : public ::testing::Test {};
TYPED_TEST_SUITE(VolumeBounds, support::BothConfigurations);

/// Grows a box by each element's cube on its own.
template <class Traits, class T, class IsContent>
void growByEveryElement(Grid<Traits> const& grid, IsContent const& isContent, Box& box)
{
    auto const values = grid.channel->template values<T>();
    double const s = grid.container->voxelSize();
    for (unsigned int element = 0; element < values->size(); ++element) {
        if (grid.topology->isCellWithLeaf(element) || !isContent((*values)[element]))
            continue;
        VoxelCube const cube = grid.topology->elementCube(element);
        for (int const step : {0, cube.width}) {
            auto at = [&](int v) { return static_cast<float>((double(v) + step) * s); };
            box.extend({at(cube.origin.x), at(cube.origin.y), at(cube.origin.z)});
        }
    }
}

template <class T>
struct Contents {
    char const* name;
    Coordinate centre;
    int spread;
    float voxelSize;
    T background;
    /// A number from 0 to 99 to a value.
    T (*value)(unsigned int);
};

template <class Traits, class T, class IsContent>
void expectBounds(char const* channelName, std::vector<Contents<T>> const& table, IsContent const& isContent)
{
    for (Contents<T> const& c : table) {
        SCOPED_TRACE(c.name);
        for (unsigned int seed = 0; seed < 5; ++seed) {
            std::mt19937 random(seed);
            std::uniform_int_distribution<int> offset(-c.spread, c.spread);
            Nexil::Array<Coordinate> voxels;
            Nexil::Array<T> values;
            for (int i = 0; i < 3000; ++i) {
                voxels.push_back(c.centre + Coordinate{offset(random), offset(random), offset(random)});
                values.push_back(c.value(static_cast<unsigned int>(random() % 100)));
            }
            auto const grid = buildFromVoxels<Traits>({.channelName = channelName, .voxelSize = c.voxelSize}, voxels,
                                                      values, c.background);
            Box expected;
            growByEveryElement<Traits, T>(grid, isContent, expected);
            auto volume = VLD::createObject();
            ASSERT_TRUE(grid.addTo(*volume));
            support::onThreadCounts([&] {
                Box box;
                EXPECT_TRUE(GeometryAlgorithms::volumeBounds(*volume, *grid.container, *grid.topology, box));
                EXPECT_EQ(box, expected);
            });
            auto const object = Geometry::move_vld_volume_to_object(*volume);
            Box box;
            GeometryAlgorithms::getVolumeBounds(*object, box);
            EXPECT_EQ(box, expected);
        }
    }
}

TYPED_TEST(VolumeBounds, AreThoseOfALoopOverAllElements)
{
    expectBounds<TypeParam, float>(
        "voxel_signed_distance",
        std::vector<Contents<float>>{
            {"one in a hundred inside", {0, 0, 0}, 60, 0.1f, 3, [](unsigned int i) { return i == 0 ? -1.0f : 2.0f; }},
            {"on the surface", {-9, 2, 5}, 20, 1, 3, [](unsigned int i) { return i == 0 ? 0.0f : 1e-30f; }},
            {"no numbers", {0, 0, 0}, 20, 1, std::nanf(""), [](unsigned int) { return std::nanf(""); }},
            {"some numbers",
             {7, 7, 7},
             30,
             2,
             std::nanf(""),
             [](unsigned int i) { return i < 3 ? -std::numeric_limits<float>::infinity() : std::nanf(""); }},
            {"everything inside", {0, 0, 0}, 40, 1, -1, [](unsigned int) { return -2.0f; }},
            {"at 2^30",
             {1 << 30, -(1 << 30), 1 << 30},
             500,
             1,
             1,
             [](unsigned int i) { return i == 7 ? -1.0f : 1.0f; }},
        },
        [](float v) { return v <= 0; });
    expectBounds<TypeParam, double>(
        "voxel_fog_density",
        std::vector<Contents<double>>{
            {"one in a hundred", {-50, 0, 90}, 60, 0.1f, 0, [](unsigned int i) { return i == 0 ? 0.5 : 0.0; }},
            {"negative density", {0, 0, 0}, 60, 1, 0, [](unsigned int i) { return i == 0 ? -0.0 : -1.0; }},
            {"beyond all floats", {0, 0, 0}, 9, 1, -1, [](unsigned int i) { return i == 0 ? 1e-300 : std::nan(""); }},
        },
        [](double v) { return v > 0; });
}

TYPED_TEST(VolumeBounds, UniteBothChannelsAndGrowTheBoxThatIsGiven)
{
    using Traits = TypeParam;
    auto volume = VLD::createObject();
    auto const grid = support::sphere<Traits>({.channelName = "voxel_signed_distance"}, 5);
    grid.addTo(*volume);
    Nexil::Array<float> fog;
    fog.resize(grid.topology->elementCount());
    unsigned int const element = grid.topology->findElement({5, 5, 5});
    ASSERT_NE(element, kNoElement);
    fog[element] = 1;
    VoxelCube const cube = grid.topology->elementCube(element);
    auto const high = static_cast<float>(cube.origin.x + cube.width);
    volume->addComponent(Nexil::makePtr<Channel<Traits>>("voxel_fog_density", "voxel_tile_tree",
                                                         Nexil::makePtr<Nexil::Array<float>>(std::move(fog)), 0.0f));
    Box box{{-9, 0, 0}, {0, 0, 2}};
    EXPECT_TRUE(GeometryAlgorithms::volumeBounds(*volume, *grid.container, *grid.topology, box));
    EXPECT_EQ(box, (Box{{-9, -5, -5}, {high, high, high}}));
}

TYPED_TEST(VolumeBounds, PassOverWhatDoesNotBelongToTheContainer)
{
    using Traits = TypeParam;
    auto const grid = support::sphere<Traits>({.channelName = "voxel_signed_distance"}, 5);
    auto put = [&](auto const& channel) {
        auto volume = VLD::createObject();
        volume->addComponent(grid.topology);
        volume->addComponent(grid.container);
        volume->addComponent(channel);
        return volume;
    };
    Nexil::Array<float> few{-1};
    Nexil::Array<int> integers;
    integers.resize(grid.topology->elementCount());
    Box const before{{1, 2, 3}, {4, 5, 6}};
    for (auto const& channel : {Nexil::makePtr<Channel<Traits>>("voxel_signed_distance", "voxel_tile_tree",
                                                                Nexil::makePtr<Nexil::Array<float>>(few), 0.0f),
                                Nexil::makePtr<Channel<Traits>>("voxel_signed_distance", "elsewhere",
                                                                grid.channel->template values<float>(), 0.0f),
                                Nexil::makePtr<Channel<Traits>>("voxel_signed_distance", "voxel_tile_tree",
                                                                Nexil::makePtr<Nexil::Array<int>>(integers), 0),
                                Nexil::makePtr<Channel<Traits>>("voxel_depth", "voxel_tile_tree",
                                                                grid.channel->template values<float>(), 0.0f)}) {
        Box box = before;
        EXPECT_FALSE(GeometryAlgorithms::volumeBounds(*put(channel), *grid.container, *grid.topology, box));
        EXPECT_EQ(box, before);
    }
    Box box = before;
    auto const mesh = support::filled([](Object& o) { Geometry::populateCubeMesh(9, o); });
    GeometryAlgorithms::getVolumeBounds(*mesh, box);
    EXPECT_EQ(box, before);
}

} // namespace
