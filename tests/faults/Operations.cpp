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
        auto const tag = [&](char const* name, char const* component, std::vector<bool> const& flags) {
            auto property = createObject();
            Geometry::populateTag(component, array(flags), *property);
            setProperty(*made, name, std::move(property));
        };
        tag("a", "point_component", {true, true, true, true, true, false, false, true});
        tag("b", "face_component", {true, false, true, false, true, false});
        tag("c", "face_vertex_component", std::vector<bool>(24, true));
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

    /// A number for the bytes of plain values, so that results can be compared without being kept.
    template <class T>
    std::string digest(Nexil::Array<T> const& values)
    {
        std::string_view const bytes(reinterpret_cast<char const*>(values.data()), values.size() * sizeof(T));
        return std::to_string(std::hash<std::string_view>()(bytes)) + " ";
    }

    std::string digest(MaskPtr const& mask)
    {
        return mask ? digest(*mask) : "null ";
    }

    std::string text(Nexil::Array<Nexil::String> const& list)
    {
        std::string all = "names:";
        for (auto const& name : list)
            (all += ' ') += name.view();
        return all;
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
    /// callers' arrays do, and gives their digests.
    template <class... T, class Compute>
    std::string fill(Compute const& compute)
    {
        auto const run = [&](auto&... outputs) {
            (outputs.resize(3), ...);
            bool const isFilled = wholly([&] { return ((outputs.empty() || outputs.size() == 3) && ...); },
                                         [&] { return compute(outputs...); });
            return isFilled ? (digest(outputs) + ...) : std::string();
        };
        std::tuple<Nexil::Array<T>...> outputs;
        return std::apply(run, outputs);
    }

    std::string validate(Sample const& sample)
    {
        std::string result;
        auto const judge = [&](auto validator, Object const& object) {
            auto const message = validator.validate(object).message;
            auto const failures = validator.findFailures(object);
            expect(failures.empty() ? message.empty() : failures[0].status.message == message);
            result += message.view();
            result += std::to_string(failures.size());
        };
        judge(Geometry::MeshValidator(), *sample.mesh);
        judge(Geometry::PointCloudValidator(), *sample.mesh);
        judge(Geometry::StrandValidator(), *sample.strands);
        judge(Geometry::StrandValidator(), *sample.mesh);
        judge(Geometry::VolumeValidator(), *sample.smallVolume);
        judge(Geometry::GeoValidator(), *sample.wideVolume);
        return result + Geometry::validateMesh(*sample.strands).message.c_str();
    }

    std::string normals(Sample const& sample)
    {
        std::string result;
        for (int kind = 0; kind < 5; ++kind)
            result += fill<Math::float3>([&](auto& output) {
                if (kind == 4)
                    GeometryAlgorithms::computeMeshFaceNormals(*sample.mesh, output);
                else
                    GeometryAlgorithms::computeMeshVertexNormals(*sample.mesh, kind & 1, kind & 2, output);
                return true;
            });
        return result;
    }

    std::string topology(Sample const& sample)
    {
        using namespace Geometry::Mesh;
        auto const& mesh = *sample.mesh;
        auto const result = fill<unsigned int>([&](auto& groups) {
                                unsigned int count = 0;
                                GeometryAlgorithms::computeMeshNormalsTopology(mesh, {}, 0.5f, groups, count, nullptr);
                                return true;
                            }) +
                            fill<FaceEdge, FaceEdge, unsigned int>([&](auto&... outputs) {
                                return GeometryAlgorithms::buildFaceVertexAdjacency(mesh, outputs..., nullptr);
                            });
        HalfEdgeDataStructure const table(mesh);
        std::uint64_t edgeCount = 0;
        table.forEachEdge(0, table.pointCount(), [&](auto const& edge) {
            ++edgeCount;
            expect(table.findEdge(edge.upper, edge.lower).faceCount == edge.faceCount);
        });
        expect(edgeCount == table.edgeCount());
        int const euler = eulerCharacteristic(mesh);
        expect(euler == eulerCharacteristic(mesh, table));
        auto const betti = bettiNumbers(mesh);
        int const components = connectedComponents(mesh);
        expect(betti.x == components || components < 0);
        return result + std::to_string(euler) + (diagnose(mesh) == Diagnostic{} ? "clean" : "faulty");
    }

    std::string strandMeasures(Sample const& sample)
    {
        using namespace GeometryAlgorithms;
        auto const& strands = *sample.strands;
        return fill<Math::float3>([&](auto& tangents) { return computeStrandTangents(strands, tangents, nullptr); }) +
               fill<float, float>([&](auto&... lengths) { return computeStrandLength(strands, lengths..., nullptr); }) +
               fill<float>([&](auto& ratios) { return computeStrandRatio(strands, ratios, nullptr); });
    }

    std::string conversions(Sample const& sample)
    {
        using Geometry::TagConversionStyle;
        Nexil::Array<bool> const mask{true, false, true};
        bool ok = false;
        std::string result;
        for (auto const style : {TagConversionStyle::AnyElement, TagConversionStyle::AllElements})
            result += digest(Geometry::faceVerticesToFaces(*sample.mesh, mask, style, &ok)) +
                      digest(Geometry::pointsToFaces(*sample.mesh, mask, style, &ok)) +
                      digest(Geometry::pointsToStrands(*sample.strands, mask, style, &ok));
        return result + digest(Geometry::faceVerticesToPoints(*sample.mesh, mask, &ok)) +
               digest(Geometry::facesToFaceVertices(*sample.mesh, mask, &ok)) +
               digest(Geometry::facesToPoints(*sample.mesh, mask, &ok)) +
               digest(Geometry::pointsToFaceVertices(*sample.mesh, mask, &ok)) +
               digest(Geometry::strandsToPoints(*sample.strands, mask, &ok));
    }

    std::string tags(Sample const& sample)
    {
        Geometry::TagResolver resolver;
        if (!resolver.parses("(a + f(b)) - !c ^ p(*)"))
            return "";
        Nexil::String component;
        auto const mask = resolver.resolve(*sample.mesh, component);
        MaskPtr data;
        if (!mask || !Geometry::getTagData(*sample.mesh, "b", data, component))
            return "";
        auto flags = *data;
        Geometry::unionTagData(*mask, flags);
        Geometry::intersectTagData(*mask, flags);
        Geometry::subtractTagData(*data, flags);
        Geometry::negateTagData(flags);
        bool ok = false;
        std::ostringstream dumped;
        VLD::Utils::Internal::parseTagExpression("a + b ^ f(c)")->dump(dumped);
        if (!dumped)
            return "";
        return digest(mask) + digest(flags) + Geometry::createTagName("face_component", "x").c_str() + dumped.str() +
               digest(Geometry::convertTagData(*sample.mesh, data, component, "point_component",
                                               Geometry::TagConversionStyle::AnyElement, &ok));
    }

    std::string volumeAndObject(Sample const& sample)
    {
        std::string result;
        for (auto const& object : {sample.smallVolume, sample.wideVolume}) {
            auto const shared = Geometry::shallow_copy_object_to_vld_volume(*object);
            if (!shared || !Geometry::validUpdatedVolume(*shared))
                return "";
            VLD::Object volume = *shared;
            auto const made = wholly([&] { return volume.componentCount(); },
                                     [&] { return Geometry::move_vld_volume_to_object(volume); });
            Object copy = *object;
            auto const back =
                wholly([&] { return copy.size(); }, [&] { return Geometry::move_object_to_vld_volume(copy); });
            result += (made ? text(made->keys()) : "null") + (back ? text(back->componentRange()) : "null");
            result += Geometry::move_object_to_vld_volume_const(copy) ? "again" : "null";
            Math::bbox<Math::float3, float> box;
            GeometryAlgorithms::getVolumeBounds(*object, box);
            result += std::to_string(box.min.x);
        }
        return result;
    }

    std::string volumesMade(Sample const&)
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
        auto const indices = arrayIn<unsigned int>(*made, "voxel_tile_tree", "indices");
        return text(proxies->keys()) + text(made->keys()) + (indices ? digest(*indices) : "");
    }

    std::string proxies(Sample const& sample)
    {
        std::string result;
        for (auto const& volume : {sample.smallVolume, sample.wideVolume}) {
            auto const topology = Geometry::getVldTopologyFromProxy(part(*volume, "voxel_component"));
            auto const container = Geometry::getVldContainerFromProxy(part(*volume, "voxel_tile_tree"));
            auto const channel = Geometry::getVldChannelFromProxy(part(*volume, "voxel_signed_distance"));
            result += (topology->name() + container->name() + channel->name()).view();
            for (auto const& name : volume->keys()) {
                auto const proxy = part(*volume, name.c_str());
                Nexil::Ptr<Object> copy = proxy;
                Nexil::MutablePtr<Object> own(std::move(copy));
                for (auto const& key : proxy->keys()) {
                    result += std::to_string(proxy->propertyInfo(key).arraySize);
                    result += own->setPropertyAny(key, proxy->getProperty(key)) ? 's' : '-';
                    result += own->extractProperty(key).empty() ? '-' : 'x';
                }
                own->eraseAllProperties();
                result += std::to_string(own->size());
            }
        }
        return result;
    }

    std::string accessors(Sample const& sample)
    {
        using namespace Geometry;
        auto const& mesh = *sample.mesh;
        std::string result;
        for (auto const& key : mesh.keys()) {
            for (bool const answer :
                 {!!getDataGeoProperty(mesh, key), !!getRangeGeoPropIndices(mesh, key),
                  !!getRangeGeoProperty(mesh, key), !!getGeoPropTarget(mesh, *part(mesh, key.c_str()))})
                result += answer ? '+' : '-';
            for (auto const& name :
                 {getTargetComponent(mesh, key), getGeoPropTargetName(mesh, key), getGeoPropRangeName(key),
                  getUniqueGeoPropName(key, mesh), Veldrin::mapGeoPropertyName(key, mesh, *sample.smallVolume),
                  Veldrin::mapGeoPropertyNameToVLDVolume(key, mesh),
                  Veldrin::mapGeoPropertyNameFromVLDVolume(key, *sample.smallVolume)})
                result += name.view();
            result += text(getTargetChain(mesh, key)) + text(getGeoPropNamesByTarget(mesh, key)) +
                      std::to_string(getGeoPropsByTarget(mesh, key).size());
        }
        for (auto const& type : *getGeometryTypes())
            result += Object::isA(mesh, *type) ? '+' : '-';
        auto const component = getComponentGeoPropPrototype();
        return result + std::to_string(getGeoPropsByPrototype(mesh, *component).size()) +
               text(getGeoPropNamesByPrototype(mesh, *component)) + text(getGeoPropsByName(mesh, "*o*"));
    }

    std::string population(Sample const& sample)
    {
        using namespace Geometry;
        std::string result;
        auto copy = sample.mesh;
        Nexil::MutablePtr<Object> own(std::move(copy));
        auto const change = [&](auto const& populate) {
            wholly([&] { return dump(*own); }, [&] { populate(*own); });
            result += text(own->keys());
        };
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
        return result + text(taggedMesh()->keys()) + text(someStrands()->keys());
    }

    std::string dumps(Sample const& sample)
    {
        return dump(*sample.mesh) + dump(*sample.smallVolume, 2);
    }

    Objects allOf(Sample const& sample)
    {
        Objects objects;
        for (auto const& object : {sample.mesh, sample.strands, sample.smallVolume, sample.wideVolume, sample.mesh})
            objects.push_back(object);
        return objects;
    }

    template <class Serialized>
    std::string save(Serialized const& objects, int level)
    {
        std::ostringstream stream;
        Nexil::OutputStream output(stream);
        IO::SerializationOptions options;
        options.compressionLevel = level;
        return IO::serialize(objects, output, options, nullptr) ? "written" : "";
    }

    std::string saveHandles(Sample const& sample)
    {
        auto objects = allOf(sample);
        Nexil::Array<Nexil::Ptr<Object>*> handles;
        for (auto& object : objects)
            handles.push_back(&object);
        return save(handles, 9);
    }

    std::string saveFile(Sample const& sample)
    {
        // Others may be writing theirs.
        auto const name = sample.path + "." + std::to_string(std::hash<std::thread::id>()(std::this_thread::get_id()));
        bool const isWritten = IO::serialize(allOf(sample), Nexil::String(std::string_view(name)), {}, nullptr);
        auto const size = fileBytes(name).size();
        std::remove(name.c_str());
        return isWritten ? std::to_string(size) : "";
    }

    std::string load(std::string const& bytes, Sample const& sample)
    {
        IO::InputMemoryBuf buffer(bytes.data(), bytes.size());
        std::istream stream(&buffer);
        Nexil::InputStream input(stream);
        Objects objects{sample.mesh};
        bool const isRead =
            wholly([&] { return objects.size(); }, [&] { return IO::deserialize(input, objects, {}, nullptr); });
        expect(isRead || objects.size() == 1);
        return isRead ? std::to_string(objects.size()) : "";
    }

    template <char version>
    std::string loadCorpus(Sample const& sample)
    {
        static std::string const bytes =
            fileBytes(std::string(VELDRIN_TEST_CORPUS "/streams/valid/v") + version + ".zon");
        return load(bytes, sample);
    }

    std::string loadFile(Sample const& sample)
    {
        Nexil::String const path(std::string_view(sample.path));
        Objects objects;
        auto const header = createObject();
        IO::StreamLayout layout;
        bool const isHeaderRead =
            wholly([&] { return header->size(); }, [&] { return IO::deserializeHeader(path, *header, nullptr); });
        if (!isHeaderRead || !IO::deserialize(path, objects, {}, nullptr) || !IO::inspectStream(path, layout, nullptr))
            return "";
        return std::to_string(objects.size()) + text(header->keys()) + std::to_string(layout.entries.size());
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
