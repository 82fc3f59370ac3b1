#include <support/FreshMemory.h>
#include <vld/VolumeCases.h>

#include <nexil/parallel/Parallel.h>
#include <veldrin/io/ObjectStream.h>
#include <veldrin/volume/VolumeConversion.h>
#include <vld/Accessor.h>

#include <openvdb/openvdb.h>
#include <openvdb/tools/LevelSetSphere.h>
#include <openvdb/tree/LeafManager.h>

#include <benchmark/benchmark.h>

#include <blosc.h>

#include <tbb/parallel_reduce.h>

#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <functional>
#include <memory>
#include <string>
#include <thread>
#include <vector>

// A level set of a sphere of radius 125 with three voxels of band to each side: made, measured, visited and read, by our tile
// trees and by the peer's trees, each on 1 and 2 threads where it is parallel. `held` is the number of voxels a side keeps
// values of: the peer's active ones, all of ours in leaf tiles.
namespace {

using namespace VLD::TileTree3D;
using namespace bench;

openvdb::FloatGrid::Ptr peerSphere()
{
    return openvdb::tools::createLevelSetSphere<openvdb::FloatGrid>(float(kRadius), openvdb::Vec3f(0), 1, kBand);
}

void buildPeer(benchmark::State& state)
{
    ThreadLimit const limit(state);
    openvdb::FloatGrid::Ptr grid;
    for (auto _ : state)
        grid = peerSphere();
    perVoxel(state, static_cast<double>(grid->activeVoxelCount()));
    state.counters["MB"] = static_cast<double>(grid->memUsage()) / 1e6;
}

void buildFromListPeer(benchmark::State& state)
{
    ThreadLimit const limit(state);
    BandVoxels const list(sphere<SmallTiles>(kRadius), state.range(1) != 0);
    for (auto _ : state) {
        auto grid = openvdb::FloatGrid::create(kBand);
        auto accessor = grid->getAccessor();
        for (std::uint64_t i = 0; i < list.voxels.size(); ++i) {
            Coordinate const& c = list.voxels[i];
            accessor.setValue(openvdb::Coord(c.x, c.y, c.z), list.values[i]);
        }
        benchmark::DoNotOptimize(grid.get());
    }
    perVoxel(state, static_cast<double>(list.voxels.size()));
}

/// Of the active voxels, whatever their values: the question that the peer answers without reading any.
void boundsPeer(benchmark::State& state)
{
    ThreadLimit const limit(state);
    auto const grid = peerSphere();
    for (auto _ : state)
        benchmark::DoNotOptimize(grid->evalActiveVoxelBoundingBox());
    perVoxel(state, static_cast<double>(grid->activeVoxelCount()));
}

/// What comes of every value within the band and its coordinates.
struct Visited {
    double sum = 0;
    std::int64_t places = 0;

    friend Visited operator+(Visited const& left, Visited const& right)
    {
        return {left.sum + right.sum, left.places + right.places};
    }
};

template <class Traits>
void visitOurs(benchmark::State& state)
{
    ThreadLimit const limit(state);
    auto const grid = sphere<Traits>(kRadius);
    auto const values = grid.channel->template values<float>();
    for (auto _ : state)
        benchmark::DoNotOptimize(Nexil::parallel::reduceInOrder(
            grid.topology->leafCount(), 256, Visited(),
            [&](std::size_t begin, std::size_t end, Visited visited) {
                for (std::size_t leaf = begin; leaf < end; ++leaf) {
                    float const* const tile = values->data() + leaf * Traits::kLeafVoxels;
                    Coordinate const origin = grid.topology->leafOrigins()[leaf];
                    for (unsigned int place = 0; place < Traits::kLeafVoxels; ++place)
                        if (tile[place] > -kBand && tile[place] < kBand) {
                            Coordinate const voxel = origin + cellAtPlace<Traits::kDataWidth>(place);
                            visited.sum += tile[place];
                            visited.places += voxel.x + voxel.y + voxel.z;
                        }
                }
                return visited;
            },
            std::plus<>()));
    perVoxel(state, heldVoxels(grid));
}

void visitPeer(benchmark::State& state)
{
    ThreadLimit const limit(state);
    auto const grid = peerSphere();
    openvdb::tree::LeafManager<openvdb::FloatTree const> const leaves(grid->tree());
    for (auto _ : state)
        benchmark::DoNotOptimize(tbb::parallel_reduce(
            leaves.leafRange(64), Visited(),
            [](auto const& range, Visited visited) {
                for (auto leaf = range.begin(); leaf; ++leaf)
                    for (auto value = leaf->cbeginValueOn(); value; ++value) {
                        openvdb::Coord const voxel = value.getCoord();
                        visited.sum += *value;
                        visited.places += voxel.x() + voxel.y() + voxel.z();
                    }
                return visited;
            },
            std::plus<>()));
    perVoxel(state, static_cast<double>(grid->activeVoxelCount()));
}

void readPeer(benchmark::State& state)
{
    auto const grid = peerSphere();
    auto const voxels = voxelsInShell(kRadius, kReads);
    auto accessor = grid->getConstAccessor();
    std::uint64_t i = 0;
    for (auto _ : state) {
        Coordinate const& c = voxels[i++ % kReads];
        benchmark::DoNotOptimize(accessor.getValue(openvdb::Coord(c.x, c.y, c.z)));
    }
}

std::string filePath(char const* name)
{
    char const* const folder = std::getenv("TMPDIR");
    return std::string(folder ? folder : "/tmp") + "/veldrin_compare_" + name;
}

/// Of the file, in the page cache.
void countFile(benchmark::State& state, std::string const& path)
{
    state.counters["file MB"] = static_cast<double>(std::filesystem::file_size(path)) / 1e6;
    std::filesystem::remove(path);
}

/// The second number of a case is the radius: that of all other cases, and a larger one, whose bytes fit no cache.
template <class Traits>
Grid<Traits> fileSphere(benchmark::State const& state)
{
    return sphere<Traits>(static_cast<int>(state.range(1)));
}

using Objects = Nexil::Array<Nexil::Ptr<Veldrin::Object>>;

template <class Traits>
Objects sphereAsGeometry(benchmark::State const& state)
{
    auto volume = VLD::createObject();
    fileSphere<Traits>(state).addTo(*volume);
    return {Nexil::Ptr<Veldrin::Object>(Veldrin::Geometry::move_vld_volume_to_object(*volume))};
}

// The compressors of both sides start threads of their own: `taskset -c 0` measures what one core does.

template <class Traits>
void saveOurs(benchmark::State& state)
{
    auto const path = filePath("volume.zon");
    auto const objects = sphereAsGeometry<Traits>(state);
    Veldrin::IO::SerializationOptions options;
    options.compressionLevel = static_cast<int>(state.range(0));
    for (auto _ : state)
        if (!Veldrin::IO::serialize(objects, path.c_str(), options, nullptr))
            state.SkipWithError("not written");
    countFile(state, path);
}

void savePeer(benchmark::State& state)
{
    auto const path = filePath("volume.vdb");
    openvdb::GridPtrVec const grids{peerSphere()};
    for (auto _ : state) {
        openvdb::io::File file(path);
        file.setCompression(openvdb::io::COMPRESS_BLOSC | openvdb::io::COMPRESS_ACTIVE_MASK);
        file.write(grids);
        file.close();
    }
    countFile(state, path);
}

template <class Traits>
void loadOurs(benchmark::State& state)
{
    auto const path = filePath("volume.zon");
    Veldrin::IO::SerializationOptions options;
    options.compressionLevel = static_cast<int>(state.range(0));
    Veldrin::IO::serialize(sphereAsGeometry<Traits>(state), path.c_str(), options, nullptr);
    for (auto _ : state) {
        Objects objects;
        if (!Veldrin::IO::deserialize(path.c_str(), objects, {}, nullptr) ||
            !Veldrin::Geometry::shallow_copy_object_to_vld_volume(*objects[0]))
            state.SkipWithError("not read");
    }
    countFile(state, path);
}

void loadPeer(benchmark::State& state)
{
    auto const path = filePath("volume.vdb");
    {
        openvdb::io::File file(path);
        file.setCompression(openvdb::io::COMPRESS_BLOSC | openvdb::io::COMPRESS_ACTIVE_MASK);
        file.write(openvdb::GridPtrVec{peerSphere()});
    }
    for (auto _ : state) {
        openvdb::io::File file(path);
        file.open(false);
        benchmark::DoNotOptimize(file.getGrids());
    }
    countFile(state, path);
}

/// An array of a volume as bytes.
struct Part {
    void const* bytes;
    std::size_t size;
    std::size_t elementSize;
};

template <class Traits>
std::vector<Part> partsOf(Grid<Traits> const& grid)
{
    auto part = [](auto const& array) { return Part{array.data(), array.size() * sizeof(array[0]), sizeof(array[0])}; };
    return {part(grid.topology->leafOrigins()), part(grid.topology->leafParents()), part(grid.topology->innerOrigins()),
            part(grid.topology->innerChildren()), part(*grid.channel->template values<float>())};
}

std::vector<char> compressed(Part const& part, int level)
{
    std::vector<char> target(part.size + BLOSC_MAX_OVERHEAD);
    int const size = blosc_compress_ctx(level, BLOSC_SHUFFLE, part.elementSize, part.size, part.bytes, target.data(),
                                        target.size(), "lz4", 0, static_cast<int>(std::thread::hardware_concurrency()));
    target.resize(static_cast<std::size_t>(size));
    return target;
}

/// The compressor alone on the same arrays, each result written plainly: the limit of our saving.
template <class Traits>
void saveBare(benchmark::State& state)
{
    auto const path = filePath("volume.blosc");
    auto const grid = fileSphere<Traits>(state);
    for (auto _ : state) {
        std::ofstream file(path, std::ios::binary);
        for (Part const& part : partsOf(grid)) {
            auto const bytes = compressed(part, static_cast<int>(state.range(0)));
            file.write(bytes.data(), static_cast<std::streamsize>(bytes.size()));
        }
    }
    countFile(state, path);
}

/// Plain reads, each decompressed into fresh memory: the limit of our loading.
template <class Traits>
void loadBare(benchmark::State& state)
{
    auto const path = filePath("volume.blosc");
    auto const grid = fileSphere<Traits>(state);
    auto const parts = partsOf(grid);
    std::vector<std::size_t> sizes;
    {
        std::ofstream file(path, std::ios::binary);
        for (Part const& part : parts) {
            auto const bytes = compressed(part, static_cast<int>(state.range(0)));
            sizes.push_back(bytes.size());
            file.write(bytes.data(), static_cast<std::streamsize>(bytes.size()));
        }
    }
    for (auto _ : state) {
        std::ifstream file(path, std::ios::binary);
        std::vector<std::unique_ptr<char[]>> targets;
        for (std::size_t i = 0; i < parts.size(); ++i) {
            std::unique_ptr<char[]> const packed(new char[sizes[i]]);
            file.read(packed.get(), static_cast<std::streamsize>(sizes[i]));
            targets.emplace_back(new char[parts[i].size]);
            if (blosc_decompress_ctx(packed.get(), targets.back().get(), parts[i].size,
                                     static_cast<int>(std::thread::hardware_concurrency())) < 0)
                state.SkipWithError("not decompressed");
        }
        benchmark::DoNotOptimize(targets.data());
    }
    countFile(state, path);
}

/// Both sides hold the same distances, or nothing here compares anything.
bool isSameSphere()
{
    auto const ours = sphere<SmallTiles>(kRadius);
    auto const peer = peerSphere();
    auto accessor = peer->getConstAccessor();
    Accessor<SmallTiles, float> value(*ours.topology, *ours.channel);
    for (Coordinate const& c : voxelsInShell(kRadius, 1000)) {
        // The peer's values lie at integer positions, ours at centres of voxels: half a voxel apart along each axis.
        if (std::abs(value(c) - accessor.getValue(openvdb::Coord(c.x, c.y, c.z))) > 0.9f)
            return false;
    }
    return true;
}

#define VELDRIN_SIDES(peer, ours)                                                            \
    BENCHMARK(peer)->ArgName("threads")->Arg(1)->Arg(2)->UseRealTime();                      \
    BENCHMARK_TEMPLATE(ours, SmallTiles)->ArgName("threads")->Arg(1)->Arg(2)->UseRealTime(); \
    BENCHMARK_TEMPLATE(ours, WideTiles)->ArgName("threads")->Arg(1)->Arg(2)->UseRealTime()

VELDRIN_SIDES(buildPeer, buildSphere);
BENCHMARK(buildFromListPeer)->ArgNames({"threads", "shuffled"})->ArgsProduct({{1}, {0, 1}})->UseRealTime();
BENCHMARK_TEMPLATE(buildFromVoxelList, SmallTiles)
    ->ArgNames({"threads", "shuffled"})
    ->ArgsProduct({{1, 2}, {0, 1}})
    ->UseRealTime();
VELDRIN_SIDES(boundsPeer, boundsOfContent);
VELDRIN_SIDES(visitPeer, visitOurs);
#define VELDRIN_FILES(name)                             \
    BENCHMARK_TEMPLATE(name, SmallTiles)                \
        ->ArgNames({"level", "radius"})                 \
        ->ArgsProduct({{1, 9}, {kRadius, 4 * kRadius}}) \
        ->UseRealTime();                                \
    BENCHMARK_TEMPLATE(name, WideTiles)->ArgNames({"level", "radius"})->ArgsProduct({{1, 9}, {kRadius}})->UseRealTime()

BENCHMARK(savePeer)->UseRealTime();
VELDRIN_FILES(saveOurs);
VELDRIN_FILES(saveBare);
BENCHMARK(loadPeer)->UseRealTime();
VELDRIN_FILES(loadOurs);
VELDRIN_FILES(loadBare);
// Each thread with an accessor of its own; the time of both over what both have read.
BENCHMARK(readPeer)->Threads(1)->Threads(2);
BENCHMARK_TEMPLATE(readAtRandom, SmallTiles)->Threads(1)->Threads(2);
BENCHMARK_TEMPLATE(readAtRandom, WideTiles)->Threads(1)->Threads(2);

} // namespace

int main(int argumentCount, char** arguments)
{
    openvdb::initialize();
    if (!isSameSphere())
        return 1;
    benchmark::Initialize(&argumentCount, arguments);
    benchmark::RunSpecifiedBenchmarks();
    return 0;
}
