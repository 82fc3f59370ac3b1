#include "Spheres.h"

#include <veldrin/geometry/Prototypes.h>
#include <veldrin/volume/VolumeBounds.h>
#include <veldrin/volume/VolumeConversion.h>
#include <vld/Accessor.h>
#include <vld/BuildFromPoints.h>
#include <vld/BuildFromValues.h>

#include <benchmark/benchmark.h>

#include <tbb/global_control.h>

#include <cstring>

// The volume library by itself, in both configurations, on 1 and 2 threads: the first number says how many. The copy of the bytes
// of a channel is the limit of what looks at all of them.
namespace {

using namespace VLD::TileTree3D;
using Veldrin::Math::float3;

constexpr int kRadius = 125;

struct ThreadLimit : tbb::global_control {
    explicit ThreadLimit(benchmark::State const& state)
        : tbb::global_control(max_allowed_parallelism, static_cast<std::size_t>(state.range(0)))
    {
    }
};

template <class Traits>
void countVoxels(benchmark::State& state, Grid<Traits> const& grid)
{
    auto const perSecond = benchmark::Counter::kIsIterationInvariantRate;
    state.counters["voxels"] = benchmark::Counter(static_cast<double>(grid.topology->voxelCount()), perSecond);
}

template <class Traits>
void buildSphere(benchmark::State& state)
{
    ThreadLimit const limit(state);
    Grid<Traits> grid;
    for (auto _ : state)
        grid = bench::sphere<Traits>(kRadius);
    countVoxels(state, grid);
    state.counters["MB"] = static_cast<double>(grid.topology->byteSize() + grid.channel->elementCount() * 4) / 1e6;
}

template <class Traits>
void buildFromVoxelList(benchmark::State& state)
{
    ThreadLimit const limit(state);
    bench::BandVoxels list(bench::sphere<Traits>(kRadius));
    if (state.range(1) != 0)
        list.shuffle();
    for (auto _ : state)
        benchmark::DoNotOptimize(buildFromVoxels<Traits>({.channelName = "c"}, list.voxels, list.values, bench::kBand));
    state.SetItemsProcessed(state.iterations() * static_cast<std::int64_t>(list.voxels.size()));
}

template <class Traits>
void buildFromDenseBox(benchmark::State& state)
{
    ThreadLimit const limit(state);
    constexpr int kSide = 200;
    Nexil::Array<float> values;
    values.resize(std::uint64_t(kSide) * kSide * kSide);
    for (std::uint64_t i = 0; i < values.size(); ++i)
        values[i] = i % kSide < 100 ? 1.0f : 0.0f;
    for (auto _ : state)
        benchmark::DoNotOptimize(
            buildFromBox<Traits>({.channelName = "c"}, {-7, 3, 11}, {kSide, kSide, kSide}, values, 0.0f));
    state.SetItemsProcessed(state.iterations() * static_cast<std::int64_t>(values.size()));
}

template <class Traits>
void rasterisePoints(benchmark::State& state)
{
    ThreadLimit const limit(state);
    Nexil::Array<float3> positions;
    for (Coordinate const& voxel : bench::voxelsInShell(kRadius, 100000))
        positions.push_back({float(voxel.x), float(voxel.y), float(voxel.z)});
    for (auto _ : state)
        benchmark::DoNotOptimize(
            buildLevelSetFromPoints<Traits>({.channelName = "c"}, positions, {2.0f}, bench::kBand));
    state.SetItemsProcessed(state.iterations() * static_cast<std::int64_t>(positions.size()));
}

template <class Traits>
void visitEveryVoxel(benchmark::State& state)
{
    auto const grid = bench::sphere<Traits>(kRadius);
    auto const values = grid.channel->template values<float>();
    for (auto _ : state) {
        float sum = 0;
        for (unsigned int leaf = 0; leaf < grid.topology->leafCount(); ++leaf) {
            float const* const tile = values->data() + std::uint64_t(leaf) * Traits::kLeafVoxels;
            for (unsigned int place = 0; place < Traits::kLeafVoxels; ++place)
                sum += tile[place];
        }
        benchmark::DoNotOptimize(sum);
    }
    countVoxels(state, grid);
}

template <class Traits>
void readAtRandom(benchmark::State& state)
{
    auto const grid = bench::sphere<Traits>(kRadius);
    auto const voxels = bench::voxelsInShell(kRadius, 1 << 16);
    Accessor<Traits, float> value(*grid.topology, *grid.channel);
    std::uint64_t i = 0;
    for (auto _ : state)
        benchmark::DoNotOptimize(value(voxels[i++ & 0xFFFF]));
}

template <class Traits>
void boundsOfContent(benchmark::State& state)
{
    ThreadLimit const limit(state);
    auto const grid = bench::sphere<Traits>(kRadius);
    auto volume = VLD::createObject();
    grid.addTo(*volume);
    for (auto _ : state) {
        Veldrin::Math::bbox<float3, float> box;
        Veldrin::GeometryAlgorithms::volumeBounds(*volume, *grid.container, *grid.topology, box);
        if (box.max.x != kRadius)
            state.SkipWithError("wrong bounds");
    }
    state.SetBytesProcessed(state.iterations() * static_cast<std::int64_t>(grid.channel->elementCount() * 4));
}

/// The same when every tile has to be looked at: the content lies in the last one only.
template <class Traits>
void boundsOfContentAtTheEnd(benchmark::State& state)
{
    ThreadLimit const limit(state);
    auto const grid = bench::sphere<Traits>(kRadius);
    Nexil::Array<float> values;
    values.resize(grid.channel->elementCount());
    values[grid.topology->voxelCount() - 1] = 1;
    auto volume = VLD::createObject();
    volume->addComponent(grid.topology);
    volume->addComponent(grid.container);
    volume->addComponent(Nexil::makePtr<Channel<Traits>>("voxel_fog_density", "voxel_tile_tree",
                                                         Nexil::makePtr<Nexil::Array<float>>(std::move(values)), 0.0f));
    for (auto _ : state) {
        Veldrin::Math::bbox<float3, float> box;
        Veldrin::GeometryAlgorithms::volumeBounds(*volume, *grid.container, *grid.topology, box);
        if (box.isEmpty())
            state.SkipWithError("no bounds");
    }
    state.SetBytesProcessed(state.iterations() * static_cast<std::int64_t>(grid.channel->elementCount() * 4));
}

void copyChannel(benchmark::State& state)
{
    auto const grid = bench::sphere<SmallTiles>(kRadius);
    auto const values = grid.channel->values<float>();
    Nexil::Array<float> copy = *values;
    for (auto _ : state) {
        std::memcpy(copy.data(), values->data(), values->size() * sizeof(float));
        benchmark::ClobberMemory();
    }
    state.SetBytesProcessed(state.iterations() * static_cast<std::int64_t>(values->size() * sizeof(float)));
}
BENCHMARK(copyChannel);

template <class Traits>
void convertBothWays(benchmark::State& state)
{
    auto volume = VLD::createObject();
    bench::sphere<Traits>(static_cast<int>(state.range(0))).addTo(*volume);
    for (auto _ : state) {
        auto object = Veldrin::Geometry::move_vld_volume_to_object(*volume);
        volume = Veldrin::Geometry::move_object_to_vld_volume(*object);
        if (volume->componentCount() != 3)
            state.SkipWithError("lost a component");
    }
}

#define BOTH_CONFIGURATIONS(name)                                        \
    BENCHMARK_TEMPLATE(name, SmallTiles)->Arg(1)->Arg(2)->UseRealTime(); \
    BENCHMARK_TEMPLATE(name, WideTiles)->Arg(1)->Arg(2)->UseRealTime()

BOTH_CONFIGURATIONS(buildSphere);
BENCHMARK_TEMPLATE(buildFromVoxelList, SmallTiles)->ArgsProduct({{1, 2}, {0, 1}})->UseRealTime();
BENCHMARK_TEMPLATE(buildFromVoxelList, WideTiles)->ArgsProduct({{1, 2}, {0, 1}})->UseRealTime();
BOTH_CONFIGURATIONS(buildFromDenseBox);
BOTH_CONFIGURATIONS(rasterisePoints);
BENCHMARK_TEMPLATE(visitEveryVoxel, SmallTiles);
BENCHMARK_TEMPLATE(visitEveryVoxel, WideTiles);
BENCHMARK_TEMPLATE(readAtRandom, SmallTiles);
BENCHMARK_TEMPLATE(readAtRandom, WideTiles);
BOTH_CONFIGURATIONS(boundsOfContent);
BOTH_CONFIGURATIONS(boundsOfContentAtTheEnd);
BENCHMARK_TEMPLATE(convertBothWays, SmallTiles)->Arg(5)->Arg(125);
BENCHMARK_TEMPLATE(convertBothWays, WideTiles)->Arg(5)->Arg(125);

} // namespace
