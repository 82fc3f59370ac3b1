#include <support/Volumes.h>

#include <vld/Accessor.h>
#include <vld/BuildFromPoints.h>
#include <vld/BuildLevelSet.h>

#include <cmath>
#include <functional>
#include <random>

namespace {

using namespace VLD::TileTree3D;
using Veldrin::Math::double3;
using Veldrin::Math::float3;

template <class Traits>
class BuildLevelSet : public ::testing::Test {};
TYPED_TEST_SUITE(BuildLevelSet, support::BothConfigurations);

template <class Traits>
bool isInBox(VoxelBox const& box, Coordinate const& c)
{
    for (int axis = 0; axis < 3; ++axis)
        if (c[axis] < box.origin[axis] || c[axis] - box.origin[axis] >= box.size[axis])
            return false;
    return true;
}

/// Every voxel of the box, and of some around it, holds the function's value within the band.
template <class Traits, class Distance>
void expectSampled(Grid<Traits> const& grid, VoxelBox const& box, float voxelSize, float band, Distance const& distance)
{
    ASSERT_TRUE(grid);
    EXPECT_TRUE(grid.container->checkConsistency(true));
    Accessor<Traits, float> value(*grid.topology, *grid.channel);
    support::forEachVoxel(
        box.origin - Coordinate{6, 6, 6}, box.size + Coordinate{12, 12, 12}, [&](Coordinate const& c) {
            double3 const centre{(c.x + 0.5) * voxelSize, (c.y + 0.5) * voxelSize, (c.z + 0.5) * voxelSize};
            float const wanted =
                isInBox<Traits>(box, c) ? std::clamp(static_cast<float>(distance(centre)), -band, band) : band;
            ASSERT_EQ(value(c), wanted) << c.x << " " << c.y << " " << c.z;
        });
}

TYPED_TEST(BuildLevelSet, SamplesADistanceAtEveryVoxelOfItsBox)
{
    struct Case {
        char const* name;
        double3 centre;
        double radius;
        float voxelSize, band;
        VoxelBox box;
    };
    double const far = 1 << 30;
    std::vector<Case> const cases{
        {"a sphere with a hollow of cells", {0.1, -0.2, 0.3}, 31, 1, 3, {{-40, -40, -40}, {80, 80, 80}}},
        {"cut by its box", {0, 0, 0}, 29, 1, 2, {{-7, -33, -9}, {50, 21, 44}}},
        {"small voxels", {1, 1, 1}, 0.5, 0.03f, 0.1f, {{10, 10, 10}, {47, 47, 47}}},
        {"far from zero",
         {-far, far, -far},
         11,
         1,
         3,
         {{-(1 << 30) - 16, (1 << 30) - 16, -(1 << 30) - 16}, {32, 32, 32}}},
        {"nothing in the box", {0, 0, 0}, 3, 1, 1, {{100, 100, 100}, {20, 20, 20}}},
        {"all of the box inside", {0, 0, 0}, 500, 1, 1, {{-20, -20, -20}, {50, 50, 50}}},
    };
    for (Case const& c : cases) {
        SCOPED_TRACE(c.name);
        auto const distance = [&c](double3 const& p) { return length(p - c.centre) - c.radius; };
        auto const grid =
            buildLevelSet<TypeParam>({.channelName = "d", .voxelSize = c.voxelSize}, c.box, c.band, distance);
        expectSampled(grid, c.box, c.voxelSize, c.band, distance);
    }
    auto const solid = buildLevelSet<TypeParam>({.channelName = "d"}, {{-50, -50, -50}, {100, 100, 100}}, 1,
                                                [](double3 const& p) { return length(p) - 45; });
    EXPECT_LT(solid.topology->voxelCount(), 300000u) << "the inside is not made of voxels";
}

TYPED_TEST(BuildLevelSet, ValuesThatAreNoNumbersStayAndBadBandsAndBoxesGiveNothing)
{
    auto const nowhere = [](double3 const& p) { return p.x < 0 ? std::nan("") : 100.0; };
    auto const grid = buildLevelSet<TypeParam>({.channelName = "d"}, {{-3, 0, 0}, {6, 2, 2}}, 1, nowhere);
    Accessor<TypeParam, float> value(*grid.topology, *grid.channel);
    EXPECT_TRUE(std::isnan(value({-1, 0, 0})));
    EXPECT_EQ(value({1, 0, 0}), 1.0f);

    auto const plane = [](double3 const& p) { return p.x; };
    VoxelBox const box{{0, 0, 0}, {1, 1, 1}};
    GridDescription const description{.channelName = "d"};
    EXPECT_TRUE(buildLevelSet<TypeParam>(description, box, 1, plane));
    for (float const band : {0.0f, -1.0f, std::numeric_limits<float>::infinity(), std::nanf("")})
        EXPECT_FALSE(buildLevelSet<TypeParam>(description, box, band, plane));
    EXPECT_FALSE(buildLevelSet<TypeParam>({}, box, 1, plane));
    EXPECT_FALSE(buildLevelSet<TypeParam>(description, {{0, 0, 0}, {1, 0, 1}}, 1, plane));
    EXPECT_FALSE(buildLevelSet<TypeParam>(description, {{kCoordinateLimit, 0, 0}, {1, 1, 1}}, 1, plane));
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
    points.positions.push_back({std::nanf(""), 0, 0});
    points.radii.push_back(5);
    points.positions.push_back(centre);
    points.radii.push_back(-5);
    return points;
}

TYPED_TEST(BuildLevelSet, PointsMakeTheUnionOfTheirSpheres)
{
    struct Case {
        std::size_t count;
        float3 centre;
        float largest, voxelSize, width;
    };
    for (Case const& c : {Case{60, {0, 0, 0}, 4, 1, 2}, Case{3, {5, -9, 0.5f}, 18, 1, 1.5f},
                          Case{20, {-3, 0, 0}, 6, 2, 2}, Case{40, {-1 << 20, 1 << 20, 0}, 4, 1, 2}}) {
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
        auto const reach = static_cast<int>((20 + c.largest + c.width) / c.voxelSize) + 2;
        VoxelBox const box{Coordinate{voxel(c.centre.x), voxel(c.centre.y), voxel(c.centre.z)} -
                               Coordinate{reach, reach, reach},
                           {2 * reach, 2 * reach, 2 * reach}};
        GridDescription const description{.channelName = "d", .voxelSize = c.voxelSize};

        auto const levelSet = buildLevelSetFromPoints<TypeParam>(description, points.positions, points.radii, c.width);
        expectSampled(levelSet, box, c.voxelSize, c.width, distance);

        auto const fog = buildFogFromPoints<TypeParam>(description, points.positions, points.radii, c.width);
        ASSERT_TRUE(fog);
        EXPECT_TRUE(fog.container->checkConsistency(true));
        Accessor<TypeParam, float> density(*fog.topology, *fog.channel);
        support::forEachVoxel(box.origin, box.size, [&](Coordinate const& v) {
            double const d =
                distance({(v.x + 0.5) * c.voxelSize, (v.y + 0.5) * c.voxelSize, (v.z + 0.5) * c.voxelSize});
            ASSERT_EQ(density(v), static_cast<float>(std::clamp(-d, 0.0, double(c.width)) / c.width));
        });
    }
}

TYPED_TEST(BuildLevelSet, OneResultForEveryNumberOfThreads)
{
    Points const points = randomPoints(500, {0, 0, 0}, 3);
    auto const distance = [](double3 const& p) { return length(p) - 30; };
    Grid<TypeParam> sphere, cloud;
    support::onThreadCounts([&] {
        GridDescription const description{.channelName = "d", .voxelSize = 0.5f};
        auto const newSphere = buildLevelSet<TypeParam>(description, {{-70, -70, -70}, {140, 140, 140}}, 1, distance);
        auto const newCloud = buildFogFromPoints<TypeParam>(description, points.positions, points.radii, 1);
        if (!sphere) {
            sphere = newSphere;
            cloud = newCloud;
        }
        for (auto const& [a, b] : {std::pair(sphere, newSphere), std::pair(cloud, newCloud)}) {
            EXPECT_TRUE(support::sameTiles(a.topology->levels(), b.topology->levels()));
            EXPECT_TRUE(support::sameBytes(*a.channel->template values<float>(), *b.channel->template values<float>()));
        }
    });
}

TYPED_TEST(BuildLevelSet, PointsThatCannotBeRasterisedGiveNothing)
{
    GridDescription const description{.channelName = "d"};
    Nexil::Array<float3> const two{{0, 0, 0}, {5, 5, 5}};
    EXPECT_TRUE(buildFogFromPoints<TypeParam>(description, two, {1.0f}, 1));
    EXPECT_TRUE(buildFogFromPoints<TypeParam>(description, {}, Nexil::Array<float>(), 1));
    EXPECT_FALSE(buildFogFromPoints<TypeParam>(description, two, {1, 2, 3}, 1));
    EXPECT_FALSE(buildFogFromPoints<TypeParam>(description, two, {1.0f}, 0));
    EXPECT_FALSE(buildFogFromPoints<TypeParam>(description, {{0, 0, 3e9f}}, {1.0f}, 1));
    EXPECT_FALSE(buildLevelSetFromPoints<TypeParam>(description, two, {1.0f}, std::nanf("")));
}

} // namespace
