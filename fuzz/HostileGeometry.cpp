/// Meshes, strands and volumes whose counts, offsets, indices and targets are any numbers, without a validator being asked,
/// to everything that reads geometry. The geometry must come out of it as it went in.

#include "InputBytes.h"

#include <tbb/global_control.h>
#include <veldrin/veldrin.h>

#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <string>

namespace {

using namespace Veldrin;
using MaskPtr = Nexil::Ptr<Nexil::Array<bool>>;
using fuzz::InputBytes;

// Where an output is as large as a count says, a large count is the caller's choice and proves nothing.
constexpr unsigned int kMostCounted = 1u << 20;

void check(bool condition, unsigned int line = __builtin_LINE())
{
    if (!condition) {
        std::fprintf(stderr, "check of line %u failed\n", line);
        std::abort();
    }
}

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

std::string dumpOf(Object const& object)
{
    struct Sink : Geometry::Internal::DebugDumpInterface {
        void write(char const* text, std::uint64_t length) override { dump.append(text, length); }
        std::string dump;
    } sink;
    Geometry::Internal::debugDumpToStream(sink, object, 1000);
    return std::move(sink.dump);
}

void runOnMesh(Object const& mesh, InputBytes& bytes, bool hasSmallCounts)
{
    Nexil::Array<Math::float3> normals;
    GeometryAlgorithms::computeMeshFaceNormals(mesh, normals);
    for (int weights = 0; weights < 4; ++weights)
        GeometryAlgorithms::computeMeshVertexNormals(mesh, weights & 1, weights & 2, normals);
    Nexil::Array<Geometry::Mesh::FaceEdge> edges;
    Nexil::Array<Geometry::Mesh::FaceEdge> pointFaces;
    Nexil::Array<unsigned int> offsets;
    auto const normalIndices = bytes.array([&] { return bytes.index(); });
    float const maxAngle = bytes.number();
    if (!hasSmallCounts)
        return;
    if (!GeometryAlgorithms::buildFaceVertexAdjacency(mesh, edges, pointFaces, offsets, nullptr))
        check(edges.empty() && pointFaces.empty() && offsets.empty());
    Nexil::Array<unsigned int> groups;
    unsigned int groupCount = 0;
    GeometryAlgorithms::computeMeshNormalsTopology(mesh, *normalIndices, maxAngle, groups, groupCount, nullptr);
    for (unsigned int const group : groups)
        check(group < groupCount || group == Geometry::kInvalidIndex);
    Geometry::Mesh::HalfEdgeDataStructure const table(mesh);
    std::uint64_t counted = 0;
    table.forEachEdge(0, table.pointCount(), [&](Geometry::Mesh::HalfEdgeDataStructure::Edge const& edge) {
        ++counted;
        check(table.findEdge(edge.upper, edge.lower).faceCount == edge.faceCount);
    });
    check(counted == table.edgeCount());
    auto const betti = Geometry::Mesh::bettiNumbers(mesh);
    int const components = Geometry::Mesh::connectedComponents(mesh);
    check(betti.x == components || components < 0);
    check(Geometry::Mesh::eulerCharacteristic(mesh, table) == Geometry::Mesh::eulerCharacteristic(mesh));
    (void)Geometry::Mesh::diagnose(mesh);
}

void runOnStrands(Object const& strands)
{
    Nexil::Array<Math::float3> tangents;
    Nexil::Array<float> lengths;
    Nexil::Array<float> segments;
    Nexil::Array<float> ratios;
    (void)GeometryAlgorithms::computeStrandTangents(strands, tangents, nullptr);
    (void)GeometryAlgorithms::computeStrandLength(strands, lengths, segments, nullptr);
    (void)GeometryAlgorithms::computeStrandRatio(strands, ratios, nullptr);
}

void convertSelections(Object const& geometry, InputBytes& bytes)
{
    using Geometry::TagConversionStyle;
    auto const mask = bytes.array([&] { return (bytes.byte() & 1) != 0; });
    bool ok = false;
    for (auto const style : {TagConversionStyle::AnyElement, TagConversionStyle::AllElements}) {
        (void)Geometry::faceVerticesToFaces(geometry, *mask, style, &ok);
        (void)Geometry::pointsToFaces(geometry, *mask, style, &ok);
        (void)Geometry::pointsToStrands(geometry, *mask, style, &ok);
        for (auto const* from : {Geometry::sPointComp, Geometry::sFaceComp, Geometry::sFaceVertexComp, "nowhere"})
            for (auto const* to : {Geometry::sPointComp, Geometry::sFaceComp, Geometry::sStrandComp})
                (void)Geometry::convertTagData(geometry, mask, from, to, style, &ok);
    }
    (void)Geometry::faceVerticesToPoints(geometry, *mask, &ok);
    (void)Geometry::facesToFaceVertices(geometry, *mask, &ok);
    (void)Geometry::facesToPoints(geometry, *mask, &ok);
    (void)Geometry::pointsToFaceVertices(geometry, *mask, &ok);
    (void)Geometry::strandsToPoints(geometry, *mask, &ok);
}

void resolveTags(Object const& geometry, std::string_view text)
{
    for (auto const* common : {"a", "b ^ !c - d", "f(a) + p(b)", "v(*)", "s(a) - p(d)"}) {
        Geometry::TagResolver resolver;
        Nexil::String component;
        check(resolver.parses(common).ok || !resolver.parses(common).message.empty());
        check(static_cast<bool>(resolver.resolve(geometry, component)));
    }
    Geometry::TagResolver resolver;
    Nexil::String component;
    if (resolver.parses(Nexil::String(text)))
        check(static_cast<bool>(resolver.resolve(geometry, component)));
}

/// Gives the verdict of the first failure and of all of them, which have to agree.
template <class Validator>
void validate(Object const& object)
{
    Validator validator;
    auto const status = validator.validate(object);
    auto const failures = validator.findFailures(object);
    check(static_cast<bool>(status) == failures.empty());
    check(failures.empty() || failures[0].status.message == status.message);
}

template <class Traits>
void runOnTiles(InputBytes& bytes)
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
    auto const geometry = Geometry::move_vld_volume_to_object(*volume);
    if (!geometry)
        return;
    validate<Geometry::VolumeValidator>(*geometry);
    validate<Geometry::GeoValidator>(*geometry);
    Math::bbox<Math::float3, float> box;
    GeometryAlgorithms::getVolumeBounds(*geometry, box);
    (void)Geometry::move_object_to_vld_volume(*geometry);
}

void runOnDescriptions(Object const& geometry)
{
    auto proxies = createObject();
    Geometry::vldProxyFactory(geometry, *proxies);
    validate<Geometry::VolumeValidator>(*proxies);
    Math::bbox<Math::float3, float> box;
    GeometryAlgorithms::getVolumeBounds(*proxies, box);
    GeometryAlgorithms::getVolumeBounds(geometry, box);
    (void)Geometry::shallow_copy_object_to_vld_volume(geometry);
}

void askAccessors(Object const& geometry)
{
    for (auto const& key : geometry.keys()) {
        (void)Geometry::getTargetChain(geometry, key);
        (void)Geometry::getTargetComponent(geometry, key);
        (void)Geometry::getDataGeoProperty(geometry, key);
        (void)Geometry::getRangeGeoPropIndices(geometry, key);
        (void)Geometry::getGeoPropsByTarget(geometry, key);
        (void)Geometry::getUniqueGeoPropName(key, geometry);
    }
    (void)Geometry::getGeoPropsByName(geometry, "*_*");
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(std::uint8_t const* data, std::size_t size)
{
    // One thread: the same input takes the same way at each run, and more of them are tried.
    static tbb::global_control const limit(tbb::global_control::max_allowed_parallelism, 1);
    InputBytes bytes(data, size);
    if (bytes.byte() == 'v') {
        runOnTiles<VLD::TileTree3D::SmallTiles>(bytes);
        runOnTiles<VLD::TileTree3D::WideTiles>(bytes);
        return 0;
    }
    auto const geometry = geometryFrom(bytes);
    auto const before = dumpOf(*geometry);
    bool hasSmallCounts = true;
    for (auto const* name :
         {Geometry::sPointComp, Geometry::sFaceComp, Geometry::sFaceVertexComp, Geometry::sStrandComp})
        hasSmallCounts = hasSmallCounts && Geometry::getElementCount(*geometry, name) <= kMostCounted;
    validate<Geometry::GeoValidator>(*geometry);
    validate<Geometry::MeshValidator>(*geometry);
    validate<Geometry::PointCloudValidator>(*geometry);
    validate<Geometry::StrandValidator>(*geometry);
    validate<Geometry::VolumeValidator>(*geometry);
    runOnMesh(*geometry, bytes, hasSmallCounts);
    if (hasSmallCounts) {
        runOnStrands(*geometry);
        convertSelections(*geometry, bytes);
        resolveTags(*geometry, bytes.rest());
    }
    runOnDescriptions(*geometry);
    askAccessors(*geometry);
    check(dumpOf(*geometry) == before);
    return 0;
}
