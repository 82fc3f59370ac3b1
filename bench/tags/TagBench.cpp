#include <veldrin/algorithms/ComponentConversion.h>
#include <veldrin/geometry/GeoProperties.h>
#include <veldrin/geometry/Population.h>
#include <veldrin/object/Properties.h>
#include <veldrin/tags/TagData.h>
#include <veldrin/tags/TagParser.h>
#include <veldrin/tags/TagResolver.h>
#include <veldrin/tags/TagSetOperations.h>

#include <benchmark/benchmark.h>

#include <cstring>
#include <random>
#include <string>

// Set operations beside the plain loop over the same bytes, a resolved expression beside its passes one by one and a copy
// of the bytes that they move, and texts and names that are long.
namespace {

using namespace Veldrin;
using namespace Veldrin::Geometry;
using Mask = Nexil::Array<bool>;
using MaskPtr = Nexil::Ptr<Mask>;

Mask randomMask(std::uint64_t count, unsigned int seed)
{
    std::mt19937 random(seed);
    Mask mask;
    mask.resize(count);
    for (bool& flag : mask)
        flag = random() % 2 == 0;
    return mask;
}

// Set operations.

void plainUnion(Mask const& a, Mask& b)
{
    auto const* const in = reinterpret_cast<unsigned char const*>(a.data());
    auto* const out = reinterpret_cast<unsigned char*>(b.data());
    std::size_t const count = std::min(a.size(), b.size());
    for (std::size_t i = 0; i < count; ++i)
        out[i] = static_cast<unsigned char>(out[i] | in[i]);
}

void plainDifference(Mask const& a, Mask& b)
{
    auto const* const in = reinterpret_cast<unsigned char const*>(a.data());
    auto* const out = reinterpret_cast<unsigned char*>(b.data());
    std::size_t const count = std::min(a.size(), b.size());
    for (std::size_t i = 0; i < count; ++i)
        out[i] = static_cast<unsigned char>(in[i] & (out[i] ^ 1));
}

template <void (*operation)(Mask const&, Mask&)>
void combine(benchmark::State& state)
{
    auto const count = static_cast<std::uint64_t>(state.range(0));
    Mask const a = randomMask(count, 1);
    Mask b = randomMask(count, 2);
    for (auto _ : state) {
        operation(a, b);
        benchmark::DoNotOptimize(b.data());
        benchmark::ClobberMemory();
    }
    state.SetItemsProcessed(state.iterations() * state.range(0));
    // Both are read, one is written.
    state.SetBytesProcessed(state.iterations() * state.range(0) * 3);
}
#define SIZES ->Arg(0)->Arg(1000)->Arg(100000)->Arg(10000000)->Arg(100000000)->UseRealTime()
BENCHMARK(combine<unionTagData>) SIZES;
BENCHMARK(combine<plainUnion>) SIZES;
BENCHMARK(combine<intersectTagData>) SIZES;
BENCHMARK(combine<subtractTagData>) SIZES;
BENCHMARK(combine<plainDifference>) SIZES;

template <void (*operation)(Mask&)>
void change(benchmark::State& state)
{
    Mask a = randomMask(static_cast<std::uint64_t>(state.range(0)), 1);
    for (auto _ : state) {
        operation(a);
        benchmark::DoNotOptimize(a.data());
        benchmark::ClobberMemory();
    }
    state.SetItemsProcessed(state.iterations() * state.range(0));
    state.SetBytesProcessed(state.iterations() * state.range(0) * 2);
}
void plainComplement(Mask& a)
{
    auto* const out = reinterpret_cast<unsigned char*>(a.data());
    std::size_t const count = a.size();
    for (std::size_t i = 0; i < count; ++i)
        out[i] ^= 1;
}
BENCHMARK(change<negateTagData>) SIZES;
BENCHMARK(change<plainComplement>) SIZES;
#undef SIZES

// What a call costs of itself.
[[gnu::noinline]] void nothing(Mask const& a, Mask& b)
{
    benchmark::DoNotOptimize(a.data());
    benchmark::DoNotOptimize(b.data());
}
BENCHMARK(combine<nothing>)->Arg(0)->UseRealTime();

// 'v(a) ^ !b - c' over a square of 2000 x 2000 faces: a on faces, b and c on points.

struct TaggedPlane {
    TaggedPlane() : plane(createObject())
    {
        populatePlaneMesh(1, 2000, *plane);
        add("a", sFaceComp, 1);
        add("b", sPointComp, 2);
        add("c", sPointComp, 3);
    }
    void add(char const* name, char const* component, unsigned int seed)
    {
        auto tag = createObject();
        populateTag(component, Nexil::makePtr<Mask>(randomMask(getElementCount(*plane, component), seed)), *tag);
        setProperty(*plane, name, std::move(tag));
    }
    [[nodiscard]] MaskPtr mask(char const* name) const
    {
        MaskPtr data;
        Nexil::String component;
        return getTagData(*plane, name, data, component) ? data : nullptr;
    }

    Nexil::MutablePtr<Object> plane;
};

TaggedPlane const& taggedPlane()
{
    static TaggedPlane const plane;
    return plane;
}

Mask resolvedByHand(TaggedPlane const& plane)
{
    Mask const fromFaces = *facesToPoints(*plane.plane, *plane.mask("a"), nullptr);
    Mask result = *plane.mask("b");
    negateTagData(result);
    intersectTagData(fromFaces, result);
    Mask last = *plane.mask("c");
    subtractTagData(result, last);
    return last;
}

/// Bytes that the passes move: the conversion reads offsets, corners and flags, clears its result and sets flags by
/// corner; a complement reads one mask and writes one; the operations read two and write one.
std::int64_t bytesMoved(TaggedPlane const& plane)
{
    auto const faces = static_cast<std::int64_t>(getElementCount(*plane.plane, sFaceComp));
    auto const points = static_cast<std::int64_t>(getElementCount(*plane.plane, sPointComp));
    // Half of the faces are selected, so half of their four corners are read and set.
    std::int64_t const conversion = faces * (4 + 1) + faces / 2 * 4 * (4 + 1) + points;
    return conversion + points * (2 + 3 + 3);
}

void resolveExpression(benchmark::State& state)
{
    TaggedPlane const& plane = taggedPlane();
    TagResolver resolver;
    (void)resolver.parses("v(a) ^ !b - c");
    Nexil::String component;
    if (!(*resolver.resolve(*plane.plane, component) == resolvedByHand(plane)))
        state.SkipWithError("other flags than by hand");
    for (auto _ : state)
        benchmark::DoNotOptimize(resolver.resolve(*plane.plane, component));
    state.SetBytesProcessed(state.iterations() * bytesMoved(plane));
}
BENCHMARK(resolveExpression)->Unit(benchmark::kMillisecond)->UseRealTime();

void conversionAlone(benchmark::State& state)
{
    TaggedPlane const& plane = taggedPlane();
    auto const mask = plane.mask("a");
    for (auto _ : state)
        benchmark::DoNotOptimize(facesToPoints(*plane.plane, *mask, nullptr));
}
BENCHMARK(conversionAlone)->Unit(benchmark::kMillisecond)->UseRealTime();

template <class Pass>
void passAlone(benchmark::State& state, Pass const& pass)
{
    TaggedPlane const& plane = taggedPlane();
    auto const b = plane.mask("b");
    auto const c = plane.mask("c");
    for (auto _ : state) {
        Mask result = pass(*b, *c);
        benchmark::DoNotOptimize(result.data());
    }
}
/// A copy of the one mask, then the operation on it: what each operator takes at the least when it may write neither.
BENCHMARK_CAPTURE(passAlone, complement,
                  [](Mask const& b, Mask const&) {
                      Mask result = b;
                      negateTagData(result);
                      return result;
                  })
    ->Unit(benchmark::kMillisecond)
    ->UseRealTime();
BENCHMARK_CAPTURE(passAlone, operation,
                  [](Mask const& b, Mask const& c) {
                      Mask result = b;
                      subtractTagData(c, result);
                      return result;
                  })
    ->Unit(benchmark::kMillisecond)
    ->UseRealTime();

void resolveByHand(benchmark::State& state)
{
    for (auto _ : state) {
        Mask result = resolvedByHand(taggedPlane());
        benchmark::DoNotOptimize(result.data());
    }
    state.SetBytesProcessed(state.iterations() * bytesMoved(taggedPlane()));
}
BENCHMARK(resolveByHand)->Unit(benchmark::kMillisecond)->UseRealTime();

void copyOfTheSameBytes(benchmark::State& state)
{
    // A copy reads each byte and writes one.
    auto const count = static_cast<std::size_t>(bytesMoved(taggedPlane()) / 2);
    std::string const from(count, 'x');
    std::string to(count, 'y');
    for (auto _ : state) {
        std::memcpy(to.data(), from.data(), count);
        benchmark::ClobberMemory();
    }
    state.SetBytesProcessed(state.iterations() * bytesMoved(taggedPlane()));
}
BENCHMARK(copyOfTheSameBytes)->Unit(benchmark::kMillisecond)->UseRealTime();

// Cost grows with the length.

void chain(benchmark::State& state, std::string const& term)
{
    auto const cube = createObject();
    populateCubeMesh(1, *cube);
    auto tag = createObject();
    populateTag(sPointComp, Nexil::makePtr<Mask>(randomMask(8, 1)), *tag);
    setProperty(*cube, "a", std::move(tag));
    std::string text = "a";
    for (std::int64_t i = 0; i < state.range(0); ++i)
        text += term;
    for (auto _ : state) {
        TagResolver resolver;
        Nexil::String component;
        if (!resolver.parses(Nexil::String(text.c_str())))
            state.SkipWithError("no expression");
        benchmark::DoNotOptimize(resolver.resolve(*cube, component));
    }
    state.SetItemsProcessed(state.iterations() * state.range(0));
}

BENCHMARK_CAPTURE(chain, ofNames, " + a")
    ->Arg(100)
    ->Arg(10000)
    ->Arg(100000)
    ->Unit(benchmark::kMicrosecond)
    ->UseRealTime();
BENCHMARK_CAPTURE(chain, ofTasks, " ^ !a")
    ->Arg(100)
    ->Arg(10000)
    ->Arg(100000)
    ->Unit(benchmark::kMicrosecond)
    ->UseRealTime();

void pattern(benchmark::State& state)
{
    // Every place of the name begins like the text between two stars.
    auto const length = static_cast<std::size_t>(state.range(0));
    auto const object = createObject();
    auto tag = createObject();
    populateTag(sPointComp, Nexil::makePtr<Mask>(), *tag);
    setProperty(*object, Nexil::String(std::string(length, 'a').c_str()), std::move(tag));
    std::string text = "*";
    for (std::size_t i = 0; i < length / 20; ++i)
        text += "aaaaaaab*";
    TagResolver resolver;
    (void)resolver.parses(Nexil::String(text.c_str()));
    for (auto _ : state) {
        Nexil::String component;
        benchmark::DoNotOptimize(resolver.resolve(*object, component));
    }
    state.SetItemsProcessed(state.iterations() * state.range(0));
}
BENCHMARK(pattern)->Arg(100)->Arg(10000)->Arg(1000000);

} // namespace
