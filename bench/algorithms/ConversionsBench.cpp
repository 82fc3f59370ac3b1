#include <benchmark/benchmark.h>
#include <tbb/global_control.h>

#include <veldrin/algorithms/ComponentConversion.h>
#include <veldrin/geometry/GeoProperties.h>
#include <veldrin/geometry/Names.h>
#include <veldrin/geometry/Population.h>
#include <veldrin/object/Properties.h>

#include <random>
#include <vector>

// Conversions of selections over a plane of 4 million quads, and 4 million strands of four points, on one and two threads,
// beside a plain serial loop over flat arrays. Half of the elements are selected, in runs, as in a painted selection, or
// each by chance.
namespace {

using namespace Veldrin;
using Mask = Nexil::Array<bool>;
using Indices = Nexil::Array<unsigned int>;

constexpr unsigned int kSide = 2000;
constexpr unsigned int kElements = kSide * kSide;

Object const& plane()
{
    static auto const made = [] {
        auto object = createObject();
        Geometry::populatePlaneMesh(1.0f, kSide, *object);
        return object;
    }();
    return *made;
}

Object const& strands()
{
    static auto const made = [] {
        Nexil::Array<Math::float3> positions;
        positions.resize(std::size_t(kElements) * 4);
        Indices offsets;
        offsets.resize(kElements + 1);
        for (unsigned int i = 0; i <= kElements; ++i)
            offsets[i] = 4 * i;
        auto object = createObject();
        Geometry::populateStrand(Nexil::makePtr<Nexil::Array<Math::float3>>(std::move(positions)),
                                 Nexil::makePtr<Indices>(std::move(offsets)), *object);
        return object;
    }();
    return *made;
}

Indices const& dataOf(Object const& object, char const* name)
{
    return *getPropertyAs<Nexil::Ptr<Indices>>(*getPropertyAs<Nexil::Ptr<Object>>(object, name), Geometry::sData);
}

Mask maskOf(std::size_t size, std::size_t runLength)
{
    std::mt19937 random(1);
    Mask mask;
    mask.resize(size);
    for (std::size_t i = 0; i < size; i += runLength)
        std::fill(mask.begin() + i, mask.begin() + std::min(size, i + runLength), random() % 2 == 0);
    return mask;
}

using Convert = Nexil::Ptr<Mask> (*)(Object const&, Mask const&);
using Loop = void (*)(Object const&, Mask const&, Mask&);

constexpr auto kAll = Geometry::TagConversionStyle::AllElements;

void gather(Indices const& offsets, unsigned int const* corners, Mask const& mask, Mask& result)
{
    for (std::size_t k = 0; k + 1 < offsets.size(); ++k) {
        bool isSelected = offsets[k] < offsets[k + 1];
        for (unsigned int i = offsets[k]; i < offsets[k + 1] && isSelected; ++i)
            isSelected = mask[corners ? corners[i] : i];
        result[k] = isSelected;
    }
}

void scatter(Indices const& offsets, unsigned int const* corners, Mask const& mask, Mask& result)
{
    for (std::size_t k = 0; k + 1 < offsets.size(); ++k)
        if (mask[k])
            for (unsigned int i = offsets[k]; i < offsets[k + 1]; ++i)
                result[corners ? corners[i] : i] = true;
}

struct Case {
    char const* name;
    Object const& (*object)();
    char const* from;
    char const* to;
    Convert convert;
    Loop loop;
};

unsigned int const* cornersOf(Object const& mesh)
{
    return dataOf(mesh, Geometry::sFaceVertex).data();
}

Case const kCases[] = {
    {"faceVerticesToFaces", plane, Geometry::sFaceVertexComp, Geometry::sFaceComp,
     [](Object const& object, Mask const& mask) { return Geometry::faceVerticesToFaces(object, mask, kAll, nullptr); },
     [](Object const& object, Mask const& mask, Mask& result) {
         gather(dataOf(object, Geometry::sFaceOffset), nullptr, mask, result);
     }},
    {"pointsToFaces", plane, Geometry::sPointComp, Geometry::sFaceComp,
     [](Object const& object, Mask const& mask) { return Geometry::pointsToFaces(object, mask, kAll, nullptr); },
     [](Object const& object, Mask const& mask, Mask& result) {
         gather(dataOf(object, Geometry::sFaceOffset), cornersOf(object), mask, result);
     }},
    {"pointsToFaceVertices", plane, Geometry::sPointComp, Geometry::sFaceVertexComp,
     [](Object const& object, Mask const& mask) { return Geometry::pointsToFaceVertices(object, mask, nullptr); },
     [](Object const& object, Mask const& mask, Mask& result) {
         auto const* const corners = cornersOf(object);
         for (std::size_t i = 0; i < result.size(); ++i)
             result[i] = mask[corners[i]];
     }},
    {"faceVerticesToPoints", plane, Geometry::sFaceVertexComp, Geometry::sPointComp,
     [](Object const& object, Mask const& mask) { return Geometry::faceVerticesToPoints(object, mask, nullptr); },
     [](Object const& object, Mask const& mask, Mask& result) {
         auto const* const corners = cornersOf(object);
         for (std::size_t i = 0; i < mask.size(); ++i)
             if (mask[i])
                 result[corners[i]] = true;
     }},
    {"facesToFaceVertices", plane, Geometry::sFaceComp, Geometry::sFaceVertexComp,
     [](Object const& object, Mask const& mask) { return Geometry::facesToFaceVertices(object, mask, nullptr); },
     [](Object const& object, Mask const& mask, Mask& result) {
         scatter(dataOf(object, Geometry::sFaceOffset), nullptr, mask, result);
     }},
    {"facesToPoints", plane, Geometry::sFaceComp, Geometry::sPointComp,
     [](Object const& object, Mask const& mask) { return Geometry::facesToPoints(object, mask, nullptr); },
     [](Object const& object, Mask const& mask, Mask& result) {
         scatter(dataOf(object, Geometry::sFaceOffset), cornersOf(object), mask, result);
     }},
    {"pointsToStrands", strands, Geometry::sPointComp, Geometry::sStrandComp,
     [](Object const& object, Mask const& mask) { return Geometry::pointsToStrands(object, mask, kAll, nullptr); },
     [](Object const& object, Mask const& mask, Mask& result) {
         gather(dataOf(object, Geometry::sStrandOffset), nullptr, mask, result);
     }},
    {"strandsToPoints", strands, Geometry::sStrandComp, Geometry::sPointComp,
     [](Object const& object, Mask const& mask) { return Geometry::strandsToPoints(object, mask, nullptr); },
     [](Object const& object, Mask const& mask, Mask& result) {
         scatter(dataOf(object, Geometry::sStrandOffset), nullptr, mask, result);
     }}};

// Registered by a program that has nothing else to do before main.
bool const areRegistered = [] {
    for (Case const& each : kCases)
        for (bool const isPainted : {true, false}) {
            std::string const name = std::string(each.name) + (isPainted ? "/painted" : "/chance");
            auto const maskFor = [&each, isPainted] {
                return maskOf(Geometry::getElementCount(each.object(), each.from), isPainted ? 1000 : 1);
            };
            benchmark::RegisterBenchmark((name + "/loop").c_str(),
                                         [&each, maskFor](benchmark::State& state) {
                                             Mask const mask = maskFor();
                                             for ([[maybe_unused]] auto _ : state) {
                                                 Mask result;
                                                 result.resize(Geometry::getElementCount(each.object(), each.to));
                                                 each.loop(each.object(), mask, result);
                                                 benchmark::DoNotOptimize(result.data());
                                             }
                                             state.SetItemsProcessed(state.iterations() * kElements);
                                         })
                ->UseRealTime()
                ->Unit(benchmark::kMillisecond);
            for (std::size_t const threadCount : {1, 2})
                benchmark::RegisterBenchmark((name + "/" + std::to_string(threadCount)).c_str(),
                                             [&each, maskFor, threadCount](benchmark::State& state) {
                                                 Mask const mask = maskFor();
                                                 tbb::global_control const limit(
                                                     tbb::global_control::max_allowed_parallelism, threadCount);
                                                 for ([[maybe_unused]] auto _ : state)
                                                     benchmark::DoNotOptimize(each.convert(each.object(), mask).get());
                                                 state.SetItemsProcessed(state.iterations() * kElements);
                                             })
                    ->UseRealTime()
                    ->Unit(benchmark::kMillisecond);
        }
    return true;
}();

} // namespace
