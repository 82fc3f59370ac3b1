/// Meshes, strands and volumes whose counts, offsets, indices and targets are any numbers, without a validator being asked,
/// to everything that reads geometry. The geometry must come out of it as it went in.

#include "Check.h"
#include "InputBytes.h"

#include <faults/Operations.h>
#include <support/Geometry.h>

#include <tbb/global_control.h>
#include <veldrin/veldrin.h>

#include <cstdint>
#include <string>

namespace {

using namespace Veldrin;
using MaskPtr = Nexil::Ptr<Nexil::Array<bool>>;
using fuzz::check;
using fuzz::InputBytes;

// Where an output is as large as a count says, a large count is the caller's choice and proves nothing.
constexpr unsigned int kMostCounted = 1u << 20;

char const* targetFrom(InputBytes& bytes, char const* expected)
{
    static char const* const targets[] = {Geometry::sPointComp,
                                          Geometry::sFaceComp,
                                          Geometry::sFaceVertexComp,
                                          Geometry::sStrandComp,
                                          Geometry::sFaceVertex,
                                          Geometry::sPointPosition,
                                          "corner_index",
                                          "corner",
                                          "nowhere",
                                          ""};
    unsigned int const b = bytes.byte();
    return b < 192 ? expected : targets[b % std::size(targets)];
}

template <class T>
void addData(Object& geometry, InputBytes& bytes, char const* name, char const* target, T const& defaultValue,
             Nexil::Ptr<Nexil::Array<T>> values)
{
    auto const how = bytes.byte();
    if (how == 255)
        return; // left out
    auto data = createObject();
    Geometry::createDataGeoProperty(defaultValue, targetFrom(bytes, target), std::move(values), *data);
    if (how == 254)
        setProperty(*data, Geometry::sData, Nexil::Ptr<Nexil::Array<T>>());
    if (how == 253)
        setProperty(*data, Geometry::sData, Nexil::makePtr<Nexil::Array<double>>(Nexil::Array<double>{1, 2}));
    setProperty(geometry, name, std::move(data));
}

void addComponent(Object& geometry, InputBytes& bytes, char const* name, std::uint64_t expected)
{
    auto component = createObject();
    Geometry::populateComponentGeoProperty(bytes.count(expected), *component);
    setProperty(geometry, name, std::move(component));
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
    auto const lessOne = [](auto const& offsets) { return offsets->empty() ? 0 : offsets->size() - 1; };
    addComponent(*made, bytes, Geometry::sPointComp, positions->size());
    addComponent(*made, bytes, Geometry::sFaceVertexComp, corners->size());
    addComponent(*made, bytes, Geometry::sFaceComp, lessOne(faceOffsets));
    addComponent(*made, bytes, Geometry::sStrandComp, lessOne(strandOffsets));
    addData(*made, bytes, Geometry::sPointPosition, Geometry::sPointComp, Math::float3{}, positions);
    addData(*made, bytes, Geometry::sFaceVertex, Geometry::sFaceVertexComp, 0u, corners);
    addData(*made, bytes, Geometry::sFaceOffset, Geometry::sFaceComp, 0u, faceOffsets);
    addData(*made, bytes, Geometry::sStrandOffset, Geometry::sStrandComp, 0u, strandOffsets);
    auto range = createObject();
    auto indices = bytes.array(index);
    Geometry::populateRangeGeoProperty(std::move(indices), targetFrom(bytes, Geometry::sFaceVertexComp), *range);
    setProperty(*made, "corner_index", std::move(range));
    addData(*made, bytes, "corner", "corner_index", 0.0f, bytes.array([&] { return bytes.number(); }));
    addData(*made, bytes, "a", Geometry::sPointComp, false, bytes.array(flag));
    addData(*made, bytes, "b", Geometry::sFaceComp, false, bytes.array(flag));
    addData(*made, bytes, "c", Geometry::sFaceVertexComp, false, bytes.array(flag));
    addData(*made, bytes, "d", Geometry::sStrandComp, false, bytes.array(flag));
    return made;
}

void runOnVolumes(support::Sample const& sample)
{
    for (auto const& operation : support::operations())
        if (operation.takes == support::Takes::Volumes || operation.takes == support::Takes::Anything)
            (void)operation.run(sample);
}

template <class Traits>
void runOnTiles(support::Sample& sample, InputBytes& bytes)
{
    using namespace VLD::TileTree3D;
    auto const coordinate = [&] {
        auto const along = [&] {
            auto const steps = bytes.index();
            return static_cast<int>(steps * (bytes.byte() & 1 ? 1u : static_cast<unsigned int>(Traits::kInnerWidth)));
        };
        int const x = along();
        int const y = along();
        return Coordinate{x, y, along()};
    };
    auto const index = [&] { return bytes.index(); };
    TileLevels levels;
    levels.leafOrigins = *bytes.array(coordinate);
    levels.leafParents = *bytes.array(index);
    levels.innerOrigins = *bytes.array(coordinate);
    levels.innerChildren = *bytes.array(index);
    if (bytes.byte() & 1)
        levels.innerChildren.resize(levels.innerOrigins.size() * Traits::kInnerCells);
    auto const topology = VoxelTopology<Traits>::create(Geometry::sVoxelComp, std::move(levels));
    if (!topology)
        return;
    auto volume = VLD::createObject();
    volume->addComponent(topology);
    volume->addComponent(Nexil::makePtr<Container<Traits>>(Geometry::sVoxelTileTree, topology, bytes.number()));
    auto values = bytes.array([&] { return bytes.number(); });
    volume->addComponent(
        Nexil::makePtr<Channel<Traits>>(Geometry::sVoxelFogDensity, Geometry::sVoxelTileTree, std::move(values), 0.0f));
    sample.smallVolume = sample.wideVolume = Geometry::move_vld_volume_to_object(*volume);
    if (sample.smallVolume)
        runOnVolumes(sample);
}

/// What takes numbers besides the geometry.
void runOnNumbersOfTheInput(Object const& geometry, InputBytes& bytes)
{
    auto const normalIndices = bytes.array([&] { return bytes.index(); });
    Nexil::Array<unsigned int> groups;
    unsigned int groupCount = 0;
    GeometryAlgorithms::computeMeshNormalsTopology(geometry, *normalIndices, bytes.number(), groups, groupCount,
                                                   nullptr);
    for (unsigned int const group : groups)
        check(group < groupCount || group == Geometry::kInvalidIndex);
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
    if (bytes.byte() == 'v') {
        runOnTiles<VLD::TileTree3D::SmallTiles>(sample, bytes);
        runOnTiles<VLD::TileTree3D::WideTiles>(sample, bytes);
        return 0;
    }
    Nexil::Ptr<Object> const geometry = geometryFrom(bytes);
    auto const before = support::dump(*geometry, 1000);
    sample.geometry = geometry;
    bool hasSmallCounts = true;
    for (auto const* name :
         {Geometry::sPointComp, Geometry::sFaceComp, Geometry::sFaceVertexComp, Geometry::sStrandComp})
        hasSmallCounts = hasSmallCounts && Geometry::getElementCount(*geometry, name) <= kMostCounted;
    for (auto const& operation : support::operations())
        if (operation.takes == support::Takes::Anything ||
            (hasSmallCounts && operation.takes == support::Takes::SmallCounts))
            (void)operation.run(sample);
    if (hasSmallCounts)
        runOnNumbersOfTheInput(*geometry, bytes);
    // What describes volumes, and volumes made after descriptions.
    auto proxies = createObject();
    Geometry::vldProxyFactory(*geometry, *proxies);
    sample.smallVolume = geometry;
    sample.wideVolume = std::move(proxies);
    runOnVolumes(sample);
    check(support::dump(*geometry, 1000) == before);
    return 0;
}
