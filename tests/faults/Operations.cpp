#include "Operations.h"

#include "../validation/Edits.h"
#include "../volume/Samples.h"

#include <support/Streams.h>

#include <veldrin/veldrin.h>

#include <cstdio>
#include <sstream>
#include <stdexcept>
#include <thread>
#include <tuple>

namespace support {

namespace {

    using namespace Veldrin;
    using Veldrin::Geometry::Mesh::FaceEdge;
    using MaskPtr = Nexil::Ptr<Nexil::Array<bool>>;

    Nexil::Ptr<Object> taggedMesh()
    {
        auto made = filled([](Object& o) { Geometry::populateCubeMesh(2, o); });
        addRange(*made, "corner_index", "face_vertex_component", Indices(24, 1));
        addData(*made, "corner", "corner_index", {1, 2});
        std::tuple<char const*, char const*, std::vector<bool>> const tags[] = {
            {"a", "point_component", {true, true, true, true, true, false, false, true}},
            {"b", "face_component", {true, false, true, false, true, false}},
            {"c", "face_vertex_component", std::vector<bool>(24, true)}};
        for (auto const& [name, component, flags] : tags) {
            auto property = createObject();
            Geometry::populateTag(component, array(flags), *property);
            setProperty(*made, name, std::move(property));
        }
        return made;
    }

    Nexil::Ptr<Object> someStrands()
    {
        return filled([](Object& o) {
            Geometry::populateStrand(array<Math::float3>({{0, 0, 0}, {1, 0, 0}, {1, 2, 0}, {0, 0, 5}}),
                                     array<unsigned int>({0, 3, 4}), o);
        });
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

    /// Runs compute(arrays of T...), which answers whether they were filled, on arrays that held something before, as
    /// callers' arrays do.
    template <class... T, class Compute>
    bool fill(Compute const& compute)
    {
        auto const run = [&](auto&... outputs) {
            (outputs.resize(3), ...);
            return wholly([&] { return ((outputs.empty() || outputs.size() == 3) && ...); },
                          [&] { return compute(outputs...); });
        };
        std::tuple<Nexil::Array<T>...> outputs;
        return std::apply(run, outputs);
    }

    bool validate(Sample const& sample)
    {
        auto const judge = [&](auto validator, Object const& object) {
            auto const message = validator.validate(object).message;
            auto const failures = validator.findFailures(object);
            expect(failures.empty() ? message.empty() : failures[0].status.message == message);
        };
        judge(Geometry::MeshValidator(), *sample.mesh);
        judge(Geometry::PointCloudValidator(), *sample.mesh);
        judge(Geometry::StrandValidator(), *sample.strands);
        judge(Geometry::StrandValidator(), *sample.mesh);
        judge(Geometry::VolumeValidator(), *sample.smallVolume);
        judge(Geometry::GeoValidator(), *sample.wideVolume);
        return ask(Geometry::validateMesh(*sample.strands));
    }

    bool normals(Sample const& sample)
    {
        using namespace GeometryAlgorithms;
        for (bool const byAngle : {false, true})
            for (bool const byArea : {false, true})
                fill<Math::float3>([&](auto& output) {
                    computeMeshVertexNormals(*sample.mesh, byAngle, byArea, output);
                    return true;
                });
        return fill<Math::float3>([&](auto& output) {
            computeMeshFaceNormals(*sample.mesh, output);
            return true;
        });
    }

    bool topology(Sample const& sample)
    {
        using namespace Geometry::Mesh;
        auto const& mesh = *sample.mesh;
        fill<unsigned int>([&](auto& groups) {
            unsigned int count = 0;
            GeometryAlgorithms::computeMeshNormalsTopology(mesh, {}, 0.5f, groups, count, nullptr);
            return true;
        });
        HalfEdgeDataStructure const table(mesh);
        std::uint64_t edgeCount = 0;
        table.forEachEdge(0, table.pointCount(), [&](auto const& edge) {
            ++edgeCount;
            expect(table.findEdge(edge.upper, edge.lower).faceCount == edge.faceCount);
        });
        expect(edgeCount == table.edgeCount());
        expect(eulerCharacteristic(mesh) == eulerCharacteristic(mesh, table));
        int const components = connectedComponents(mesh);
        expect(bettiNumbers(mesh).x == components || components < 0);
        return ask(diagnose(mesh)) && fill<FaceEdge, FaceEdge, unsigned int>([&](auto&... outputs) {
                   return GeometryAlgorithms::buildFaceVertexAdjacency(mesh, outputs..., nullptr);
               });
    }

    bool strandMeasures(Sample const& sample)
    {
        using namespace GeometryAlgorithms;
        auto const& strands = *sample.strands;
        return fill<Math::float3>([&](auto& tangents) { return computeStrandTangents(strands, tangents, nullptr); }) &&
               fill<float, float>(
                   [&](auto&... lengths) { return computeStrandLength(strands, lengths..., nullptr); }) &&
               fill<float>([&](auto& ratios) { return computeStrandRatio(strands, ratios, nullptr); });
    }

    bool conversions(Sample const& sample)
    {
        using namespace Geometry;
        auto const& mesh = *sample.mesh;
        Nexil::Array<bool> const mask{true, false, true};
        bool ok = false;
        for (auto const style : {TagConversionStyle::AnyElement, TagConversionStyle::AllElements})
            ask(faceVerticesToFaces(mesh, mask, style, &ok), pointsToFaces(mesh, mask, style, &ok),
                pointsToStrands(*sample.strands, mask, style, &ok));
        return ask(faceVerticesToPoints(mesh, mask, &ok), facesToFaceVertices(mesh, mask, &ok),
                   facesToPoints(mesh, mask, &ok), pointsToFaceVertices(mesh, mask, &ok),
                   strandsToPoints(*sample.strands, mask, &ok));
    }

    bool tags(Sample const& sample)
    {
        using namespace Geometry;
        TagResolver resolver;
        if (!resolver.parses("(a + f(b)) - !c ^ p(*)"))
            return false;
        Nexil::String component;
        auto const mask = resolver.resolve(*sample.mesh, component);
        MaskPtr data;
        if (!mask || !getTagData(*sample.mesh, "b", data, component))
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
                             convertTagData(*sample.mesh, data, component, "point_component",
                                            TagConversionStyle::AnyElement, &ok));
    }

    bool volumeAndObject(Sample const& sample)
    {
        for (auto const& object : {sample.smallVolume, sample.wideVolume}) {
            auto const shared = Geometry::shallow_copy_object_to_vld_volume(*object);
            if (!shared || !Geometry::validUpdatedVolume(*shared))
                return false;
            VLD::Object volume = *shared;
            auto const made = wholly([&] { return volume.componentCount(); },
                                     [&] { return Geometry::move_vld_volume_to_object(volume); });
            Object copy = *object;
            auto const back =
                wholly([&] { return copy.size(); }, [&] { return Geometry::move_object_to_vld_volume(copy); });
            Math::bbox<Math::float3, float> box;
            GeometryAlgorithms::getVolumeBounds(*object, box);
            if (!made || !back)
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
        return ask(proxies->keys(), made->keys(), arrayIn<unsigned int>(*made, "voxel_tile_tree", "indices"));
    }

    bool proxies(Sample const& sample)
    {
        for (auto const& volume : {sample.smallVolume, sample.wideVolume}) {
            ask(Geometry::getVldTopologyFromProxy(part(*volume, "voxel_component"))->name(),
                Geometry::getVldContainerFromProxy(part(*volume, "voxel_tile_tree"))->name(),
                Geometry::getVldChannelFromProxy(part(*volume, "voxel_signed_distance"))->name());
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
        auto const& mesh = *sample.mesh;
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
        auto copy = sample.mesh;
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
        return ask(taggedMesh(), someStrands());
    }

    bool dumps(Sample const& sample)
    {
        return ask(dump(*sample.mesh), dump(*sample.smallVolume, 2));
    }

    Objects allOf(Sample const& sample)
    {
        Objects objects;
        for (auto const& object : {sample.mesh, sample.strands, sample.smallVolume, sample.wideVolume, sample.mesh})
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

    bool saveFile(Sample const& sample)
    {
        // Others may be writing theirs.
        auto const name = sample.path + "." + std::to_string(std::hash<std::thread::id>()(std::this_thread::get_id()));
        bool const isWritten = IO::serialize(allOf(sample), Nexil::String(std::string_view(name)), {}, nullptr);
        std::remove(name.c_str());
        return isWritten;
    }

    bool load(std::string const& bytes, Sample const& sample)
    {
        IO::InputMemoryBuf buffer(bytes.data(), bytes.size());
        std::istream stream(&buffer);
        Nexil::InputStream input(stream);
        Objects objects{sample.mesh};
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

    bool loadFile(Sample const& sample)
    {
        Nexil::String const path(std::string_view(sample.path));
        Objects objects;
        auto const header = createObject();
        IO::StreamLayout layout;
        bool const isHeaderRead =
            wholly([&] { return header->size(); }, [&] { return IO::deserializeHeader(path, *header, nullptr); });
        return isHeaderRead && IO::deserialize(path, objects, {}, nullptr) && IO::inspectStream(path, layout, nullptr);
    }

} // namespace

Sample::Sample()
    : mesh(taggedMesh()), strands(someStrands()), smallVolume(ball<VLD::TileTree3D::SmallTiles>()),
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

std::vector<Operation> const& operations()
{
    static std::vector<Operation> const all{
        {"validate", validate, Takes::Anything},
        {"normals", normals, Takes::Anything},
        {"topology", topology, Takes::SmallCounts},
        {"strand measures", strandMeasures, Takes::SmallCounts},
        {"conversions", conversions, Takes::SmallCounts},
        {"tags", tags, Takes::SmallCounts},
        {"volume and object", volumeAndObject, Takes::Volumes},
        {"volumes made", volumesMade},
        {"proxies", proxies},
        {"accessors", accessors, Takes::Anything},
        {"population", population},
        {"dumps", dumps, Takes::Anything},
        {"save at level 0", [](Sample const& sample) { return save(allOf(sample), 0); }},
        {"save at level 9", [](Sample const& sample) { return save(allOf(sample), 9); }},
        {"save of handles", saveHandles},
        {"save of a file", saveFile},
        {"load", [](Sample const& sample) { return load(sample.stream, sample); }},
        {"load of a file", loadFile},
        {"load of version 1", loadCorpus<'1'>},
        {"load of version 2", loadCorpus<'2'>},
        {"load of version 3", loadCorpus<'3'>},
        {"load of version 4", loadCorpus<'4'>},
        {"load of version 5", loadCorpus<'5'>},
    };
    return all;
}

} // namespace support
