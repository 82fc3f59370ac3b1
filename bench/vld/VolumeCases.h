#pragma once

#include <vld/Spheres.h>

#include <veldrin/volume/VolumeBounds.h>
#include <vld/Accessor.h>
#include <vld/BuildFromValues.h>

#include <benchmark/benchmark.h>

#include <tbb/global_control.h>

/// What is measured of the library both by itself and beside its peer; the first number of a case says on how many threads.
namespace bench {

constexpr int kRadius = 125;
constexpr std::uint64_t kReads = 1 << 16;

struct ThreadLimit : tbb::global_control {
    explicit ThreadLimit(benchmark::State const& state)
        : tbb::global_control(max_allowed_parallelism, static_cast<std::size_t>(state.range(0)))
    {
    }
};

inline void perVoxel(benchmark::State& state, double voxelCount)
{
    state.counters["held"] = voxelCount;
    state.counters["perVoxel"] =
        benchmark::Counter(voxelCount, benchmark::Counter::kIsIterationInvariantRate | benchmark::Counter::kInvert);
}

/// Voxels of leaf tiles: all that have a value of their own.
template <class Traits>
double heldVoxels(VLD::TileTree3D::Grid<Traits> const& grid)
{
    return static_cast<double>(grid.topology->voxelCount());
}

template <class Traits>
void buildSphere(benchmark::State& state)
{
    ThreadLimit const limit(state);
    VLD::TileTree3D::Grid<Traits> grid;
    for (auto _ : state)
        grid = sphere<Traits>(kRadius);
    perVoxel(state, heldVoxels(grid));
    state.counters["MB"] = static_cast<double>(grid.topology->byteSize() + grid.channel->elementCount() * 4) / 1e6;
}

template <class Traits>
void buildFromVoxelList(benchmark::State& state)
{
    ThreadLimit const limit(state);
    BandVoxels const list(sphere<Traits>(kRadius), state.range(1) != 0);
    for (auto _ : state)
        benchmark::DoNotOptimize(
            VLD::TileTree3D::buildFromVoxels<Traits>({.channelName = "c"}, list.voxels, list.values, kBand));
    perVoxel(state, static_cast<double>(list.voxels.size()));
}

template <class Traits>
void readAtRandom(benchmark::State& state)
{
    auto const grid = sphere<Traits>(kRadius);
    auto const voxels = voxelsInShell(kRadius, kReads);
    VLD::TileTree3D::Accessor<Traits, float> value(*grid.topology, *grid.channel);
    std::uint64_t i = 0;
    for (auto _ : state)
        benchmark::DoNotOptimize(value(voxels[i++ % kReads]));
}

template <class Traits>
void boundsOfContent(benchmark::State& state)
{
    ThreadLimit const limit(state);
    auto const grid = sphere<Traits>(kRadius);
    auto volume = VLD::createObject();
    grid.addTo(*volume);
    for (auto _ : state) {
        Veldrin::Math::bbox<Veldrin::Math::float3, float> box;
        Veldrin::GeometryAlgorithms::volumeBounds(*volume, *grid.container, *grid.topology, box);
        if (box.max.x != kRadius)
            state.SkipWithError("wrong bounds");
    }
    state.SetBytesProcessed(state.iterations() * static_cast<std::int64_t>(grid.channel->elementCount() * 4));
}

} // namespace bench
