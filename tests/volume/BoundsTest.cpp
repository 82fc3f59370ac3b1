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

/// The largest float that is no larger.
float nearestNotAbove(long double value)
{
    float below = std::nextafter(static_cast<float>(value), -HUGE_VALF);
    for (float above = below; above <= value; above = std::nextafter(above, HUGE_VALF))
        below = above;
    return below;
}

/// A volume of few or many voxels anywhere, and the box that a loop over its elements finds.
template <class Traits>
class DrawnVolume {
public:
    explicit DrawnVolume(unsigned int seed) : random_(seed)
    {
        int const starts[] = {0, -57, 1 << 30, -(1 << 30)}, spreads[] = {2, 20, 60, 500};
        Coordinate const start{oneOf(starts), oneOf(starts), oneOf(starts)};
        std::uniform_int_distribution<int> offset(-oneOf(spreads), 0);
        for (int i = 0; i < 2000; ++i)
            voxels_.push_back(start + Coordinate{offset(random_), offset(random_), offset(random_)});
    }

    /// Adds a channel of what is mostly one and sometimes any of the values.
    template <class T, class IsContent>
    void add(char const* channelName, std::vector<T> const& values, IsContent const& isContent)
    {
        T const mostly = oneOf(values);
        Nexil::Array<T> drawn;
        for (std::uint64_t i = 0; i < voxels_.size(); ++i)
            drawn.push_back(random_() % 100 == 0 ? oneOf(values) : mostly);
        auto const grid =
            buildFromVoxels<Traits>({.channelName = channelName, .voxelSize = 0.1f}, voxels_, drawn, oneOf(values));
        Nexil::MutablePtr<Channel<Traits>> channel(Nexil::Ptr<Channel<Traits>>{grid.channel});
        auto const elements = channel->template writeValues<T>();
        for (unsigned int element = 0; element < elements.size(); ++element) {
            // Nobody looks at the value of a cell with a leaf tile.
            if (grid.topology->isCellWithLeaf(element))
                elements[element] = oneOf(values);
            else if (isContent(elements[element]))
                growBy(grid.topology->elementCube(element));
        }
        volume->addComponent(grid.topology);
        volume->addComponent(grid.container);
        volume->addComponent(std::move(channel));
    }

    Nexil::MutablePtr<VLD::Object> volume = VLD::createObject();
    Box box{{-9, 0, 0}, {0, 0, 2}};

private:
    void growBy(VoxelCube const& cube)
    {
        for (int axis = 0; axis < 3; ++axis) {
            long double const low = cube.origin[axis];
            box.min[axis] = std::min(box.min[axis], nearestNotAbove(low * 0.1f));
            box.max[axis] = std::max(box.max[axis], -nearestNotAbove(-(low + cube.width) * 0.1f));
        }
    }

    template <class Choices>
    auto oneOf(Choices const& choices)
    {
        return choices[random_() % std::size(choices)];
    }

    std::mt19937 random_;
    Nexil::Array<Coordinate> voxels_;
};

TYPED_TEST(VolumeBounds, GrowABoxLikeALoopOverAllElements)
{
    float const infinity = std::numeric_limits<float>::infinity();
    for (unsigned int seed = 0; seed < 60; ++seed) {
        SCOPED_TRACE(seed);
        DrawnVolume<TypeParam> drawn(seed);
        Box const before = drawn.box;
        if (seed % 3 != 0)
            drawn.add("voxel_signed_distance", std::vector<float>{3, -1, -0.0f, 1e-30f, std::nanf(""), -infinity},
                      [](float v) { return v <= 0; });
        if (seed % 3 != 1)
            drawn.add("voxel_fog_density", std::vector{0.5, -0.0, -1.0, 1e-300, std::nan(""), double(infinity)},
                      [](double v) { return v > 0; });
        auto const container = drawn.volume->template component<Container<TypeParam>>("voxel_tile_tree");
        support::onThreadCounts([&] {
            Box box = before;
            EXPECT_TRUE(GeometryAlgorithms::volumeBounds(*drawn.volume, *container, *container->topology(), box));
            EXPECT_EQ(box, drawn.box);
        });
        Box box = before;
        GeometryAlgorithms::getVolumeBounds(*Geometry::move_vld_volume_to_object(*drawn.volume), box);
        EXPECT_EQ(box, drawn.box);
    }
}

TYPED_TEST(VolumeBounds, HoldTheContentOfAllContainers)
{
    using Other = std::conditional_t<std::is_same_v<TypeParam, SmallTiles>, WideTiles, SmallTiles>;
    auto const add = [](auto traits, int x, char const* topology, char const* container, char const* channel,
                        auto& volume) {
        buildFromVoxels<decltype(traits)>(
            {.channelName = channel, .topologyName = topology, .containerName = container},
            Nexil::Array<Coordinate>{{x, 0, 0}}, Nexil::Array<float>{x < 0 ? -1.0f : 1.0f}, x < 0 ? 3.0f : 0.0f)
            .addTo(volume);
    };
    auto volume = VLD::createObject();
    add(TypeParam(), -7, "a", "b", "voxel_signed_distance", *volume);
    add(Other(), 9, "c", "d", "voxel_fog_density", *volume);
    add(TypeParam(), 5, "e", "f", "voxel_depth", *volume);
    Box box;
    GeometryAlgorithms::getVolumeBounds(*Geometry::move_vld_volume_to_object(*volume), box);
    EXPECT_EQ(box.min.x, -7);
    EXPECT_EQ(box.max.x, 10);
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
