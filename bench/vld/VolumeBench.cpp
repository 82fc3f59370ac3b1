#include "VolumeCases.h"

#include <veldrin/geometry/Prototypes.h>
#include <veldrin/volume/VolumeBounds.h>
#include <veldrin/volume/VolumeConversion.h>
#include <vld/BuildFromPoints.h>
#include <vld/BuildFromValues.h>

#include <benchmark/benchmark.h>

#include <cstring>

// The volume library by itself, in both configurations, on 1 and 2 threads: the first number says how many. The copy of the bytes
// of a channel is the limit of what looks at all of them.
namespace {

using namespace VLD::TileTree3D;
using namespace bench;
using Veldrin::Math::float3;

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
    for (Coordinate const& voxel : voxelsInShell(kRadius, 100000))
        positions.push_back({float(voxel.x), float(voxel.y), float(voxel.z)});
    for (auto _ : state)
        benchmark::DoNotOptimize(buildLevelSetFromPoints<Traits>({.channelName = "c"}, positions, {2.0f}, kBand));
    state.SetItemsProcessed(state.iterations() * static_cast<std::int64_t>(positions.size()));
}

template <class Traits>
void visitEveryVoxel(benchmark::State& state)
{
    auto const grid = sphere<Traits>(kRadius);
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
    perVoxel(state, heldVoxels(grid));
}

/// The box around the content where every tile has to be looked at: the content lies in the last one only.
template <class Traits>
void boundsOfContentAtTheEnd(benchmark::State& state)
{
    ThreadLimit const limit(state);
    auto const grid = sphere<Traits>(kRadius);
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
    auto const grid = sphere<SmallTiles>(kRadius);
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
    sphere<Traits>(static_cast<int>(state.range(0))).addTo(*volume);
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
