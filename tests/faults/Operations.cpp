#include "Operations.h"

#include "../tags/TagSample.h"
#include "../validation/Edits.h"
#include "../volume/Samples.h"

#include <support/Streams.h>

#include <veldrin/veldrin.h>

#include <cstdio>
#include <cstring>
#include <filesystem>
#include <sstream>
#include <stdexcept>
#include <thread>
#include <tuple>

namespace support {

namespace {

    using namespace Veldrin;
    /// A cube that is a geometry of strands, too, with selections of all components and values shared out by a range.
    Nexil::Ptr<Object> facesAndStrands()
    {
        auto made = taggedCube().build();
        addRange(*made, "corner_index", "face_vertex_component", Indices(24, 1));
        addData(*made, "corner", "corner_index", {1, 2});
        return made;
    }

    template <class Traits>
    Nexil::Ptr<Object> ball()
    {
        return Geometry::move_vld_volume_to_object(*sphereVolume<Traits>(3));
    }

    /// For answers that nobody needs.
    template <class... Answers>
    bool ask(Answers const&...)
    {
        return true;
    }

    void expect(bool agrees)
    {
        if (!agrees)
            throw std::logic_error("two answers contradict each other");
    }

    /// Runs change(), which either does all of it or, when memory runs out, leaves what state() tells as it was.
    template <class State, class Change>
    auto wholly(State const& state, Change const& change)
    {
        auto const before = state();
        try {
            return change();
        } catch (...) {
            if (state() != before)
                throw std::logic_error("something was left half changed");
            throw;
        }
    }

    /// Has arrays of T... filled by compute(geometry, arrays...), which answers whether it did. They hold something before,
    /// as callers' arrays do, and keep it unless they are filled.
    template <class... T, class Compute>
    Operation filling(char const* name, Compute const& compute, Takes takes = Takes::SmallCounts)
    {
        auto const run = [compute](Sample const& sample) {
            std::tuple<Nexil::Array<T>...> arrays;
            auto const prepare = [&](auto&... each) {
                (each.resize(3), ...);
                (each.reserve(sample.room), ...);
                (std::memset(static_cast<void*>(each.data()), 0x5A, 3 * sizeof(each[0])), ...);
            };
            std::apply(prepare, arrays);
            auto const before = arrays;
            auto const computeAll = [&](auto&... each) { return compute(*sample.geometry, each...); };
            bool const isAnswered = wholly([&] { return arrays; }, [&] { return std::apply(computeAll, arrays); });
            expect(isAnswered || arrays == before);
            return arrays != before;
        };
        return {name, run, takes};
    }

    bool validate(Sample const& sample)
    {
        auto const judge = [&](auto validator, Object const& object) {
            auto const message = validator.validate(object).message;
            auto const failures = validator.findFailures(object);
            expect(failures.empty() ? message.empty() : failures[0].status.message == message);
        };
        judge(Geometry::MeshValidator(), *sample.geometry);
        judge(Geometry::PointCloudValidator(), *sample.geometry);
        judge(Geometry::StrandValidator(), *sample.geometry);
        judge(Geometry::VolumeValidator(), *sample.smallVolume);
        judge(Geometry::GeoValidator(), *sample.wideVolume);
        return ask(Geometry::validateMesh(*sample.geometry));
    }

    /// The edge table and what is computed of it agree.
    bool edges(Sample const& sample)
    {
        using namespace Geometry::Mesh;
        HalfEdgeDataStructure const table(*sample.geometry);
        std::uint64_t edgeCount = 0;
        table.forEachEdge(0, table.pointCount(), [&](auto const& edge) {
            ++edgeCount;
            expect(table.findEdge(edge.upper, edge.lower).faceCount == edge.faceCount);
        });
        expect(edgeCount == table.edgeCount());
        expect(eulerCharacteristic(*sample.geometry) == eulerCharacteristic(*sample.geometry, table));
        int const components = connectedComponents(*sample.geometry);
        expect(bettiNumbers(*sample.geometry).x == components || components < 0);
        return edgeCount > 0;
    }

    bool conversions(Sample const& sample)
    {
        using namespace Geometry;
        auto const& geometry = *sample.geometry;
        Nexil::Array<bool> const mask{true, false, true};
        bool ok = false;
        for (auto const style : {TagConversionStyle::AnyElement, TagConversionStyle::AllElements})
            ask(faceVerticesToFaces(geometry, mask, style, &ok), pointsToFaces(geometry, mask, style, &ok),
                pointsToStrands(geometry, mask, style, &ok));
        return ask(faceVerticesToPoints(geometry, mask, &ok), facesToFaceVertices(geometry, mask, &ok),
                   facesToPoints(geometry, mask, &ok), pointsToFaceVertices(geometry, mask, &ok),
                   strandsToPoints(geometry, mask, &ok));
    }

    bool tags(Sample const& sample)
    {
        using namespace Geometry;
        TagResolver resolver;
        if (!resolver.parses("(a + f(b)) - !c ^ p(*)"))
            return false;
        Nexil::String component;
        auto const mask =
            wholly([&] { return component; }, [&] { return resolver.resolve(*sample.geometry, component); });
        MaskPtr data;
        if (!mask || !getTagData(*sample.geometry, "b", data, component))
            return false;
        auto flags = *data;
        unionTagData(*mask, flags);
        intersectTagData(*mask, flags);
        subtractTagData(*data, flags);
        negateTagData(flags);
        bool ok = false;
        std::ostringstream dumped;
        VLD::Utils::Internal::parseTagExpression("a + b ^ f(c)")->dump(dumped);
        return dumped && ask(createTagName("face_component", "x"),
                             convertTagData(*sample.geometry, data, component, "point_component",
                                            TagConversionStyle::AnyElement, &ok));
    }

    bool volumeToObject(Sample const& sample)
    {
        for (auto const& object : {sample.smallVolume, sample.wideVolume}) {
            auto volume = VLD::createObject();
            volume->addComponent(Geometry::getVldTopologyFromProxy(part(*object, "voxel_component")));
            volume->addComponent(Geometry::getVldContainerFromProxy(part(*object, "voxel_tile_tree")));
            volume->addComponent(Geometry::getVldChannelFromProxy(part(*object, "voxel_signed_distance")));
            auto const made = wholly([&] { return volume->componentCount(); },
                                     [&] { return Geometry::move_vld_volume_to_object(*volume); });
            expect(made && volume->componentCount() == (made->empty() ? 3u : 0u));
            if (made->empty())
                return false;
        }
        return true;
    }

    bool objectToVolume(Sample const& sample)
    {
        for (auto const& object : {sample.smallVolume, sample.wideVolume}) {
            auto const shared = Geometry::shallow_copy_object_to_vld_volume(*object);
            Object copy = *object;
            auto const moved =
                wholly([&] { return copy.size(); }, [&] { return Geometry::move_object_to_vld_volume(copy); });
            Math::bbox<Math::float3, float> box;
            wholly([&] { return box; }, [&] { GeometryAlgorithms::getVolumeBounds(*object, box); });
            if (!shared || !Geometry::validUpdatedVolume(*shared) || !moved)
                return false;
            (void)Geometry::move_object_to_vld_volume_const(copy);
        }
        return true;
    }

    bool volumesMade(Sample const&)
    {
        auto const description = filled([](Object& o) {
            addComponent(o, "voxel_component", 0);
            addRange(o, "voxel_tile_tree", "voxel_component", {});
            addData(o, "voxel_fog_density", "voxel_tile_tree", {});
        });
        auto proxies = createObject();
        wholly([&] { return proxies->size(); }, [&] { Geometry::vldProxyFactory(*description, *proxies); });
        auto const built = sphereVolume<VLD::TileTree3D::SmallTiles>(2);
        addPoints<VLD::TileTree3D::WideTiles>(*built);
        auto const made = Geometry::move_vld_volume_to_object_const(*built);
        // The indices of a container are made when they are first asked for.
        return ask(proxies->keys()) && arrayIn<unsigned int>(*made, "voxel_tile_tree", "indices");
    }

    bool proxies(Sample const& sample)
    {
        for (auto const& volume : {sample.smallVolume, sample.wideVolume}) {
            for (auto const& name : volume->keys()) {
                auto const proxy = part(*volume, name.c_str());
                Nexil::Ptr<Object> copy = proxy;
                Nexil::MutablePtr<Object> own(std::move(copy));
                auto const change = [&](auto const& set) {
                    wholly(
                        [&] {
                            Object description;
                            return Geometry::describeVldProxy(*own, description) ? dump(description) : "";
                        },
                        set);
                };
                for (auto const& key : proxy->keys()) {
                    change([&] { own->setPropertyAny(key, proxy->getProperty(key)); });
                    ask(proxy->propertyInfo(key).arraySize, own->extractProperty(key).empty());
                }
                Nexil::Any const longName(Nexil::String("a name that takes memory of its own"));
                change([&] { own->setPropertyAny("target", Nexil::Any(longName)); });
                if (auto* const channel = dynamic_cast<Geometry::VldProxyComponentChannel*>(own.get())) {
                    change([&] { channel->setInPlacePropertyAny("target", longName); });
                    auto& values = const_cast<VLD::TileTree3D::ChannelBase&>(*channel->getVldComponent());
                    change([&] { (void)values.writeValues<float>(); });
                }
                own->eraseAllProperties();
            }
        }
        return true;
    }

    bool accessors(Sample const& sample)
    {
        using namespace Geometry;
        auto const& mesh = *sample.geometry;
        for (auto const& key : mesh.keys())
            ask(getDataGeoProperty(mesh, key), getRangeGeoPropIndices(mesh, key), getRangeGeoProperty(mesh, key),
                getGeoPropTarget(mesh, *part(mesh, key.c_str())), getTargetComponent(mesh, key),
                getGeoPropTargetName(mesh, key), getGeoPropRangeName(key), getUniqueGeoPropName(key, mesh),
                mapGeoPropertyName(key, mesh, *sample.smallVolume), mapGeoPropertyNameToVLDVolume(key, mesh),
                mapGeoPropertyNameFromVLDVolume(key, *sample.smallVolume), getTargetChain(mesh, key),
                getGeoPropNamesByTarget(mesh, key), getGeoPropsByTarget(mesh, key));
        for (auto const& type : *getGeometryTypes())
            ask(Object::isA(mesh, *type));
        auto const component = getComponentGeoPropPrototype();
        return ask(getGeoPropsByPrototype(mesh, *component), getGeoPropNamesByPrototype(mesh, *component),
                   getGeoPropsByName(mesh, "*o*"));
    }

    bool population(Sample const& sample)
    {
        using namespace Geometry;
        auto copy = sample.geometry;
        Nexil::MutablePtr<Object> own(std::move(copy));
        auto const change = [&](auto const& populate) { wholly([&] { return dump(*own); }, [&] { populate(*own); }); };
        change([](Object& o) { populatePlaneMesh(1, 2, o); });
        change([](Object& o) { populateSphereMesh(1, o); });
        change([](Object& o) { populateCubeMesh(1, o); });
        change([](Object& o) { populatePointCloud(array<Math::float3>({{}, {}}), o); });
        change([](Object& o) { (void)setElementCount("point_component", 5, o); });
        change([](Object& o) { setRangeGeoPropIndices("corner_index", array<unsigned int>({0}), o); });
        for (auto const& populate : {&populateVolume, &populateLevelSet, &populateFogVolume, &populateInstances})
            change(*populate);
        change([](Object& o) { populateTag("point_component", array<bool>({true}), o); });
        change([](Object& o) { populateRangeGeoProperty(array<unsigned int>({0}), "face_component", o); });
        return ask(facesAndStrands());
    }

    bool dumps(Sample const& sample)
    {
        return ask(dump(*sample.geometry), dump(*sample.smallVolume, 2));
    }

    Objects allOf(Sample const& sample)
    {
        Objects objects;
        for (auto const& object : {sample.geometry, sample.smallVolume, sample.wideVolume, sample.geometry})
            objects.push_back(object);
        return objects;
    }

    template <class Serialized>
    bool save(Serialized const& objects, int level)
    {
        std::ostringstream stream;
        Nexil::OutputStream output(stream);
        IO::SerializationOptions options;
        options.compressionLevel = level;
        return IO::serialize(objects, output, options, nullptr);
    }

    bool saveHandles(Sample const& sample)
    {
        auto objects = allOf(sample);
        Nexil::Array<Nexil::Ptr<Object>*> handles;
        for (auto& object : objects)
            handles.push_back(&object);
        return save(handles, 9);
    }

    bool load(std::string const& bytes, Sample const& sample)
    {
        IO::InputMemoryBuf buffer(bytes.data(), bytes.size());
        std::istream stream(&buffer);
        Nexil::InputStream input(stream);
        Objects objects{sample.geometry};
        bool const isRead =
            wholly([&] { return objects.size(); }, [&] { return IO::deserialize(input, objects, {}, nullptr); });
        expect(isRead || objects.size() == 1);
        return isRead;
    }

    template <char version>
    bool loadCorpus(Sample const& sample)
    {
        static std::string const bytes =
            fileBytes(std::string(VELDRIN_TEST_CORPUS "/streams/valid/v") + version + ".zon");
        return load(bytes, sample);
    }

    /// A name for a file of this thread, which goes when this does.
    struct TemporaryFile {
        TemporaryFile()
        {
            auto const thread = std::to_string(std::hash<std::thread::id>()(std::this_thread::get_id()));
            path = std::filesystem::temp_directory_path().string() + "/operations_" + thread + ".zon";
        }
        ~TemporaryFile() { std::remove(path.c_str()); }
        std::string path;
    };

    bool saveAndLoadFile(Sample const& sample)
    {
        TemporaryFile const file;
        Nexil::String const path(std::string_view(file.path));
        if (!IO::serialize(allOf(sample), path, {}, nullptr))
            return false;
        Objects objects;
        auto const header = createObject();
        IO::StreamLayout layout;
        bool const isHeaderRead =
            wholly([&] { return header->size(); }, [&] { return IO::deserializeHeader(path, *header, nullptr); });
        return isHeaderRead && IO::deserialize(path, objects, {}, nullptr) && IO::inspectStream(path, layout, nullptr);
    }

} // namespace

Sample::Sample()
    : geometry(facesAndStrands()), smallVolume(ball<VLD::TileTree3D::SmallTiles>()),
      wideVolume(ball<VLD::TileTree3D::WideTiles>())
{
    stream = written(allOf(*this), 9);
}

std::string Sample::description() const
{
    std::string result;
    for (auto const& object : allOf(*this))
        result += dump(*object, 100000);
    return result;
}

std::vector<Operation> const& algorithms()
{
    using namespace GeometryAlgorithms;
    using namespace Geometry::Mesh;
    auto const vertexNormals = [](char const* name, bool byAngle, bool byArea) {
        return filling<Math::float3>(
            name,
            [=](Object const& mesh, auto& out) { return computeMeshVertexNormals(mesh, byAngle, byArea, out), true; },
            Takes::Anything);
    };
    static std::vector<Operation> const all{
        filling<Math::float3>(
            "face normals", [](Object const& mesh, auto& out) { return computeMeshFaceNormals(mesh, out), true; },
            Takes::Anything),
        vertexNormals("normals", false, false),
        vertexNormals("normals by area", false, true),
        vertexNormals("normals by angle", true, false),
        vertexNormals("normals by both", true, true),
        {"diagnose", [](Sample const& sample) { return !(diagnose(*sample.geometry) == Diagnostic{}); },
         Takes::SmallCounts},
        filling<FaceEdge, FaceEdge, unsigned int>(
            "adjacency",
            [](Object const& mesh, auto&... out) { return buildFaceVertexAdjacency(mesh, out..., nullptr); }),
        filling<unsigned int, unsigned int>("normals topology",
                                            [](Object const& mesh, auto& groups, auto& counts) {
                                                computeMeshNormalsTopology(mesh, {}, 0.5f, groups, counts[0], nullptr);
                                                return true;
                                            }),
        {"Euler", [](Sample const& sample) { return eulerCharacteristic(*sample.geometry) != 0; }, Takes::SmallCounts},
        {"components", [](Sample const& sample) { return connectedComponents(*sample.geometry) != -1; },
         Takes::SmallCounts},
        {"Betti", [](Sample const& sample) { return bettiNumbers(*sample.geometry) != Math::int3{}; },
         Takes::SmallCounts},
        {"conversion",
         [](Sample const& sample) {
             bool ok = false;
             (void)Geometry::pointsToFaces(*sample.geometry, {true}, Geometry::TagConversionStyle::AllElements, &ok);
             return ok;
         },
         Takes::SmallCounts},
        filling<Math::float3>(
            "tangents", [](Object const& strands, auto& out) { return computeStrandTangents(strands, out, nullptr); }),
        filling<float, float>("lengths", [](Object const& strands,
                                            auto&... out) { return computeStrandLength(strands, out..., nullptr); }),
        filling<float>("ratios",
                       [](Object const& strands, auto& out) { return computeStrandRatio(strands, out, nullptr); })};
    return all;
}

std::vector<Operation> const& operations()
{
    static std::vector<Operation> const all = [] {
        std::vector<Operation> made = algorithms();
        made.insert(made.end(), {{"validate", validate, Takes::Anything},
                                 {"edges", edges, Takes::SmallCounts},
                                 {"conversions", conversions, Takes::SmallCounts},
                                 {"tags", tags, Takes::SmallCounts},
                                 {"volume to object", volumeToObject},
                                 {"object to volume", objectToVolume, Takes::Volumes},
                                 {"volumes made", volumesMade},
                                 {"proxies", proxies},
                                 {"accessors", accessors, Takes::Anything},
                                 {"population", population},
                                 {"dumps", dumps, Takes::Anything},
                                 {"save at level 0", [](Sample const& sample) { return save(allOf(sample), 0); }},
                                 {"save at level 9", [](Sample const& sample) { return save(allOf(sample), 9); }},
                                 {"save of handles", saveHandles},
                                 {"load", [](Sample const& sample) { return load(sample.stream, sample); }},
                                 {"a file", saveAndLoadFile},
                                 {"load of version 1", loadCorpus<'1'>},
                                 {"load of version 2", loadCorpus<'2'>},
                                 {"load of version 3", loadCorpus<'3'>},
                                 {"load of version 4", loadCorpus<'4'>},
                                 {"load of version 5", loadCorpus<'5'>}});
        return made;
    }();
    return all;
}

} // namespace support
