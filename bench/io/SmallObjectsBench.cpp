#include <nexil/Array.h>
#include <veldrin/io/InputMemoryBuf.h>
#include <veldrin/io/ObjectStream.h>
#include <veldrin/math/Vector.h>
#include <veldrin/object/Properties.h>

#include <benchmark/benchmark.h>

#include <sstream>
#include <string>

/// 100 000 objects of ten small properties each: what the framing, the object graph and the property tables cost.
namespace {

using Objects = Nexil::Array<Nexil::Ptr<Veldrin::Object>>;

constexpr std::uint64_t kObjectCount = 100000;
constexpr std::uint64_t kPropertyCount = 10;

Objects manyObjects()
{
    Objects objects;
    for (std::uint64_t i = 0; i < kObjectCount; ++i) {
        auto object = Veldrin::createObject();
        Veldrin::setProperty(*object, "name", Nexil::String(("object_" + std::to_string(i)).c_str()));
        Veldrin::setProperty(*object, "id", static_cast<unsigned int>(i));
        Veldrin::setProperty(*object, "weight", 0.5f);
        Veldrin::setProperty(*object, "is_visible", true);
        Veldrin::setProperty(*object, "scale", Veldrin::Math::float3{1, 2, 3});
        Veldrin::setProperty(*object, "seed", static_cast<int>(i) * 7);
        Veldrin::setProperty(*object, "time", 1.25);
        Veldrin::setProperty(*object, "layer", Nexil::String("default"));
        Veldrin::setProperty(*object, "parent", static_cast<unsigned int>(i / 2));
        Veldrin::setProperty(*object, "material_reference_id", static_cast<unsigned long long>(i));
        objects.push_back(Nexil::Ptr<Veldrin::Object>(std::move(object)));
    }
    return objects;
}

/// As top-level objects, or (argument 1) all in one array of one object.
Objects arranged(std::int64_t inOneArray)
{
    Objects objects = manyObjects();
    if (inOneArray == 0)
        return objects;
    auto holder = Veldrin::createObject();
    Veldrin::setProperty(*holder, "children", Nexil::makePtr<Objects>(std::move(objects)));
    return {Nexil::Ptr<Veldrin::Object>(std::move(holder))};
}

std::string written(Objects const& objects)
{
    std::ostringstream stream;
    Nexil::OutputStream output(stream);
    Veldrin::IO::serialize(objects, output, {}, nullptr);
    return stream.str();
}

void smallObjectsWrite(benchmark::State& state)
{
    Objects const objects = arranged(state.range(0));
    for (auto _ : state)
        benchmark::DoNotOptimize(written(objects).data());
    state.counters["properties"] = benchmark::Counter(
        static_cast<double>(state.iterations() * kObjectCount * kPropertyCount), benchmark::Counter::kIsRate);
}

void smallObjectsRead(benchmark::State& state)
{
    std::string const bytes = written(arranged(state.range(0)));
    for (auto _ : state) {
        Veldrin::IO::InputMemoryBuf buffer(bytes.data(), bytes.size());
        std::istream stream(&buffer);
        Nexil::InputStream input(stream);
        Objects objects;
        if (!Veldrin::IO::deserialize(input, objects, {}, nullptr))
            state.SkipWithError("not read");
        benchmark::DoNotOptimize(objects.data());
    }
    state.counters["properties"] = benchmark::Counter(
        static_cast<double>(state.iterations() * kObjectCount * kPropertyCount), benchmark::Counter::kIsRate);
}

} // namespace

BENCHMARK(smallObjectsWrite)->Arg(0)->Arg(1)->Unit(benchmark::kMillisecond);
BENCHMARK(smallObjectsRead)->Arg(0)->Arg(1)->Unit(benchmark::kMillisecond);
