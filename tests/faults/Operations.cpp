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
        std::uint64_t hash = 1469598103934665603u + values.size();
        auto const* const bytes = reinterpret_cast<unsigned char const*>(values.data());
        for (std::size_t i = 0; i < values.size() * sizeof(T); ++i)
            hash = (hash ^ bytes[i]) * 1099511628211u;
        return std::to_string(hash) + " ";
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

    /// Runs compute(arrays of T...), which answers whether they were filled, on arrays that held something before, as
    /// callers' arrays do, and gives their digests.
    template <class... T, class Compute>
    std::string fill(Compute const& compute)
    {
        auto const run = [&](auto&... outputs) {
            (outputs.resize(3), ...);
            try {
                if (!compute(outputs...))
                    return std::string();
            } catch (...) {
                if (!((outputs.empty() || outputs.size() == 3) && ...))
                    throw std::logic_error("an output was left half changed");
                throw;
            }
            return (digest(outputs) + ...);
        };
        std::tuple<Nexil::Array<T>...> outputs;
        return std::apply(run, outputs);
    }

    /// Runs change(object), which either does all of it or, when memory runs out, nothing.
    template <class Change>
    void changeWhole(Object& object, Change const& change)
    {
        auto const before = dump(object);
        try {
            change(object);
        } catch (...) {
            if (dump(object) != before)
                throw std::logic_error("an object was left half changed");
            throw;
        }
    }

    void expect(bool agrees)
    {
        if (!agrees)
            throw std::logic_error("two answers contradict each other");
    }

    std::string validate(Sample const& sample)
    {
        std::string result;
        auto const judge = [&](auto validator, Object const& object) {
            auto const message = validator.validate(object).message;
            result += message.view();
            auto const failures = validator.findFailures(object);
            expect(failures.empty() ? message.empty() : failures[0].status.message == message);
            for (auto const& failure : failures)
                result += failure.status.message.view();
            result += ".";
        };
        judge(Geometry::MeshValidator(), *sample.mesh);
        judge(Geometry::PointCloudValidator(), *sample.mesh);
        judge(Geometry::StrandValidator(), *sample.strands);
        judge(Geometry::StrandValidator(), *sample.mesh);
        judge(Geometry::VolumeValidator(), *sample.smallVolume);
        judge(Geometry::VolumeValidator(), *sample.wideVolume);
        judge(Geometry::GeoValidator(), *sample.smallVolume);
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

    std::string normalsTopology(Sample const& sample)
    {
        return fill<unsigned int>([&](auto& groups) {
            unsigned int count = 0;
            GeometryAlgorithms::computeMeshNormalsTopology(*sample.mesh, {}, 0.5f, groups, count, nullptr);
            for (unsigned int const group : groups)
                expect(group < count || group == kInvalidIndex || count == 0); // none: left as they were
            return true;
        });
    }

    std::string adjacency(Sample const& sample)
    {
        return fill<FaceEdge, FaceEdge, unsigned int>([&](auto&... outputs) {
            return GeometryAlgorithms::buildFaceVertexAdjacency(*sample.mesh, outputs..., nullptr);
        });
    }

    std::string edges(Sample const& sample)
    {
        Geometry::Mesh::HalfEdgeDataStructure const table(*sample.mesh);
        std::uint64_t edgeCount = 0;
        std::uint64_t uses = 0;
        table.forEachEdge(0, table.pointCount(), [&](auto const& edge) {
            ++edgeCount;
            uses += edge.faceCount;
            expect(table.findEdge(edge.upper, edge.lower).faceCount == edge.faceCount);
        });
        expect(edgeCount == table.edgeCount());
        int const euler = Geometry::Mesh::eulerCharacteristic(*sample.mesh, table);
        expect(euler == Geometry::Mesh::eulerCharacteristic(*sample.mesh));
        return std::to_string(uses) + " " + std::to_string(euler);
    }

    std::string invariants(Sample const& sample)
    {
        auto const betti = Geometry::Mesh::bettiNumbers(*sample.mesh);
        int const components = Geometry::Mesh::connectedComponents(*sample.mesh);
        expect(betti.x == components || components < 0);
        return std::to_string(components) + " " + std::to_string(betti.y) + " " + std::to_string(betti.z);
    }

    std::string diagnosis(Sample const& sample)
    {
        return Geometry::Mesh::diagnose(*sample.mesh) == Geometry::Mesh::Diagnostic{} ? "clean" : "faulty";
    }

    std::string strandMeasures(Sample const& sample)
    {
        auto const& strands = *sample.strands;
        return fill<Math::float3>([&](auto& tangents) {
                   return GeometryAlgorithms::computeStrandTangents(strands, tangents, nullptr);
               }) +
               fill<float, float>([&](auto&... lengths) {
                   return GeometryAlgorithms::computeStrandLength(strands, lengths..., nullptr);
               }) +
               fill<float>(
                   [&](auto& ratios) { return GeometryAlgorithms::computeStrandRatio(strands, ratios, nullptr); });
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

    std::string volumeToObject(Sample const& sample)
    {
        std::string result;
        for (auto const& object : {sample.smallVolume, sample.wideVolume}) {
            auto const shared = Geometry::shallow_copy_object_to_vld_volume(*object);
            if (!shared || !Geometry::validUpdatedVolume(*shared))
                return "";
            VLD::Object volume = *shared;
            Nexil::MutablePtr<Object> made;
            try {
                made = Geometry::move_vld_volume_to_object(volume);
            } catch (...) {
                if (volume.componentCount() != shared->componentCount())
                    throw std::logic_error("a volume was left half moved");
                throw;
            }
            result += made ? text(made->keys()) : "null";
        }
        return result;
    }

    std::string objectToVolume(Sample const& sample)
    {
        std::string result;
        for (auto const& object : {sample.smallVolume, sample.wideVolume}) {
            Object copy = *object;
            auto const count = copy.size();
            Nexil::Ptr<VLD::Object> volume;
            try {
                volume = Geometry::move_object_to_vld_volume(copy);
            } catch (...) {
                if (copy.size() != count)
                    throw std::logic_error("an object was left half moved");
                throw;
            }
            result += volume ? text(volume->componentRange()) : "null";
            result += Geometry::move_object_to_vld_volume_const(copy) ? "again" : "null";
        }
        return result;
    }

    std::string volumeBounds(Sample const& sample)
    {
        Math::bbox<Math::float3, float> box;
        GeometryAlgorithms::getVolumeBounds(*sample.smallVolume, box);
        GeometryAlgorithms::getVolumeBounds(*sample.wideVolume, box);
        return std::to_string(box.min.x) + " " + std::to_string(box.max.z);
    }

    std::string volumesMade(Sample const&)
    {
        auto const description = filled([](Object& o) {
            addComponent(o, "voxel_component", 0);
            addRange(o, "voxel_tile_tree", "voxel_component", {});
            addData(o, "voxel_fog_density", "voxel_tile_tree", {});
        });
        auto proxies = createObject();
        changeWhole(*proxies, [&](Object& o) { Geometry::vldProxyFactory(*description, o); });
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
                    auto value = proxy->getProperty(key);
                    result +=
                        std::to_string(proxy->propertyInfo(key).arraySize) + (proxy->hasProperty(key) ? "+" : "-");
                    result += own->setPropertyAny(key, std::move(value)) ? 's' : '-';
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
        std::string result;
        for (auto const& key : sample.mesh->keys()) {
            result += text(Geometry::getTargetChain(*sample.mesh, key));
            result += Geometry::getTargetComponent(*sample.mesh, key).view();
            result += Geometry::getDataGeoProperty(*sample.mesh, key) ? 'd' : '-';
            result += Geometry::getRangeGeoPropIndices(*sample.mesh, key) ? 'r' : '-';
            result += Geometry::getRangeGeoProperty(*sample.mesh, key) ? 'R' : '-';
            result += Geometry::getGeoPropTarget(*sample.mesh, *part(*sample.mesh, key.c_str())) ? 't' : '-';
            result += Geometry::getGeoPropTargetName(*sample.mesh, key).view();
            result += Geometry::getGeoPropRangeName(key).view();
            result += std::to_string(Geometry::getGeoPropsByTarget(*sample.mesh, key).size());
            result += text(Geometry::getGeoPropNamesByTarget(*sample.mesh, key));
            result += Geometry::getUniqueGeoPropName(key, *sample.mesh).view();
            result += Veldrin::mapGeoPropertyName(key, *sample.mesh, *sample.smallVolume).view();
            result += Veldrin::mapGeoPropertyNameToVLDVolume(key, *sample.mesh).view();
            result += Veldrin::mapGeoPropertyNameFromVLDVolume(key, *sample.smallVolume).view();
        }
        for (auto const& type : *Geometry::getGeometryTypes())
            result += Object::isA(*sample.mesh, *type) ? 'm' : '-';
        auto const components =
            Geometry::getGeoPropsByPrototype(*sample.mesh, *Geometry::getComponentGeoPropPrototype());
        return result + std::to_string(components.size()) + text(Geometry::getGeoPropsByName(*sample.mesh, "*o*")) +
               text(Geometry::getGeoPropNamesByPrototype(*sample.mesh, *Geometry::getComponentGeoPropPrototype()));
    }

    std::string population(Sample const& sample)
    {
        std::string result;
        auto copy = sample.mesh;
        Nexil::MutablePtr<Object> own(std::move(copy));
        auto const change = [&](auto const& populate) {
            changeWhole(*own, populate);
            result += text(own->keys());
        };
        change([](Object& o) { Geometry::populatePlaneMesh(1, 2, o); });
        change([](Object& o) { Geometry::populateSphereMesh(1, o); });
        change([](Object& o) { Geometry::populateCubeMesh(1, o); });
        change([](Object& o) { Geometry::populatePointCloud(array<Math::float3>({{}, {}}), o); });
        change([](Object& o) { (void)Geometry::setElementCount("point_component", 5, o); });
        change([](Object& o) { Geometry::setRangeGeoPropIndices("corner_index", array<unsigned int>({0}), o); });
        for (auto const& populate : {&Geometry::populateVolume, &Geometry::populateLevelSet,
                                     &Geometry::populateFogVolume, &Geometry::populateInstances})
            change(*populate);
        change([](Object& o) { Geometry::populateTag("point_component", array<bool>({true}), o); });
        change([](Object& o) { Geometry::populateRangeGeoProperty(array<unsigned int>({0}), "face_component", o); });
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

    std::string saveInto(std::ostream& stream, Sample const& sample, int level)
    {
        Nexil::OutputStream output(stream);
        IO::SerializationOptions options;
        options.compressionLevel = level;
        return IO::serialize(allOf(sample), output, options, nullptr) ? "written" : "";
    }

    template <int level>
    std::string save(Sample const& sample)
    {
        std::ostringstream stream;
        auto const result = saveInto(stream, sample, level);
        return result.empty() ? result : std::to_string(stream.str().size());
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

    std::string saveHandles(Sample const& sample)
    {
        auto objects = allOf(sample);
        Nexil::Array<Nexil::Ptr<Object>*> handles;
        for (auto& object : objects)
            handles.push_back(&object);
        std::ostringstream stream;
        Nexil::OutputStream output(stream);
        return IO::serialize(handles, output, {}, nullptr) ? "written" : "";
    }

    std::string load(std::string const& bytes, Sample const& sample)
    {
        IO::InputMemoryBuf buffer(bytes.data(), bytes.size());
        std::istream stream(&buffer);
        Nexil::InputStream input(stream);
        Objects objects;
        objects.push_back(sample.mesh);
        bool isRead = false;
        try {
            isRead = IO::deserialize(input, objects, {}, nullptr);
        } catch (...) {
            if (objects.size() != 1)
                throw std::logic_error("objects of a broken reading were left");
            throw;
        }
        if (!isRead && objects.size() != 1)
            throw std::logic_error("objects of a failed reading were left");
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
        bool isHeaderRead = false;
        changeWhole(*header, [&](Object& o) { isHeaderRead = IO::deserializeHeader(path, o, nullptr); });
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
        {"normals topology", normalsTopology, Takes::SmallCounts},
        {"adjacency", adjacency, Takes::SmallCounts},
        {"edges", edges, Takes::SmallCounts},
        {"invariants", invariants, Takes::SmallCounts},
        {"diagnosis", diagnosis, Takes::SmallCounts},
        {"strand measures", strandMeasures, Takes::SmallCounts},
        {"conversions", conversions, Takes::SmallCounts},
        {"tags", tags, Takes::SmallCounts},
        {"volume to object", volumeToObject, Takes::Volumes},
        {"object to volume", objectToVolume, Takes::Volumes},
        {"volume bounds", volumeBounds, Takes::Volumes},
        {"volumes made", volumesMade},
        {"proxies", proxies},
        {"accessors", accessors, Takes::Anything},
        {"population", population},
        {"dumps", dumps, Takes::Anything},
        {"save at level 0", save<0>},
        {"save at level 9", save<9>},
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
