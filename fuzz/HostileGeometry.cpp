/// Meshes and strands whose counts, offsets, indices and targets are any numbers, without a validator being asked,
/// to everything that reads geometry. The geometry must come out of it as it went in.

#include "InputBytes.h"

#include <faults/Operations.h>
#include <support/Geometry.h>

#include <tbb/global_control.h>
#include <veldrin/veldrin.h>

#include <cstdint>
#include <cstdlib>
#include <string>

namespace {

using namespace Veldrin;
using MaskPtr = Nexil::Ptr<Nexil::Array<bool>>;
using fuzz::InputBytes;

// Where an output is as large as a count says, a large count is the caller's choice and proves nothing.
constexpr unsigned int kMostCounted = 1u << 20;

void check(bool condition)
{
    if (!condition)
        std::abort();
}

char const* targetFrom(InputBytes& bytes, char const* expected)
{
    static char const* const targets[] = {Geometry::sPointComp,
                                          Geometry::sFaceComp,
                                          Geometry::sFaceVertexComp,
                                          Geometry::sFaceVertex,
                                          "corner_index",
                                          "nowhere",
                                          ""};
    unsigned int const b = bytes.byte();
    return b < 192 ? expected : targets[b % std::size(targets)];
}

template <class T>
void addData(Object& geometry, InputBytes& bytes, char const* name, char const* target,
             Nexil::Ptr<Nexil::Array<T>> values)
{
    auto const how = bytes.byte();
    if (how == 255)
        return; // left out
    auto data = createObject();
    Geometry::createDataGeoProperty(T(), targetFrom(bytes, target), std::move(values), *data);
    if (how == 254)
        setProperty(*data, Geometry::sData, Nexil::Ptr<Nexil::Array<T>>());
    if (how == 253)
        setProperty(*data, Geometry::sData, Nexil::makePtr<Nexil::Array<double>>(Nexil::Array<double>{1, 2}));
    setProperty(geometry, name, std::move(data));
}

/// A geometry with the properties of meshes, strands and, by one bit, volumes at once.
Nexil::MutablePtr<Object> geometryFrom(InputBytes& bytes)
{
    auto const index = [&] { return bytes.index(); };
    auto const flag = [&] { return (bytes.byte() & 1) != 0; };
    auto made = createObject();
    auto const positions = bytes.array([&] {
        float const x = bytes.number();
        float const y = bytes.number();
        return Math::float3{x, y, bytes.number()};
    });
    auto const corners = bytes.array(index);
    auto const faceOffsets = bytes.array(index);
    auto const strandOffsets = bytes.array(index);
    auto const component = [&](char const* name, std::uint64_t expected) {
        auto part = createObject();
        Geometry::populateComponentGeoProperty(bytes.count(expected), *part);
        setProperty(*made, name, std::move(part));
    };
    auto const lessOne = [](auto const& offsets) { return offsets->empty() ? 0 : offsets->size() - 1; };
    component(Geometry::sPointComp, positions->size());
    component(Geometry::sFaceVertexComp, corners->size());
    component(Geometry::sFaceComp, lessOne(faceOffsets));
    component(Geometry::sStrandComp, lessOne(strandOffsets));
    addData(*made, bytes, Geometry::sPointPosition, Geometry::sPointComp, positions);
    addData(*made, bytes, Geometry::sFaceVertex, Geometry::sFaceVertexComp, corners);
    addData(*made, bytes, Geometry::sFaceOffset, Geometry::sFaceComp, faceOffsets);
    addData(*made, bytes, Geometry::sStrandOffset, Geometry::sStrandComp, strandOffsets);
    auto range = createObject();
    auto indices = bytes.array(index);
    Geometry::populateRangeGeoProperty(std::move(indices), targetFrom(bytes, Geometry::sFaceVertexComp), *range);
    setProperty(*made, "corner_index", std::move(range));
    addData(*made, bytes, "corner", "corner_index", bytes.array([&] { return bytes.number(); }));
    std::pair<char const*, char const*> const tags[] = {{"a", Geometry::sPointComp},
                                                        {"b", Geometry::sFaceComp},
                                                        {"c", Geometry::sFaceVertexComp},
                                                        {"d", Geometry::sStrandComp}};
    for (auto const& [name, target] : tags)
        addData(*made, bytes, name, target, bytes.array(flag));
    return made;
}

void run(support::Takes takes, support::Sample const& sample)
{
    for (auto const& operation : support::operations())
        if (operation.takes == takes)
            (void)operation.run(sample);
}

/// What takes numbers besides the geometry.
void runOnNumbersOfTheInput(Object const& geometry, InputBytes& bytes)
{
    auto const normalIndices = bytes.array([&] { return bytes.index(); });
    Nexil::Array<unsigned int> groups;
    unsigned int groupCount = 0;
    GeometryAlgorithms::computeMeshNormalsTopology(geometry, *normalIndices, bytes.number(), groups, groupCount,
                                                   nullptr);
    bool ok = false;
    auto const mask = bytes.array([&] { return (bytes.byte() & 1) != 0; });
    for (auto const* from : {Geometry::sPointComp, Geometry::sFaceComp, Geometry::sFaceVertexComp, "nowhere"})
        for (auto const* to : {Geometry::sPointComp, Geometry::sFaceComp, Geometry::sStrandComp})
            for (auto const style :
                 {Geometry::TagConversionStyle::AnyElement, Geometry::TagConversionStyle::AllElements})
                (void)Geometry::convertTagData(geometry, mask, from, to, style, &ok);
    Geometry::TagResolver resolver;
    Nexil::String component;
    if (resolver.parses(Nexil::String(bytes.rest())))
        check(static_cast<bool>(resolver.resolve(geometry, component)));
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(std::uint8_t const* data, std::size_t size)
{
    // One thread: the same input takes the same way at each run, and more of them are tried.
    static tbb::global_control const limit(tbb::global_control::max_allowed_parallelism, 1);
    static support::Sample const whole;
    support::Sample sample = whole;
    InputBytes bytes(data, size);
    Nexil::Ptr<Object> const geometry = geometryFrom(bytes);
    auto const before = support::dump(*geometry, 1000);
    sample.mesh = sample.strands = geometry;
    bool hasSmallCounts = true;
    for (auto const* name :
         {Geometry::sPointComp, Geometry::sFaceComp, Geometry::sFaceVertexComp, Geometry::sStrandComp})
        hasSmallCounts = hasSmallCounts && Geometry::getElementCount(*geometry, name) <= kMostCounted;
    run(support::Takes::Anything, sample);
    if (hasSmallCounts) {
        run(support::Takes::SmallCounts, sample);
        runOnNumbersOfTheInput(*geometry, bytes);
    }
    // What describes volumes, and volumes made after descriptions.
    auto proxies = createObject();
    Geometry::vldProxyFactory(*geometry, *proxies);
    sample.smallVolume = geometry;
    sample.wideVolume = std::move(proxies);
    run(support::Takes::Volumes, sample);
    run(support::Takes::Anything, sample);
    check(support::dump(*geometry, 1000) == before);
    return 0;
}
