#include <support/Volumes.h>

#include <vld/BuildFromValues.h>
#include <vld/Container.h>
#include <vld/PointTopology.h>

#include <cmath>
#include <functional>
#include <map>
#include <random>
#include <tuple>

namespace {

using namespace VLD::TileTree3D;

template <class Traits>
class Topology : public ::testing::Test {
public:
    /// Tiles in several inner tiles, some of them with several leaf tiles.
    static TileLevels sound()
    {
        Nexil::Array<Coordinate> voxels;
        for (int i = -4; i < 5; ++i)
            voxels.push_back({i * Traits::kDataWidth, i % 3 * Traits::kInnerWidth, 1});
        Nexil::Array<bool> values;
        values.resize(voxels.size());
        return support::tilesOf(*buildFromVoxels<Traits>({.channelName = "c"}, voxels, values, false).topology);
    }
};
TYPED_TEST_SUITE(Topology, support::BothConfigurations);

template <class Traits>
std::string reportOf(Container<Traits> const& container)
{
    ::testing::internal::CaptureStdout();
    static_cast<void>(container.checkConsistency(true));
    return ::testing::internal::GetCapturedStdout();
}

TYPED_TEST(Topology, ConsistencyCheckFindsEachKindOfDamage)
{
    using Traits = TypeParam;
    constexpr int kWidth = Traits::kDataWidth;
    struct Damage {
        std::string report;
        std::function<void(TileLevels&)> apply;
    };
    auto swap = [](auto& array, std::uint64_t a, std::uint64_t b) { std::swap(array[a], array[b]); };
    auto addInner = [](TileLevels& levels, Coordinate const& origin) {
        levels.innerOrigins.push_back(origin);
        for (unsigned int cell = 0; cell < Traits::kInnerCells; ++cell)
            levels.innerChildren.push_back(kNoTile);
    };
    auto const innerCount = this->sound().innerOrigins.size();
    std::string const newInner = "wrong origin of inner tile " + std::to_string(innerCount);
    std::string const lastCell = "wrong child in cell " + std::to_string(innerCount * Traits::kInnerCells - 1);
    std::vector<Damage> const damages{
        // Leaf tiles in another order, with all that points at them.
        {"wrong origin of leaf tile 1",
         [&](TileLevels& l) {
             swap(l.leafOrigins, 0, 1);
             swap(l.leafParents, 0, 1);
             for (unsigned int& child : l.innerChildren)
                 child = child < 2 ? 1 - child : child;
         }},
        {"wrong origin of leaf tile 1", [&](TileLevels& l) { l.leafOrigins[1] = l.leafOrigins[0]; }},
        {"wrong origin of leaf tile 3", [&](TileLevels& l) { l.leafOrigins[3].z += 1, l.leafOrigins[5].z += 1; }},
        {"no cell of its parent points at leaf tile 0", [&](TileLevels& l) { l.leafOrigins[0].x -= 100 * kWidth; }},
        {"wrong origin of inner tile 1", [&](TileLevels& l) { swap(l.innerOrigins, 0, 1); }},
        // An inner tile twice, once without leaf tiles; beyond the limits; not aligned.
        {newInner, [&](TileLevels& l) { addInner(l, l.innerOrigins[l.innerOrigins.size() - 1]); }},
        {newInner,
         [&](TileLevels& l) {
             addInner(l, {kCoordinateLimit, 0, 0});
         }},
        {newInner,
         [&](TileLevels& l) {
             addInner(l, {kCoordinateLimit - kWidth, 0, 0});
         }},
        {"parents are not one per leaf tile", [&](TileLevels& l) { l.leafParents.resize(l.leafParents.size() - 1); }},
        {"no cell of its parent points at leaf tile 2",
         [&](TileLevels& l) { l.leafParents[2] = unsigned(l.innerOrigins.size()); }},
        {"no cell of its parent points at leaf tile 0", [&](TileLevels& l) { l.leafParents[0] = l.leafParents[8]; }},
        {"children are not one per cell", [&](TileLevels& l) { l.innerChildren.resize(l.innerChildren.size() - 1); }},
        {lastCell,
         [&](TileLevels& l) { l.innerChildren[l.innerChildren.size() - 1] = unsigned(l.leafOrigins.size()); }},
        {lastCell, [&](TileLevels& l) { l.innerChildren[l.innerChildren.size() - 1] = 0; }},
        {"no cell of its parent points at leaf tile 0",
         [&](TileLevels& l) { *std::find(l.innerChildren.begin(), l.innerChildren.end(), 0u) = kNoTile; }},
        {"no cell of its parent points at leaf tile 0",
         [&](TileLevels& l) {
             l.innerOrigins.clear();
             l.innerChildren.clear();
         }},
    };
    EXPECT_TRUE(VoxelTopology<Traits>::create("t", this->sound()));
    EXPECT_TRUE(VoxelTopology<Traits>::create("t", TileLevels()));
    EXPECT_FALSE(VoxelTopology<Traits>::create("", this->sound()));
    for (Damage const& damage : damages) {
        SCOPED_TRACE(&damage - damages.data());
        TileLevels levels = this->sound();
        damage.apply(levels);
        EXPECT_FALSE(VoxelTopology<Traits>::create("t", levels));
        auto const topology = Nexil::makePtr<VoxelTopology<Traits>>("t", levels);
        Container<Traits> const container("c", topology, 1);
        EXPECT_FALSE(container.checkConsistency(false));
        EXPECT_EQ(reportOf(container), "topology t: " + damage.report + "\n");
    }
    auto const good = Nexil::makePtr<VoxelTopology<Traits>>("t", this->sound());
    SharedTileLevels others = good->levels();
    EXPECT_TRUE(VoxelTopology<Traits>::create("t", others, *good));
    others.leafParents = Nexil::makePtr<Nexil::Array<unsigned int>>();
    EXPECT_FALSE(VoxelTopology<Traits>::create("t", others, *good));
    auto const apart = buildFromVoxels<Traits>({.channelName = "c"}, {{999, 0, 0}}, Nexil::Array<bool>{true}, false);
    auto const same = VoxelTopology<Traits>::create("t", apart.topology->levels(), *good);
    EXPECT_EQ(same->findElement({999, 0, 0}), apart.topology->findElement({999, 0, 0}));
    EXPECT_TRUE(Container<Traits>("c", good, 0.5f).checkConsistency(true));
    std::uint64_t const arrays = good->leafCount() * 16ull + good->innerCount() * (12 + 4ull * Traits::kInnerCells);
    EXPECT_EQ(good->byteSize() - arrays, sizeof(*good) + sizeof(TileHash) + TileHash(good->innerOrigins()).byteSize());
    EXPECT_FALSE(Container<Traits>("c", nullptr, 0.5f).checkConsistency(false));
    for (float const size : {0.0f, -1.0f, std::numeric_limits<float>::infinity(), std::nanf("")})
        EXPECT_FALSE(Container<Traits>("c", good, size).checkConsistency(false));
}

TEST(HugeTopology, OfMoreElementsThan32BitsCountIsNotConsistent)
{
    auto const topology = support::hugeTopology();
    EXPECT_EQ(reportOf(Container<WideTiles>("c", topology, 1)), "topology huge: more elements than 32 bits count\n");
    EXPECT_TRUE(topology->elementIndices()->empty());
}

/// Writes down which tiles it saw, in the order in which parts were joined.
template <class Traits>
class Recorder final : public Visitor<Traits> {
public:
    std::unique_ptr<Visitor<Traits>> fork() const override { return std::make_unique<Recorder>(); }
    void visitLeaves(VoxelTopology<Traits> const&, unsigned int begin, unsigned int end) override
    {
        for (unsigned int tile = begin; tile < end; ++tile)
            seen.push_back(tile);
    }
    void visitInner(VoxelTopology<Traits> const& topology, unsigned int begin, unsigned int end) override
    {
        for (unsigned int tile = begin; tile < end; ++tile)
            seen.push_back(topology.leafCount() + tile);
    }
    void join(Visitor<Traits>& right) override
    {
        auto const& other = static_cast<Recorder&>(right).seen;
        seen.insert(seen.end(), other.begin(), other.end());
    }
    std::vector<unsigned int> seen;
};

TYPED_TEST(Topology, AReductionJoinsAllTilesInTheirOrderOnAnyNumberOfThreads)
{
    std::mt19937 random(1);
    Nexil::Array<Coordinate> voxels;
    for (int i = 0; i < 3000; ++i)
        voxels.push_back({static_cast<int>(random() % 400), static_cast<int>(random() % 400), 0});
    Nexil::Array<bool> values;
    values.resize(voxels.size());
    auto const grid = buildFromVoxels<TypeParam>({.channelName = "c"}, voxels, values, false);
    ASSERT_GT(grid.topology->leafCount(), 1000u);
    std::vector<unsigned int> expected(grid.topology->leafCount() + grid.topology->innerCount());
    std::iota(expected.begin(), expected.end(), 0u);
    support::onThreadCounts([&] {
        Recorder<TypeParam> recorder;
        grid.container->reduceInternalNonInlined(recorder);
        EXPECT_EQ(recorder.seen, expected);
    });
    Recorder<TypeParam> nothing;
    Container<TypeParam>("c", nullptr, 1).reduceInternalNonInlined(nothing);
    EXPECT_TRUE(nothing.seen.empty());
}

TYPED_TEST(Topology, PointsAreSortedIntoTheirTilesAndKeepTheirOrderThere)
{
    std::mt19937 random(5);
    std::uniform_real_distribution<float> place(-30, 30);
    Nexil::Array<Veldrin::Math::float3> positions;
    std::map<std::tuple<int, int, int>, std::vector<unsigned int>> pointsOfTile;
    auto voxel = [](float v) { return static_cast<int>(std::floor(double(v) / 0.5)); };
    for (unsigned int i = 0; i < 20000; ++i) {
        positions.push_back({place(random), place(random), place(random)});
        auto const& p = positions[i];
        auto const tile = tileOrigin<TypeParam::kDataWidth>({voxel(p.x), voxel(p.y), voxel(p.z)});
        pointsOfTile[{tile.x, tile.y, tile.z}].push_back(i);
    }
    support::onThreadCounts([&] {
        Nexil::Array<unsigned int> order;
        auto const topology = PointTopology<TypeParam>::build("p", positions, 0.5f, order);
        ASSERT_TRUE(topology);
        EXPECT_TRUE(topology->isConsistent());
        ASSERT_EQ(topology->leafOrigins().size(), pointsOfTile.size());
        EXPECT_EQ(topology->elementCount(), positions.size());
        std::uint64_t tile = 0, element = 0;
        for (auto const& [origin, points] : pointsOfTile) {
            Coordinate const& c = topology->leafOrigins()[tile];
            EXPECT_EQ(std::tuple(c.x, c.y, c.z), origin);
            EXPECT_EQ(topology->offsets()[tile++], element);
            for (unsigned int const point : points)
                ASSERT_EQ(order[element++], point);
        }
    });
    Nexil::Array<unsigned int> order{7};
    EXPECT_FALSE(PointTopology<TypeParam>::build("p", {{0, 0, 0}, {0, 0, 1e10f}}, 0.5f, order));
    EXPECT_FALSE(PointTopology<TypeParam>::build("p", {{0, 0, 2147483648.0f}}, 1, order));
    for (float const size : {0.0f, std::numeric_limits<float>::infinity()})
        EXPECT_FALSE(PointTopology<TypeParam>::build("p", positions, size, order));
    EXPECT_EQ(order.size(), 1u);

    constexpr int w = TypeParam::kDataWidth;
    struct Case {
        bool isSound;
        Nexil::Array<Coordinate> origins;
        Nexil::Array<unsigned int> offsets;
    };
    for (Case const& c : {Case{true, {{0, 0, 0}, {0, w, 0}}, {0, 0, 3}}, Case{false, {{0, w, 0}, {0, 0, 0}}, {0, 0, 3}},
                          Case{false, {{0, w, 0}, {0, w, 0}}, {0, 0, 3}}, Case{false, {{0, w + 1, 0}}, {0, 3}},
                          Case{false, {{0, 0, kCoordinateLimit}}, {0, 3}},
                          Case{false, {{0, 0, 0}, {0, w, 0}}, {0, 4, 3}}, Case{false, {{0, 0, 0}, {0, w, 0}}, {0, 3}},
                          Case{false, {{0, 0, 0}}, {0, 0, 3}}, Case{false, {{0, 0, 0}}, {1, 2}}})
        EXPECT_EQ(bool(PointTopology<TypeParam>::create("p", c.origins, c.offsets)), c.isSound);
    EXPECT_FALSE(PointTopology<TypeParam>::create("", {}, Nexil::Array<unsigned int>{0}));
}

} // namespace
