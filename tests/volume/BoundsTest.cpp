#include "Samples.h"

#include <support/Geometry.h>

#include <veldrin/volume/VolumeBounds.h>
#include <veldrin/volume/VolumeConversion.h>
#include <vld/BuildFromValues.h>

#include <cmath>
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

/// Volumes of any size anywhere, of few values or many, which are mostly one and sometimes any of `values`.
template <class Traits, class T, class IsContent>
void expectBounds(char const* channelName, std::vector<T> const& values, IsContent const& isContent)
{
    for (unsigned int seed = 0; seed < 40; ++seed) {
        SCOPED_TRACE(seed);
        std::mt19937 random(seed);
        auto oneOf = [&](auto const& choices) { return choices[random() % std::size(choices)]; };
        int const starts[] = {0, -57, 1 << 30, -(1 << 30)}, spreads[] = {2, 20, 60, 500};
        Coordinate const centre{oneOf(starts), oneOf(starts), oneOf(starts)};
        std::uniform_int_distribution<int> offset(-oneOf(spreads), 0);
        float const voxelSizes[] = {0.1f, 1, 2};
        T const mostly = oneOf(values);
        Nexil::Array<Coordinate> voxels;
        Nexil::Array<T> voxelValues;
        for (int i = 0; i < 2000; ++i) {
            voxels.push_back(centre + Coordinate{offset(random), offset(random), offset(random)});
            voxelValues.push_back(random() % 100 == 0 ? oneOf(values) : mostly);
        }
        auto const grid = buildFromVoxels<Traits>({.channelName = channelName, .voxelSize = oneOf(voxelSizes)}, voxels,
                                                  voxelValues, oneOf(values));
        Box expected;
        growByEveryElement<Traits, T>(grid, isContent, expected);
        auto volume = VLD::createObject();
        ASSERT_TRUE(grid.addTo(*volume));
        support::onThreadCounts([&] {
            Box box;
            EXPECT_TRUE(GeometryAlgorithms::volumeBounds(*volume, *grid.container, *grid.topology, box));
            EXPECT_EQ(box, expected);
        });
        Box box;
        GeometryAlgorithms::getVolumeBounds(*Geometry::move_vld_volume_to_object(*volume), box);
        EXPECT_EQ(box, expected);
    }
}

TYPED_TEST(VolumeBounds, AreThoseOfALoopOverAllElements)
{
    float const infinity = std::numeric_limits<float>::infinity();
    expectBounds<TypeParam, float>("voxel_signed_distance",
                                   std::vector<float>{3, -1, -0.0f, 1e-30f, std::nanf(""), -infinity},
                                   [](float v) { return v <= 0; });
    expectBounds<TypeParam, double>("voxel_fog_density",
                                    std::vector<double>{0.5, -0.0, -1, 1e-300, std::nan(""), infinity},
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
    using Other = std::conditional_t<std::is_same_v<Traits, SmallTiles>, WideTiles, SmallTiles>;
    auto const grid = support::sphere<Traits>({.channelName = "voxel_signed_distance"}, 5);
    auto const values = grid.channel->template values<float>();
    auto const few = Nexil::makePtr<Nexil::Array<float>>(Nexil::Array<float>{-1});
    Nexil::Array<int> integers;
    integers.resize(grid.topology->elementCount());
    auto channel = [](char const* name, char const* container, auto const& data) {
        return Nexil::makePtr<Channel<Traits>>(name, container, data, std::decay_t<decltype((*data)[0])>());
    };
    Nexil::Ptr<VLD::Component> const channels[] = {
        channel("voxel_signed_distance", "voxel_tile_tree", few), channel("voxel_signed_distance", "elsewhere", values),
        channel("voxel_signed_distance", "voxel_tile_tree", Nexil::makePtr<Nexil::Array<int>>(std::move(integers))),
        channel("voxel_depth", "voxel_tile_tree", values),
        Nexil::makePtr<Channel<Other>>("voxel_signed_distance", "voxel_tile_tree", values, 0.0f)};
    Box const before{{1, 2, 3}, {4, 5, 6}};
    auto expectNothing = [&](Container<Traits> const& container, auto const& component) {
        auto volume = VLD::createObject();
        volume->addComponent(component);
        Box box = before;
        EXPECT_FALSE(GeometryAlgorithms::volumeBounds(*volume, container, *grid.topology, box));
        EXPECT_EQ(box, before);
    };
    for (auto const& component : channels)
        expectNothing(*grid.container, component);
    // A container of other tiles than it is said, of tiles that lack cells, of none.
    TileLevels tiles = support::tilesOf(*grid.topology);
    tiles.innerChildren.clear();
    expectNothing(Container<Traits>("voxel_tile_tree", Nexil::makePtr<VoxelTopology<Traits>>("t", tiles), 1.0f),
                  grid.channel);
    expectNothing(Container<Traits>("voxel_tile_tree", Nexil::makePtr<VoxelTopology<Traits>>("t", TileLevels()), 1.0f),
                  grid.channel);
    expectNothing(Container<Traits>("voxel_tile_tree", nullptr, 1.0f), grid.channel);
    Box box = before;
    GeometryAlgorithms::getVolumeBounds(*support::filled([](Object& o) { Geometry::populateCubeMesh(9, o); }), box);
    EXPECT_EQ(box, before);
}

} // namespace
