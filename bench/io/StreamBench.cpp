#include "Meshes.h"
#include "support/FreshMemory.h"
#include "support/PeakMemory.h"

#include <benchmark/benchmark.h>

#include <blosc.h>
#include <fcntl.h>
#include <hdf5.h>
#include <sys/stat.h>
#include <unistd.h>

#include <memory>
#include <string>
#include <thread>

/// Writing and reading a mesh of 4 million quads, or a scan named by VELDRIN_BENCH_MESH (a zon file), next to what bounds
/// it: plain write and read of the same bytes, and bare calls of the compressor. HDF5 is the peer.
///
/// All files lie in the folder for temporary files, so in the page cache: what is measured is the work, not the disk.
/// Bytes per second count the arrays' bytes in memory, on every row.
namespace {

std::string filePath(char const* name)
{
    char const* const folder = std::getenv("TMPDIR");
    return std::string(folder ? folder : "/tmp") + "/veldrin_bench_" + name;
}

bench::FlatMesh loadMesh()
{
    char const* const path = std::getenv("VELDRIN_BENCH_MESH");
    if (!path)
        return bench::permutedTorus(2000);
    Nexil::Array<Nexil::Ptr<Veldrin::Object>> objects;
    if (!Veldrin::IO::deserialize(path, objects, {}, nullptr) || objects.empty())
        std::abort();
    bench::FlatMesh mesh;
    auto copy = [&](char const* name, auto& target) {
        using Element = typename std::remove_reference_t<decltype(target)>::value_type;
        auto const property = *objects[0]->getProperty(name).get<Nexil::Ptr<Veldrin::Object>>();
        auto const array = *property->getProperty("data").get<Nexil::Ptr<Nexil::Array<Element>>>();
        target.assign(array->begin(), array->end());
    };
    copy("point_position", mesh.positions);
    copy("face_vertex", mesh.faceVertex);
    copy("face_offset", mesh.faceOffset);
    return mesh;
}

bench::FlatMesh const& mesh()
{
    static bench::FlatMesh const instance = loadMesh();
    return instance;
}

Nexil::Array<Nexil::Ptr<Veldrin::Object>> const& objects()
{
    static Nexil::Array<Nexil::Ptr<Veldrin::Object>> const instance{bench::geometryOf(mesh())};
    return instance;
}

/// One flat array of the mesh, as bytes.
struct Part {
    void const* bytes;
    std::size_t size;
    std::size_t elementSize;
};

std::vector<Part> parts()
{
    auto const& m = mesh();
    return {{m.positions.data(), m.positions.size() * 12, 12},
            {m.faceVertex.data(), m.faceVertex.size() * 4, 4},
            {m.faceOffset.data(), m.faceOffset.size() * 4, 4}};
}

void finish(benchmark::State& state, std::string const& path)
{
    state.SetBytesProcessed(static_cast<std::int64_t>(state.iterations() * mesh().byteSize()));
    struct stat status {};
    if (stat(path.c_str(), &status) == 0)
        state.counters["file MB"] = static_cast<double>(status.st_size) / 1e6;
}

void writeAll(int file, void const* bytes, std::size_t size)
{
    auto const* next = static_cast<char const*>(bytes);
    while (size != 0) {
        auto const written = ::write(file, next, std::min<std::size_t>(size, std::size_t(1) << 30));
        if (written <= 0)
            std::abort();
        next += written;
        size -= static_cast<std::size_t>(written);
    }
}

void readAll(int file, void* bytes, std::size_t size)
{
    auto* next = static_cast<char*>(bytes);
    while (size != 0) {
        auto const got = ::read(file, next, std::min<std::size_t>(size, std::size_t(1) << 30));
        if (got <= 0)
            std::abort();
        next += got;
        size -= static_cast<std::size_t>(got);
    }
}

void zonWrite(benchmark::State& state)
{
    std::string const path = filePath("mesh.zon");
    Veldrin::IO::SerializationOptions options;
    options.compressionLevel = static_cast<int>(state.range(0));
    objects();
    for (auto _ : state) {
        unlink(path.c_str());
        if (!Veldrin::IO::serialize(objects(), path.c_str(), options, nullptr))
            state.SkipWithError("not written");
    }
    finish(state, path);
}

void zonRead(benchmark::State& state)
{
    std::string const path = filePath("mesh.zon");
    Veldrin::IO::SerializationOptions options;
    options.compressionLevel = static_cast<int>(state.range(0));
    Veldrin::IO::serialize(objects(), path.c_str(), options, nullptr);
    for (auto _ : state) {
        Nexil::Array<Nexil::Ptr<Veldrin::Object>> out;
        if (!Veldrin::IO::deserialize(path.c_str(), out, {}, nullptr))
            state.SkipWithError("not read");
        benchmark::DoNotOptimize(out.data());
    }
    finish(state, path);
    bench::PeakMemory const peak;
    Nexil::Array<Nexil::Ptr<Veldrin::Object>> out;
    Veldrin::IO::deserialize(path.c_str(), out, {}, nullptr);
    state.counters["peak of file and result"] =
        peak.bytes() / (static_cast<double>(mesh().byteSize()) + state.counters["file MB"].value * 1e6);
}

void plainWrite(benchmark::State& state)
{
    std::string const path = filePath("plain");
    mesh();
    for (auto _ : state) {
        unlink(path.c_str());
        int const file = open(path.c_str(), O_WRONLY | O_CREAT | O_TRUNC, 0644);
        for (Part const& part : parts())
            writeAll(file, part.bytes, part.size);
        close(file);
    }
    finish(state, path);
}

/// Into fresh memory, as a load must.
void plainRead(benchmark::State& state)
{
    std::string const path = filePath("plain");
    int const made = open(path.c_str(), O_WRONLY | O_CREAT | O_TRUNC, 0644);
    for (Part const& part : parts())
        writeAll(made, part.bytes, part.size);
    close(made);
    for (auto _ : state) {
        int const file = open(path.c_str(), O_RDONLY);
        std::vector<std::unique_ptr<char[]>> targets;
        for (Part const& part : parts()) {
            targets.emplace_back(new char[part.size]);
            readAll(file, targets.back().get(), part.size);
        }
        close(file);
        benchmark::DoNotOptimize(targets.data());
    }
    finish(state, path);
}

int threadCount()
{
    return static_cast<int>(std::max(1u, std::thread::hardware_concurrency()));
}

std::vector<std::vector<char>> compressedParts(int level)
{
    std::vector<std::vector<char>> compressed;
    for (Part const& part : parts()) {
        std::vector<char> target(part.size + 16);
        int const size = blosc_compress_ctx(level, BLOSC_SHUFFLE, part.elementSize, part.size, part.bytes,
                                            target.data(), target.size(), "lz4", 0, threadCount());
        target.resize(static_cast<std::size_t>(size));
        compressed.push_back(std::move(target));
    }
    return compressed;
}

/// Bare compressor calls, each result written plainly.
void bloscWrite(benchmark::State& state)
{
    std::string const path = filePath("blosc");
    int const level = static_cast<int>(state.range(0));
    mesh();
    for (auto _ : state) {
        unlink(path.c_str());
        int const file = open(path.c_str(), O_WRONLY | O_CREAT | O_TRUNC, 0644);
        for (Part const& part : parts()) {
            std::unique_ptr<char[]> target(new char[part.size + 16]);
            int const size = blosc_compress_ctx(level, BLOSC_SHUFFLE, part.elementSize, part.size, part.bytes,
                                                target.get(), part.size + 16, "lz4", 0, threadCount());
            writeAll(file, target.get(), static_cast<std::size_t>(size));
        }
        close(file);
    }
    finish(state, path);
}

/// Plain reads, each result decompressed into fresh memory.
void bloscRead(benchmark::State& state)
{
    std::string const path = filePath("blosc");
    auto const compressed = compressedParts(static_cast<int>(state.range(0)));
    int const made = open(path.c_str(), O_WRONLY | O_CREAT | O_TRUNC, 0644);
    for (auto const& bytes : compressed)
        writeAll(made, bytes.data(), bytes.size());
    close(made);
    auto const all = parts();
    for (auto _ : state) {
        int const file = open(path.c_str(), O_RDONLY);
        std::vector<std::unique_ptr<char[]>> targets;
        for (std::size_t i = 0; i < all.size(); ++i) {
            std::unique_ptr<char[]> packed(new char[compressed[i].size()]);
            readAll(file, packed.get(), compressed[i].size());
            targets.emplace_back(new char[all[i].size]);
            if (blosc_decompress_ctx(packed.get(), targets.back().get(), all[i].size, threadCount()) < 0)
                state.SkipWithError("not decompressed");
        }
        close(file);
        benchmark::DoNotOptimize(targets.data());
    }
    finish(state, path);
}

/// The compressor alone, from memory to memory.
void bloscCompressAlone(benchmark::State& state)
{
    int const level = static_cast<int>(state.range(0));
    mesh();
    for (auto _ : state)
        for (Part const& part : parts()) {
            std::unique_ptr<char[]> target(new char[part.size + 16]);
            benchmark::DoNotOptimize(blosc_compress_ctx(level, BLOSC_SHUFFLE, part.elementSize, part.size, part.bytes,
                                                        target.get(), part.size + 16, "lz4", 0, threadCount()));
        }
    finish(state, "");
}

void bloscDecompressAlone(benchmark::State& state)
{
    auto const compressed = compressedParts(static_cast<int>(state.range(0)));
    auto const all = parts();
    for (auto _ : state)
        for (std::size_t i = 0; i < all.size(); ++i) {
            std::unique_ptr<char[]> target(new char[all[i].size]);
            benchmark::DoNotOptimize(
                blosc_decompress_ctx(compressed[i].data(), target.get(), all[i].size, threadCount()));
        }
    finish(state, "");
}

/// Three data sets; deflate 0 is contiguous, else chunked with shuffle.
void hdf5WriteFile(std::string const& path, unsigned int deflate)
{
    hid_t const file = H5Fcreate(path.c_str(), H5F_ACC_TRUNC, H5P_DEFAULT, H5P_DEFAULT);
    int number = 0;
    for (Part const& part : parts()) {
        hid_t const type = part.elementSize == 12 ? H5T_NATIVE_FLOAT : H5T_NATIVE_UINT;
        hsize_t const count = part.size / 4;
        hid_t const space = H5Screate_simple(1, &count, nullptr);
        hid_t const settings = H5Pcreate(H5P_DATASET_CREATE);
        if (deflate != 0) {
            hsize_t const chunk = std::min<hsize_t>(count, 1 << 18);
            H5Pset_chunk(settings, 1, &chunk);
            H5Pset_shuffle(settings);
            H5Pset_deflate(settings, deflate);
        }
        hid_t const set =
            H5Dcreate2(file, std::to_string(number++).c_str(), type, space, H5P_DEFAULT, settings, H5P_DEFAULT);
        H5Dwrite(set, type, H5S_ALL, H5S_ALL, H5P_DEFAULT, part.bytes);
        H5Dclose(set);
        H5Pclose(settings);
        H5Sclose(space);
    }
    H5Fclose(file);
}

void hdf5Write(benchmark::State& state)
{
    std::string const path = filePath("mesh.h5");
    mesh();
    for (auto _ : state) {
        unlink(path.c_str());
        hdf5WriteFile(path, static_cast<unsigned int>(state.range(0)));
    }
    finish(state, path);
}

void hdf5Read(benchmark::State& state)
{
    std::string const path = filePath("mesh.h5");
    hdf5WriteFile(path, static_cast<unsigned int>(state.range(0)));
    auto const all = parts();
    for (auto _ : state) {
        hid_t const file = H5Fopen(path.c_str(), H5F_ACC_RDONLY, H5P_DEFAULT);
        std::vector<std::unique_ptr<char[]>> targets;
        for (std::size_t i = 0; i < all.size(); ++i) {
            hid_t const set = H5Dopen2(file, std::to_string(i).c_str(), H5P_DEFAULT);
            hid_t const type = all[i].elementSize == 12 ? H5T_NATIVE_FLOAT : H5T_NATIVE_UINT;
            targets.emplace_back(new char[all[i].size]);
            H5Dread(set, type, H5S_ALL, H5S_ALL, H5P_DEFAULT, targets.back().get());
            H5Dclose(set);
        }
        H5Fclose(file);
        benchmark::DoNotOptimize(targets.data());
    }
    finish(state, path);
}

/// The header of a file of 1 GB.
void headerOfLargeFile(benchmark::State& state)
{
    std::string const path = filePath("large.zon");
    auto array = Nexil::makeMutable<Nexil::Array<unsigned char>>();
    array->resize(1'000'000'000);
    auto object = Veldrin::createObject();
    object->setPropertyAny("bytes", Nexil::Ptr<Nexil::Array<unsigned char>>(std::move(array)));
    Veldrin::IO::SerializationOptions options;
    options.compressionLevel = 0;
    Veldrin::IO::serialize({Nexil::Ptr<Veldrin::Object>(std::move(object))}, path.c_str(), options, nullptr);
    for (auto _ : state) {
        Veldrin::Object header;
        if (!Veldrin::IO::deserializeHeader(path.c_str(), header, nullptr))
            state.SkipWithError("not read");
    }
    unlink(path.c_str());
}

constexpr auto kUnit = benchmark::kMillisecond;

} // namespace

BENCHMARK(plainWrite)->Unit(kUnit)->UseRealTime();
BENCHMARK(zonWrite)->Arg(0)->Unit(kUnit)->UseRealTime();
BENCHMARK(hdf5Write)->Arg(0)->Unit(kUnit)->UseRealTime();
BENCHMARK(plainRead)->Unit(kUnit)->UseRealTime();
BENCHMARK(zonRead)->Arg(0)->Unit(kUnit)->UseRealTime();
BENCHMARK(hdf5Read)->Arg(0)->Unit(kUnit)->UseRealTime();
BENCHMARK(bloscCompressAlone)->Arg(1)->Arg(9)->Unit(kUnit)->UseRealTime();
BENCHMARK(bloscWrite)->Arg(1)->Arg(9)->Unit(kUnit)->UseRealTime();
BENCHMARK(zonWrite)->Arg(1)->Arg(9)->Unit(kUnit)->UseRealTime();
BENCHMARK(hdf5Write)->Arg(4)->Unit(kUnit)->UseRealTime()->Iterations(1);
BENCHMARK(bloscDecompressAlone)->Arg(1)->Arg(9)->Unit(kUnit)->UseRealTime();
BENCHMARK(bloscRead)->Arg(1)->Arg(9)->Unit(kUnit)->UseRealTime();
BENCHMARK(zonRead)->Arg(1)->Arg(9)->Unit(kUnit)->UseRealTime();
BENCHMARK(hdf5Read)->Arg(4)->Unit(kUnit)->UseRealTime();
BENCHMARK(headerOfLargeFile)->Unit(kUnit)->UseRealTime();
