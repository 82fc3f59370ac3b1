#include <support/Cancellation.h>
#include <support/Volumes.h>

#include <vld/Accessor.h>
#include <vld/BuildFromPoints.h>
#include <vld/BuildFromValues.h>
#include <vld/BuildLevelSet.h>

#include <algorithm>
#include <cmath>
#include <map>
#include <random>
#include <tuple>
#include <vector>

namespace {

using namespace VLD::TileTree3D;
using Veldrin::Math::double3;
using Veldrin::Math::float3;

template <class Traits>
class Builders : public ::testing::Test {};
TYPED_TEST_SUITE(Builders, support::BothConfigurations);

/// Every voxel of the box and every element has the value expected(voxel).
template <class Traits, class Expected>
void expectHolds(Grid<Traits> const& grid, VoxelBox const& box, Expected const& expected)
{
    using E = decltype(expected(Coordinate()));
    ASSERT_TRUE(grid);
    EXPECT_TRUE(grid.container->checkConsistency(true));
    Accessor<Traits, E> value(*grid.topology, *grid.channel);
    support::forEachVoxel(box.origin, box.size, [&](Coordinate const& voxel) {
        ASSERT_EQ(value(voxel), expected(voxel)) << voxel.x << " " << voxel.y << " " << voxel.z;
    });
    auto const values = grid.channel->template values<E>();
    ASSERT_EQ(values->size(), grid.topology->elementCount());
    for (unsigned int element = 0; element < values->size(); ++element) {
        VoxelCube const cube = grid.topology->elementCube(element);
        int const last = cube.width - 1;
        if (!grid.topology->isCellWithLeaf(element))
            for (Coordinate const& voxel : {cube.origin, cube.origin + Coordinate{last, last, last}}) {
                ASSERT_EQ(grid.topology->findElement(voxel), element);
                ASSERT_EQ((*values)[element], expected(voxel)) << voxel.x << " " << voxel.y << " " << voxel.z;
            }
    }
}

struct VoxelList {
    Nexil::Array<Coordinate> voxels;
    Nexil::Array<float> values;
};

/// Voxels within `spread` of the centres, many of them several times.
VoxelList listOf(std::vector<Coordinate> const& centres, int spread, std::size_t count)
{
    std::mt19937 random(7);
    std::uniform_int_distribution<int> offset(-spread, spread);
    VoxelList list;
    for (std::size_t i = 0; i < count; ++i) {
        Coordinate const& centre = centres[random() % centres.size()];
        list.voxels.push_back(centre + Coordinate{offset(random), offset(random), offset(random)});
        list.values.push_back(static_cast<float>(i + 1));
    }
    return list;
}

TYPED_TEST(Builders, TheLastValueOfEachVoxelStaysAndAllOthersAreBackground)
{
    constexpr int kFar = 1 << 30, kEnd = kCoordinateLimit - 10;
    auto keyOf = [](Coordinate const& c) { return std::tuple(c.x, c.y, c.z); };
    for (auto const& centres : {std::vector<Coordinate>{{0, 0, 0}},
                                {{kFar, -kFar, kFar}, {-kFar, kFar, -kFar}},
                                {{kEnd, kEnd, 0}, {-kEnd, -kEnd, 3}}}) {
        VoxelList const list = listOf(centres, 9, 4000);
        std::map<std::tuple<int, int, int>, float> last;
        for (std::uint64_t i = 0; i < list.voxels.size(); ++i)
            last[keyOf(list.voxels[i])] = list.values[i];
        auto const grid = buildFromVoxels<TypeParam>({.channelName = "c"}, list.voxels, list.values, -1.0f);
        for (Coordinate const& centre : centres)
            expectHolds(grid, {centre - Coordinate{9, 9, 9}, {19, 19, 19}}, [&](Coordinate const& voxel) {
                auto const found = last.find(keyOf(voxel));
                return found == last.end() ? -1.0f : found->second;
            });
    }
}

TYPED_TEST(Builders, ABoxKeepsItsValuesAndTakesTilesOnlyWhereTheyDifferFromTheBackground)
{
    Coordinate const size{23, 7, 31};
    for (Coordinate const origin : {Coordinate{-11, 3, -(1 << 30)}, Coordinate{kCoordinateLimit - 23, 0, 0},
                                    Coordinate{-kCoordinateLimit, 0, 0}}) {
        auto expected = [&](Coordinate const& voxel) {
            Coordinate const c = voxel - origin;
            bool const isInBox = c.x >= 0 && c.y >= 0 && c.z >= 0 && c.x < size.x && c.y < size.y && c.z < size.z;
            return isInBox && c.z >= 9 ? c.x + c.y * 0.25 : 0.5;
        };
        Nexil::Array<double> values;
        support::forEachVoxel(origin, size, [&](Coordinate const& voxel) { values.push_back(expected(voxel)); });
        auto const grid = buildFromBox<TypeParam>({.channelName = "c"}, origin, size, values, 0.5);
        expectHolds(grid, {origin, size}, expected);
        auto const elements = grid.channel->template values<double>();
        for (unsigned int leaf = 0; leaf < grid.topology->leafCount(); ++leaf) {
            double const* const voxels = elements->data() + std::uint64_t(leaf) * TypeParam::kLeafVoxels;
            EXPECT_TRUE(std::any_of(voxels, voxels + TypeParam::kLeafVoxels, [](double v) { return v != 0.5; }));
        }
    }
}

TYPED_TEST(Builders, ElementsOfAnySizeArriveWholeAndAnAccessorOfAnotherTypeReadsNothing)
{
    struct Odd {
        char bytes[7];
    };
    Nexil::Array<Coordinate> const voxels{{1, 2, 3}, {-1, -2, -3}};
    auto const odd = buildFromVoxels<TypeParam>({.channelName = "c"}, voxels, Nexil::Array<Odd>{{"123456"}, {"abcdef"}},
                                                Odd{"......"});
    EXPECT_STREQ((Accessor<TypeParam, Odd>(*odd.topology, *odd.channel)({-1, -2, -3}).bytes), "abcdef");
    EXPECT_STREQ((Accessor<TypeParam, Odd>(*odd.topology, *odd.channel)({0, 0, 0}).bytes), "......");
    EXPECT_FALSE((Accessor<TypeParam, float>(*odd.topology, *odd.channel).isValid()));
    EXPECT_FALSE((Accessor<TypeParam, Odd>(VoxelTopology<TypeParam>("t", TileLevels()), *odd.channel).isValid()));
}

double3 centreOf(Coordinate const& c, double voxelSize)
{
    return {(c.x + 0.5) * voxelSize, (c.y + 0.5) * voxelSize, (c.z + 0.5) * voxelSize};
}

/// What a voxel of a level set has by the distance at its centre.
template <class Distance>
auto sampled(VoxelBox const& box, float voxelSize, float band, Distance const& distance)
{
    return [=](Coordinate const& c) {
        for (int axis = 0; axis < 3; ++axis)
            if (c[axis] < box.origin[axis] || c[axis] - box.origin[axis] >= box.size[axis])
                return band;
        return std::clamp(static_cast<float>(distance(centreOf(c, voxelSize))), -band, band);
    };
}

TYPED_TEST(Builders, ALevelSetSamplesADistanceAtEveryVoxelOfItsBox)
{
    struct Case {
        char const* name;
        double3 centre;
        double radius;
        float voxelSize, band;
        VoxelBox box;
    };
    constexpr int kFar = 1 << 30, kEnd = kCoordinateLimit;
    std::vector<Case> const cases{
        {"a sphere with a hollow of cells", {0.1, -0.2, 0.3}, 31, 1, 3, {{-40, -40, -40}, {80, 80, 80}}},
        {"cut by its box", {0, 0, 0}, 29, 1, 2, {{-7, -33, -9}, {50, 21, 44}}},
        {"small voxels", {1, 1, 1}, 0.5, 0.03f, 0.1f, {{10, 10, 10}, {47, 47, 47}}},
        {"far from zero", {-kFar, kFar, -kFar}, 11, 1, 3, {{-kFar - 16, kFar - 16, -kFar - 16}, {32, 32, 32}}},
        {"at the limits", {kEnd - 9, kEnd - 9, 9 - kEnd}, 11, 1, 3, {{kEnd - 30, kEnd - 30, -kEnd}, {30, 30, 30}}},
        {"nothing in the box", {0, 0, 0}, 3, 1, 1, {{100, 100, 100}, {20, 20, 20}}},
        {"all of the box inside", {0, 0, 0}, 500, 1, 1, {{-20, -20, -20}, {50, 50, 50}}},
    };
    for (Case const& c : cases) {
        SCOPED_TRACE(c.name);
        auto const distance = [&c](double3 const& p) { return length(p - c.centre) - c.radius; };
        GridDescription const description{.channelName = "d", .voxelSize = c.voxelSize};
        expectHolds(buildLevelSet<TypeParam>(description, c.box, c.band, distance),
                    {c.box.origin - Coordinate{6, 6, 6}, c.box.size + Coordinate{12, 12, 12}},
                    sampled(c.box, c.voxelSize, c.band, distance));
    }
    auto const solid = buildLevelSet<TypeParam>({.channelName = "d"}, {{-50, -50, -50}, {100, 100, 100}}, 1,
                                                [](double3 const& p) { return length(p) - 45; });
    EXPECT_LT(solid.topology->voxelCount(), 300000u) << "the inside is not made of voxels";

    auto const nowhere = [](double3 const& p) { return p.x < 0 ? std::nan("") : 100.0; };
    auto const grid = buildLevelSet<TypeParam>({.channelName = "d"}, {{-3, 0, 0}, {6, 2, 2}}, 1, nowhere);
    Accessor<TypeParam, float> value(*grid.topology, *grid.channel);
    EXPECT_TRUE(std::isnan(value({-1, 0, 0}))) << "what is no number stays";
    EXPECT_EQ(value({1, 0, 0}), 1.0f);
}

struct Points {
    Nexil::Array<float3> positions;
    Nexil::Array<float> radii;
};

Points randomPoints(std::size_t count, float3 const& centre, float largest)
{
    std::mt19937 random(3);
    std::uniform_real_distribution<float> offset(-20, 20);
    std::uniform_real_distribution<float> radius(0.2f, largest);
    Points points;
    for (std::size_t i = 0; i < count; ++i) {
        points.positions.push_back(centre + float3{offset(random), offset(random), offset(random)});
        points.radii.push_back(radius(random));
    }
    // These make nothing.
    for (float const badRadius : {-0.5f, std::nanf(""), std::numeric_limits<float>::infinity()}) {
        points.positions.push_back(centre);
        points.radii.push_back(badRadius);
    }
    points.positions.push_back({std::nanf(""), 0, 0});
    points.radii.push_back(5);
    return points;
}

TYPED_TEST(Builders, PointsMakeTheUnionOfTheirSpheres)
{
    struct Case {
        std::size_t count;
        float3 centre;
        float largest, voxelSize, width;
    };
    for (Case const& c : {Case{60, {0, 0, 0}, 4, 1, 2}, Case{3, {5, -9, 0.5f}, 18, 1, 1.5f},
                          Case{20, {-3, 0, 0}, 6, 2, 2}, Case{40, {-1 << 30, 1 << 30, 0}, 4, 1, 2}}) {
        Points const points = randomPoints(c.count, c.centre, c.largest);
        auto const distance = [&](double3 const& p) {
            double nearest = std::numeric_limits<double>::max();
            for (std::uint64_t i = 0; i < c.count; ++i) {
                float3 const& at = points.positions[i];
                nearest = std::min(nearest, length(p - double3{at.x, at.y, at.z}) - double(points.radii[i]));
            }
            return nearest;
        };
        auto voxel = [&](float v) { return static_cast<int>(v / c.voxelSize); };
        int const reach = voxel(20 + c.largest + c.width) + 2;
        VoxelBox const box{{voxel(c.centre.x) - reach, voxel(c.centre.y) - reach, voxel(c.centre.z) - reach},
                           {2 * reach, 2 * reach, 2 * reach}};
        GridDescription const description{.channelName = "d", .voxelSize = c.voxelSize};
        expectHolds(buildLevelSetFromPoints<TypeParam>(description, points.positions, points.radii, c.width), box,
                    sampled(box, c.voxelSize, c.width, distance));
        expectHolds(buildFogFromPoints<TypeParam>(description, points.positions, points.radii, c.width), box,
                    [&](Coordinate const& v) {
                        double const depth = -distance(centreOf(v, c.voxelSize));
                        return static_cast<float>(std::clamp(depth, 0.0, double(c.width)) / c.width);
                    });
    }
}

TYPED_TEST(Builders, OneResultForEveryNumberOfThreads)
{
    // Long enough for a part per thread; half of the voxels come twice.
    VoxelList const list = listOf({{0, 0, 0}, {500, -80, 1 << 30}}, 40, 400000);
    Points const points = randomPoints(500, {0, 0, 0}, 3);
    GridDescription const description{.channelName = "d", .voxelSize = 0.5f};
    std::vector<Grid<TypeParam>> first;
    support::onThreadCounts([&] {
        std::vector<Grid<TypeParam>> const grids{
            buildFromVoxels<TypeParam>(description, list.voxels, list.values, 0.0f),
            buildLevelSet<TypeParam>(description, {{-70, -70, -70}, {140, 140, 140}}, 1,
                                     [](double3 const& p) { return length(p) - 30; }),
            buildFogFromPoints<TypeParam>(description, points.positions, points.radii, 1)};
        if (first.empty())
            first = grids;
        for (std::size_t i = 0; i < grids.size(); ++i) {
            EXPECT_TRUE(support::sameTiles(grids[i].topology->levels(), first[i].topology->levels()));
            EXPECT_TRUE(support::sameBytes(*grids[i].channel->template values<float>(),
                                           *first[i].channel->template values<float>()));
        }
    });
}

TYPED_TEST(Builders, WhatCannotBeBuiltGivesAnEmptyGrid)
{
    using Traits = TypeParam;
    using Ints = Nexil::Array<int>;
    using Floats = Nexil::Array<float>;
    GridDescription const good{.channelName = "c"};
    auto voxels = [](GridDescription const& d, Nexil::Array<Coordinate> const& at, Ints const& values) {
        return bool(buildFromVoxels<Traits>(d, at, values, 0));
    };
    auto box = [](GridDescription const& d, Coordinate const& origin, Coordinate const& size, Ints const& values) {
        return bool(buildFromBox<Traits>(d, origin, size, values, 0));
    };
    auto plane = [](GridDescription const& d, VoxelBox const& in, float band) {
        return bool(buildLevelSet<Traits>(d, in, band, [](double3 const& p) { return p.x; }));
    };
    auto points = [](GridDescription const& d, Nexil::Array<float3> const& at, Floats const& radii, float width) {
        bool const isFog = bool(buildFogFromPoints<Traits>(d, at, radii, width));
        EXPECT_EQ(isFog, bool(buildLevelSetFromPoints<Traits>(d, at, radii, width)));
        return isFog;
    };
    // How many of the four builders build something small.
    auto built = [&](GridDescription const& d) {
        return voxels(d, {{0, 0, 0}}, {1}) + box(d, {0, 0, 0}, {1, 1, 1}, {1}) + plane(d, {{0, 0, 0}, {1, 1, 1}}, 1) +
               points(d, {{0, 0, 0}, {5, 5, 5}}, {1.0f}, 1);
    };
    EXPECT_EQ(built(good), 4);
    EXPECT_EQ(built({}), 0);
    EXPECT_EQ(built({.channelName = "voxel_component"}), 0);
    EXPECT_EQ(built({.channelName = "voxel_tile_tree"}), 0);
    EXPECT_EQ(built({.channelName = "c", .topologyName = "t", .containerName = "t"}), 0);
    float const noSizes[] = {0, -1, std::numeric_limits<float>::infinity(), std::nanf("")};
    for (float const size : noSizes)
        EXPECT_EQ(built({.channelName = "c", .voxelSize = size}), 0);
    {
        support::CancelAfter const cancel;
        EXPECT_THROW(voxels(good, {{0, 0, 0}}, {1}), std::runtime_error);
        EXPECT_THROW(box(good, {0, 0, 0}, {1, 1, 1}, {1}), std::runtime_error);
        EXPECT_THROW(plane(good, {{0, 0, 0}, {1, 1, 1}}, 1), std::runtime_error);
        EXPECT_THROW(points(good, {{0, 0, 0}}, {1.0f}, 1), std::runtime_error);
    }
    constexpr int kHalf = 1 << 30;
    EXPECT_FALSE(plane(good, {{-kHalf, -kHalf, -kHalf}, {2147483647, 2147483647, 2147483647}}, 1));
    // Of exactly 2^64 blocks.
    EXPECT_FALSE(buildLevelSet<WideTiles>(good, {{-104857600, -104857600, -26214400}, {209715200, 209715200, 52428800}},
                                          1, [](double3 const& p) { return p.x; }));
    for (float const width : noSizes) {
        EXPECT_FALSE(plane(good, {{0, 0, 0}, {1, 1, 1}}, width));
        EXPECT_FALSE(points(good, {{0, 0, 0}}, {1.0f}, width));
    }
    // A search for tiles ends when they have too many elements: those of a small box, and before it is through a large one.
    auto planeOf = [&](VoxelBox const& in, std::uint64_t mostElements) {
        auto const distance = [](double3 const& p) { return p.x; };
        return bool(Internal::buildLevelSet<Traits>(good, in, 1, Internal::fieldOf(distance), mostElements));
    };
    EXPECT_TRUE(planeOf({{-9, 0, 0}, {30, 30, 30}}, 1 << 20));
    EXPECT_FALSE(planeOf({{-9, 0, 0}, {30, 30, 30}}, 1000));
    EXPECT_FALSE(planeOf({{-1 << 19, 0, 0}, {1 << 20, 1 << 20, 1}}, 100000));
    // Spheres that touch too many tiles are told at once, not when the memory is full: a shell, a core, and many small ones.
    EXPECT_FALSE(points(good, {{0, 0, 0}}, {4500.0f}, 3));
    EXPECT_FALSE(points(good, {{0, 0, 0}}, {1e6f}, 1));
    Nexil::Array<float3> same;
    same.resize(1000000);
    EXPECT_FALSE(points(good, same, {30.0f}, 3));
    constexpr int kEnd = kCoordinateLimit;
    EXPECT_TRUE(voxels(good, {}, {}));
    EXPECT_FALSE(voxels(good, {{0, 0, 0}}, {1, 2}));
    EXPECT_FALSE(voxels(good, {{0, kEnd, 0}}, {1}));
    EXPECT_FALSE(voxels(good, {{0, 0, -kEnd - 1}}, {1}));
    EXPECT_FALSE(box(good, {0, 0, 0}, {1, 1, 2}, {1}));
    EXPECT_FALSE(box(good, {0, 0, 0}, {1, 2, 1}, {1, 2, 3}));
    EXPECT_FALSE(box(good, {0, 0, 0}, {1, 0, 1}, {}));
    EXPECT_FALSE(box(good, {0, 0, 0}, {-1, -1, 1}, {1}));
    EXPECT_FALSE(box(good, {kEnd, 0, 0}, {1, 1, 1}, {1}));
    EXPECT_FALSE(box(good, {0, -kEnd - 1, 0}, {1, 1, 1}, {1}));
    EXPECT_FALSE(plane(good, {{0, 0, 0}, {1, 0, 1}}, 1));
    EXPECT_FALSE(plane(good, {{kEnd, 0, 0}, {1, 1, 1}}, 1));
    EXPECT_TRUE(points(good, {}, {}, 1));
    EXPECT_FALSE(points(good, {{0, 0, 0}}, {1, 2, 3}, 1));
    EXPECT_FALSE(points(good, {{0, 0, 3e9f}}, {1.0f}, 1));
}

} // namespace
