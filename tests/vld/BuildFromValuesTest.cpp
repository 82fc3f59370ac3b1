#include <support/Volumes.h>

#include <vld/Accessor.h>
#include <vld/BuildFromValues.h>

#include <map>
#include <random>
#include <tuple>

namespace {

using namespace VLD::TileTree3D;

template <class Traits>
class BuildFromValues : public ::testing::Test {};
TYPED_TEST_SUITE(BuildFromValues, support::BothConfigurations);

struct Cloud {
    char const* name;
    /// Voxels lie within `spread` of these.
    std::vector<Coordinate> centres;
    int spread;
};

std::vector<Cloud> const kClouds{
    {"around the origin", {{0, 0, 0}}, 9},
    {"at -2^30", {{-(1 << 30), -(1 << 30), -(1 << 30)}}, 9},
    {"at 2^30", {{1 << 30, 1 << 30, 1 << 30}}, 9},
    {"at both", {{1 << 30, -(1 << 30), 1 << 30}, {-(1 << 30), 1 << 30, -(1 << 30)}}, 9},
    {"at the limits",
     {{kCoordinateLimit - 10, kCoordinateLimit - 10, 0}, {10 - kCoordinateLimit, 10 - kCoordinateLimit, 3}},
     9},
};

struct VoxelList {
    Nexil::Array<Coordinate> voxels;
    Nexil::Array<float> values;
};

VoxelList listOf(Cloud const& cloud, std::size_t count)
{
    std::mt19937 random(7);
    std::uniform_int_distribution<int> offset(-cloud.spread, cloud.spread);
    VoxelList list;
    for (std::size_t i = 0; i < count; ++i) {
        Coordinate const& centre = cloud.centres[random() % cloud.centres.size()];
        list.voxels.push_back(centre + Coordinate{offset(random), offset(random), offset(random)});
        list.values.push_back(static_cast<float>(i + 1));
    }
    return list;
}

std::tuple<int, int, int> keyOf(Coordinate const& c)
{
    return {c.x, c.y, c.z};
}

TYPED_TEST(BuildFromValues, TheLastValueOfEachVoxelStaysAndAllOthersAreBackground)
{
    using Traits = TypeParam;
    for (Cloud const& cloud : kClouds) {
        SCOPED_TRACE(cloud.name);
        VoxelList const list = listOf(cloud, 4000);
        std::map<std::tuple<int, int, int>, float> expected;
        for (std::uint64_t i = 0; i < list.voxels.size(); ++i)
            expected[keyOf(list.voxels[i])] = list.values[i];

        auto const grid = buildFromVoxels<Traits>({.channelName = "c"}, list.voxels, list.values, -1.0f);

        ASSERT_TRUE(grid);
        EXPECT_TRUE(grid.container->checkConsistency(true));
        Accessor<Traits, float> value(*grid.topology, *grid.channel);
        for (Coordinate const& centre : cloud.centres) {
            int const side = 2 * cloud.spread + 12;
            Coordinate origin = centre - Coordinate{side / 2, side / 2, side / 2};
            for (int axis = 0; axis < 3; ++axis)
                origin[axis] = std::clamp(origin[axis], -kCoordinateLimit, kCoordinateLimit - side);
            support::forEachVoxel(origin, {side, side, side}, [&](Coordinate const& voxel) {
                auto const found = expected.find(keyOf(voxel));
                ASSERT_EQ(value(voxel), found == expected.end() ? -1.0f : found->second)
                    << voxel.x << " " << voxel.y << " " << voxel.z;
            });
        }
        // Elements and voxels name each other, so what has not been read above is background.
        auto const elements = grid.channel->template values<float>();
        ASSERT_EQ(elements->size(), grid.topology->elementCount());
        std::size_t others = 0;
        for (unsigned int element = 0; element < elements->size(); ++element) {
            VoxelCube const cube = grid.topology->elementCube(element);
            if (!grid.topology->isCellWithLeaf(element)) {
                ASSERT_EQ(grid.topology->findElement(cube.origin), element);
                ASSERT_EQ(grid.topology->findElement(cube.origin + Coordinate{0, cube.width - 1, 0}), element);
            }
            others += (*elements)[element] == -1.0f;
        }
        EXPECT_EQ(others + expected.size(), elements->size());
    }
}

TYPED_TEST(BuildFromValues, OneResultForEveryNumberOfThreads)
{
    // Long enough for a part per thread; half of the voxels come twice.
    VoxelList const list = listOf({"", {{0, 0, 0}, {500, -80, 1 << 30}}, 40}, 400000);
    Grid<TypeParam> first;
    support::onThreadCounts([&] {
        auto grid = buildFromVoxels<TypeParam>({.channelName = "c"}, list.voxels, list.values, 0.0f);
        if (!first)
            first = grid;
        EXPECT_TRUE(support::sameTiles(grid.topology->levels(), first.topology->levels()));
        EXPECT_TRUE(
            support::sameBytes(*grid.channel->template values<float>(), *first.channel->template values<float>()));
    });
}

TYPED_TEST(BuildFromValues, ABoxKeepsItsValuesAndTakesTilesOnlyWhereTheyDifferFromTheBackground)
{
    using Traits = TypeParam;
    Coordinate const size{23, 7, 31};
    for (Coordinate const origin : {Coordinate{-11, 3, -(1 << 30)}, Coordinate{kCoordinateLimit - 23, 0, 0}}) {
        Nexil::Array<double> values;
        support::forEachVoxel({}, size,
                              [&](Coordinate const& c) { values.push_back(c.z < 9 ? 0.5 : c.x + c.y * 0.25); });

        auto const grid = buildFromBox<Traits>({.channelName = "c"}, origin, size, values, 0.5);

        ASSERT_TRUE(grid);
        EXPECT_TRUE(grid.container->checkConsistency(true));
        Accessor<Traits, double> value(*grid.topology, *grid.channel);
        std::uint64_t place = 0;
        support::forEachVoxel(origin, size, [&](Coordinate const& voxel) { ASSERT_EQ(value(voxel), values[place++]); });
        for (unsigned int leaf = 0; leaf < grid.topology->leafCount(); ++leaf) {
            bool isWanted = false;
            support::forEachVoxel(grid.topology->leafOrigins()[leaf],
                                  {Traits::kDataWidth, Traits::kDataWidth, Traits::kDataWidth},
                                  [&](Coordinate const& voxel) { isWanted |= value(voxel) != 0.5; });
            EXPECT_TRUE(isWanted);
        }
        EXPECT_EQ(value(origin - Coordinate{0, 0, 1}), 0.5);
        EXPECT_EQ(value(origin + Coordinate{0, size.y, 0}), 0.5);
    }
}

TYPED_TEST(BuildFromValues, ElementsOfAnySizeArriveWhole)
{
    struct Odd {
        char bytes[7];
    };
    Nexil::Array<Coordinate> const voxels{{1, 2, 3}, {-1, -2, -3}};
    auto const odd = buildFromVoxels<TypeParam>({.channelName = "c"}, voxels, Nexil::Array<Odd>{{"123456"}, {"abcdef"}},
                                                Odd{"......"});
    EXPECT_STREQ((Accessor<TypeParam, Odd>(*odd.topology, *odd.channel)({-1, -2, -3}).bytes), "abcdef");
    EXPECT_STREQ((Accessor<TypeParam, Odd>(*odd.topology, *odd.channel)({0, 0, 0}).bytes), "......");
    auto const flags = buildFromVoxels<TypeParam>({.channelName = "c"}, voxels, Nexil::Array<bool>{true, true}, false);
    EXPECT_TRUE((Accessor<TypeParam, bool>(*flags.topology, *flags.channel)({1, 2, 3})));
    // An accessor of another type reads nothing.
    Accessor<TypeParam, float> wrong(*flags.topology, *flags.channel);
    EXPECT_FALSE(wrong.isValid());
    EXPECT_EQ(wrong({1, 2, 3}), 0.0f);
}

TYPED_TEST(BuildFromValues, WhatCannotBeBuiltGivesAnEmptyGrid)
{
    using Traits = TypeParam;
    Nexil::Array<Coordinate> const voxel{{0, 0, 0}};
    Nexil::Array<int> const one{1};
    EXPECT_TRUE(buildFromVoxels<Traits>({.channelName = "c"}, voxel, one, 0));
    EXPECT_TRUE(buildFromVoxels<Traits>({.channelName = "c"}, {}, Nexil::Array<int>(), 0));
    EXPECT_FALSE(buildFromVoxels<Traits>({}, voxel, one, 0));
    EXPECT_FALSE(buildFromVoxels<Traits>({.channelName = "voxel_tile_tree"}, voxel, one, 0));
    for (float const voxelSize : {0.0f, -1.0f, std::numeric_limits<float>::infinity(), std::nanf("")})
        EXPECT_FALSE(buildFromVoxels<Traits>({.channelName = "c", .voxelSize = voxelSize}, voxel, one, 0));
    EXPECT_FALSE(buildFromVoxels<Traits>({.channelName = "c"}, voxel, Nexil::Array<int>{1, 2}, 0));
    EXPECT_FALSE(buildFromVoxels<Traits>({.channelName = "c"}, {{0, kCoordinateLimit, 0}}, one, 0));
    EXPECT_FALSE(buildFromVoxels<Traits>({.channelName = "c"}, {{0, 0, -kCoordinateLimit - 1}}, one, 0));

    EXPECT_TRUE(buildFromBox<Traits>({.channelName = "c"}, {0, 0, 0}, {1, 1, 1}, one, 0));
    EXPECT_FALSE(buildFromBox<Traits>({.channelName = "c"}, {0, 0, 0}, {1, 1, 2}, one, 0));
    EXPECT_FALSE(buildFromBox<Traits>({.channelName = "c"}, {0, 0, 0}, {1, 0, 1}, Nexil::Array<int>(), 0));
    EXPECT_FALSE(buildFromBox<Traits>({.channelName = "c"}, {0, 0, 0}, {-1, -1, 1}, one, 0));
    EXPECT_FALSE(buildFromBox<Traits>({.channelName = "c"}, {kCoordinateLimit, 0, 0}, {1, 1, 1}, one, 0));
}

} // namespace
