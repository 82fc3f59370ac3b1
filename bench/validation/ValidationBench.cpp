#include <benchmark/benchmark.h>
#include <tbb/global_control.h>
#include <tbb/parallel_for.h>

#include <veldrin/geometry/GeoProperties.h>
#include <veldrin/geometry/Population.h>
#include <veldrin/object/Properties.h>
#include <veldrin/validation/MeshValidator.h>

#include <cstring>
#include <string>
#include <vector>

// The judgement of a plane of 4 million quads on one and two threads, beside a copy, on as many, of the bytes that it has
// to read; and of objects with many properties. Bytes are those read.
namespace {

using namespace Veldrin;

constexpr unsigned int kSubdivisions = 2000;
constexpr std::size_t kFaces = std::size_t(kSubdivisions) * kSubdivisions;
// Four corners and one offset a face.
constexpr std::size_t kMeshBytes = kFaces * 5 * sizeof(unsigned int);
constexpr std::size_t kIndices = 20'000'000;

Nexil::MutablePtr<Object> plane()
{
    auto object = createObject();
    Geometry::populatePlaneMesh(1.0f, kSubdivisions, *object);
    return object;
}

/// Two values shared out over 20 million elements.
Nexil::MutablePtr<Object> sharedOut()
{
    auto object = createObject();
    auto component = createObject();
    Geometry::populateComponentGeoProperty(kIndices, *component);
    setProperty(*object, "element_component", std::move(component));
    Nexil::Array<unsigned int> indices;
    indices.resize(kIndices);
    for (std::size_t i = 0; i < kIndices; i += 2)
        indices[i] = 1;
    auto range = createObject();
    Geometry::populateRangeGeoProperty(Nexil::makePtr<Nexil::Array<unsigned int>>(std::move(indices)),
                                       "element_component", *range);
    setProperty(*object, "element_size_index", std::move(range));
    auto data = createObject();
    Geometry::createDataGeoProperty(0.0f, "element_size_index",
                                    Nexil::makePtr<Nexil::Array<float>>(Nexil::Array<float>{1, 2}), *data);
    setProperty(*object, "element_size", std::move(data));
    return object;
}

Nexil::MutablePtr<Object> manyProperties(std::int64_t count)
{
    auto object = createObject();
    Geometry::populateCubeMesh(1, *object);
    for (std::int64_t i = 0; i < count; ++i) {
        auto data = createObject();
        Geometry::createDataGeoProperty(
            0.0f, Geometry::sPointComp,
            Nexil::makePtr<Nexil::Array<float>>(Nexil::Array<float>{1, 2, 3, 4, 5, 6, 7, 8}), *data);
        setProperty(*object, ("point_" + std::to_string(i)).c_str(), std::move(data));
    }
    return object;
}

template <class Work>
void onThreads(benchmark::State& state, std::int64_t threads, Work const& work)
{
    tbb::global_control const limit(tbb::global_control::max_allowed_parallelism, static_cast<std::size_t>(threads));
    for ([[maybe_unused]] auto _ : state)
        work();
}

void judge(benchmark::State& state, Object const& object, bool isMesh, std::size_t bytes)
{
    onThreads(state, state.range(0), [&] {
        if (!(isMesh ? Geometry::validateMesh(object) : Geometry::GeoValidator().validate(object)))
            state.SkipWithError("the object is valid");
    });
    state.SetBytesProcessed(state.iterations() * static_cast<std::int64_t>(bytes));
}

void mesh(benchmark::State& state)
{
    static auto const object = plane();
    judge(state, *object, true, kMeshBytes);
}

void range(benchmark::State& state)
{
    static auto const object = sharedOut();
    judge(state, *object, false, kIndices * sizeof(unsigned int));
}

void copyOfSameBytes(benchmark::State& state)
{
    std::vector<char> from(kMeshBytes);
    std::vector<char> to(from.size());
    onThreads(state, state.range(0), [&] {
        tbb::parallel_for(tbb::blocked_range<std::size_t>(0, from.size(), 1 << 20), [&](auto const& part) {
            std::memcpy(to.data() + part.begin(), from.data() + part.begin(), part.size());
        });
        benchmark::ClobberMemory();
    });
    state.SetBytesProcessed(state.iterations() * static_cast<std::int64_t>(kMeshBytes));
}

void properties(benchmark::State& state)
{
    auto const object = manyProperties(state.range(0));
    onThreads(state, 1, [&] {
        if (!Geometry::validateMesh(*object))
            state.SkipWithError("the mesh is valid");
    });
    state.SetItemsProcessed(state.iterations() * state.range(0));
}

} // namespace

BENCHMARK(mesh)->Arg(1)->Arg(2)->UseRealTime()->Unit(benchmark::kMillisecond);
BENCHMARK(range)->Arg(1)->Arg(2)->UseRealTime()->Unit(benchmark::kMillisecond);
BENCHMARK(copyOfSameBytes)->Arg(1)->Arg(2)->UseRealTime()->Unit(benchmark::kMillisecond);
BENCHMARK(properties)->Arg(10)->Arg(100)->Arg(1000)->Arg(100000)->Unit(benchmark::kMicrosecond);
