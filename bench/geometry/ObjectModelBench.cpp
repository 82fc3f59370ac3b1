#include <veldrin/geometry/GeoProperties.h>
#include <veldrin/geometry/Population.h>
#include <veldrin/geometry/Prototypes.h>
#include <veldrin/object/Properties.h>

#include <benchmark/benchmark.h>

#include <algorithm>
#include <random>
#include <string>
#include <unordered_map>
#include <vector>

// What every operation on geometry pays: reading a property, asking what an object is, populating, finding a name among
// many, appending. Sizes are swept where the promise is that they do not matter.
namespace {

using namespace Veldrin;
using namespace Veldrin::Geometry;

template <class T>
Nexil::Ptr<Nexil::Array<T>> zeros(std::uint64_t count)
{
    Nexil::Array<T> array;
    array.resize(count);
    return Nexil::makePtr<Nexil::Array<T>>(std::move(array));
}

Nexil::MutablePtr<Object> meshOf(std::uint64_t elementCount)
{
    auto mesh = createObject();
    populateMesh(zeros<Math::float3>(elementCount), zeros<unsigned int>(elementCount),
                 zeros<unsigned int>(elementCount + 1), *mesh);
    return mesh;
}

void readArrayProperty(benchmark::State& state)
{
    auto const mesh = meshOf(static_cast<std::uint64_t>(state.range(0)));
    auto const positions = getDataGeoProperty(*mesh, sPointPosition);
    Nexil::String const key = sData;
    for (auto _ : state) {
        auto const array = getPropertyAs<Nexil::Ptr<Nexil::Array<Math::float3>>>(*positions, key);
        benchmark::DoNotOptimize(array.get());
    }
}
BENCHMARK(readArrayProperty)->Arg(10)->Arg(1000000);

void isMesh(benchmark::State& state)
{
    auto const mesh = meshOf(static_cast<std::uint64_t>(state.range(0)));
    auto const prototype = getMeshPrototype();
    for (auto _ : state)
        if (!Object::isA(*mesh, *prototype))
            state.SkipWithError("not a mesh");
}
BENCHMARK(isMesh)->Arg(10)->Arg(1000000);

void getDataByName(benchmark::State& state)
{
    auto const mesh = meshOf(static_cast<std::uint64_t>(state.range(0)));
    for (auto _ : state)
        if (!getDataGeoProperty(*mesh, sPointPosition))
            state.SkipWithError("not found");
}
BENCHMARK(getDataByName)->Arg(10)->Arg(1000000);

void populateMeshFromArrays(benchmark::State& state)
{
    auto const count = static_cast<std::uint64_t>(state.range(0));
    auto const positions = zeros<Math::float3>(count);
    auto const corners = zeros<unsigned int>(count);
    auto const offsets = zeros<unsigned int>(count + 1);
    for (auto _ : state) {
        auto mesh = createObject();
        if (!populateMesh(positions, corners, offsets, *mesh))
            state.SkipWithError("refused");
        benchmark::DoNotOptimize(mesh.get());
    }
}
BENCHMARK(populateMeshFromArrays)->Arg(10)->Arg(1000000);

void changeCountInPlace(benchmark::State& state)
{
    auto const mesh = meshOf(10);
    Nexil::String const name = sPointComp;
    unsigned int count = 0;
    for (auto _ : state)
        setElementCount(name, ++count, *mesh);
}
BENCHMARK(changeCountInPlace);

std::vector<Nexil::String> propertyNames(std::size_t count)
{
    std::vector<Nexil::String> names;
    for (std::size_t i = 0; i < count; ++i)
        names.emplace_back(("point_property_" + std::to_string(i)).c_str());
    return names;
}

/// `count` of the names in an order that nothing foresees; the texts lie side by side.
std::vector<Nexil::String> shuffled(std::vector<Nexil::String> names, std::size_t count)
{
    std::shuffle(names.begin(), names.end(), std::minstd_rand());
    return {names.begin(), names.begin() + static_cast<std::ptrdiff_t>(count)};
}

template <class Find>
void askInTurn(benchmark::State& state, std::vector<Nexil::String> const& asked, Find const& find)
{
    std::size_t next = 0;
    for (auto _ : state) {
        benchmark::DoNotOptimize(find(asked[next]));
        next = next + 1 == asked.size() ? 0 : next + 1;
    }
}

Nexil::MutablePtr<Object> objectWith(std::vector<Nexil::String> const& names)
{
    auto object = createObject();
    for (auto const& name : names)
        setProperty(*object, name, 1u);
    return object;
}

/// The same ten names, in larger and larger objects: what an algorithm does that knows which properties it wants.
void findTenKeysAmong(benchmark::State& state)
{
    auto const names = propertyNames(static_cast<std::size_t>(state.range(0)));
    auto const object = objectWith(names);
    askInTurn(state, shuffled(names, 10), [&](Nexil::String const& name) { return object->getProperty(name); });
}
BENCHMARK(findTenKeysAmong)->Arg(10)->Arg(12)->Arg(13)->Arg(100)->Arg(1000)->Arg(100000);

/// Every name once, in random order: a large object is far from the caches then, in any table.
void findEveryKeyAmong(benchmark::State& state)
{
    auto const names = propertyNames(static_cast<std::size_t>(state.range(0)));
    auto const object = objectWith(names);
    askInTurn(state, shuffled(names, names.size()),
              [&](Nexil::String const& name) { return object->getProperty(name); });
}
BENCHMARK(findEveryKeyAmong)->Arg(10)->Arg(1000)->Arg(100000);

void findEveryKeyInStandardMap(benchmark::State& state)
{
    auto const names = propertyNames(static_cast<std::size_t>(state.range(0)));
    std::unordered_map<Nexil::String, Nexil::Any> map;
    for (auto const& name : names)
        map[name] = 1u;
    askInTurn(state, shuffled(names, names.size()),
              [&](Nexil::String const& name) { return Nexil::Any(map.find(name)->second); });
}
BENCHMARK(findEveryKeyInStandardMap)->Arg(10)->Arg(1000)->Arg(100000);

template <class Container>
void append(benchmark::State& state)
{
    auto const count = static_cast<int>(state.range(0));
    for (auto _ : state) {
        Container values;
        for (int i = 0; i < count; ++i)
            values.push_back(i);
        benchmark::DoNotOptimize(values.data());
    }
    state.SetItemsProcessed(state.iterations() * count);
}
/// The best of several runs counts: under a hypervisor the others also pay for memory that the host has to find first.
void quickestOfSeveral(benchmark::internal::Benchmark* bench)
{
    bench->Arg(1000)->Arg(100000000)->Unit(benchmark::kMillisecond)->Repetitions(5)->ReportAggregatesOnly();
    bench->ComputeStatistics("min", [](std::vector<double> const& times) { return *std::ranges::min_element(times); });
}
BENCHMARK(append<Nexil::Array<int>>)->Apply(quickestOfSeveral);
BENCHMARK(append<std::vector<int>>)->Apply(quickestOfSeveral);

void populatePlane(benchmark::State& state)
{
    auto const subdivisions = static_cast<unsigned int>(state.range(0));
    for (auto _ : state) {
        auto plane = createObject();
        if (!populatePlaneMesh(1, subdivisions, *plane))
            state.SkipWithError("refused");
    }
    // Three arrays: points, corners, offsets.
    state.SetBytesProcessed(state.iterations() * state.range(0) * state.range(0) * (12 + 16 + 4));
}
BENCHMARK(populatePlane)->Arg(10)->Arg(100)->Arg(1000)->Arg(4000)->Unit(benchmark::kMicrosecond)->UseRealTime();

} // namespace
