#include "Operations.h"

#include "../validation/Edits.h"
#include "../volume/Samples.h"

#include <support/Streams.h>

#include <veldrin/veldrin.h>

#include <sstream>
#include <stdexcept>

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

    /// An array that held something before, as callers' arrays do.
    template <class T>
    class Output {
    public:
        Output() { values_.resize(3); }
        Nexil::Array<T>& operator*() noexcept { return values_; }
        [[nodiscard]] bool isAsBeforeOrEmpty() const noexcept { return values_.empty() || values_.size() == 3; }

    private:
        Nexil::Array<T> values_;
    };

    /// Runs compute(), which answers whether the outputs were filled, and gives their digests.
    template <class Compute, class... T>
    std::string fill(Compute const& compute, Output<T>&... outputs)
    {
        try {
            if (!compute())
                return "";
        } catch (...) {
            if (!(outputs.isAsBeforeOrEmpty() && ...))
                throw std::logic_error("an output was left half changed");
            throw;
        }
        return (digest(*outputs) + ...);
    }

    std::string validate(Sample const& sample)
    {
        std::string result;
        auto const judge = [&](auto validator, Object const& object) {
            result += validator.validate(object).message.view();
            for (auto const& failure : validator.findFailures(object))
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
        for (int kind = 0; kind < 5; ++kind) {
            Output<Math::float3> output;
            result += fill(
                [&] {
                    if (kind == 4)
                        GeometryAlgorithms::computeMeshFaceNormals(*sample.mesh, *output);
                    else
                        GeometryAlgorithms::computeMeshVertexNormals(*sample.mesh, kind & 1, kind & 2, *output);
                    return true;
                },
                output);
        }
        return result;
    }

    std::string normalsTopology(Sample const& sample)
    {
        Output<unsigned int> groups;
        unsigned int count = 0;
        return fill(
            [&] {
                GeometryAlgorithms::computeMeshNormalsTopology(*sample.mesh, {}, 0.5f, *groups, count, nullptr);
                return true;
            },
            groups);
    }

    std::string adjacency(Sample const& sample)
    {
        Output<FaceEdge> edges;
        Output<FaceEdge> pointFaces;
        Output<unsigned int> offsets;
        return fill(
            [&] {
                return GeometryAlgorithms::buildFaceVertexAdjacency(*sample.mesh, *edges, *pointFaces, *offsets,
                                                                    nullptr);
            },
            edges, pointFaces, offsets);
    }

    std::string edges(Sample const& sample)
    {
        Geometry::Mesh::HalfEdgeDataStructure const table(*sample.mesh);
        unsigned int uses = table.findEdge(0, 1).faceCount;
        table.forEachEdge(0, table.pointCount(), [&](auto const& edge) { uses += edge.faceCount; });
        return std::to_string(uses) + " " + std::to_string(Geometry::Mesh::eulerCharacteristic(*sample.mesh, table));
    }

    std::string invariants(Sample const& sample)
    {
        auto const betti = Geometry::Mesh::bettiNumbers(*sample.mesh);
        return std::to_string(Geometry::Mesh::eulerCharacteristic(*sample.mesh)) +
               std::to_string(Geometry::Mesh::connectedComponents(*sample.mesh)) +
               std::to_string(betti.x + 10 * betti.z);
    }

    std::string diagnosis(Sample const& sample)
    {
        return Geometry::Mesh::diagnose(*sample.mesh) == Geometry::Mesh::Diagnostic{} ? "clean" : "faulty";
    }

    std::string strandMeasures(Sample const& sample)
    {
        Output<Math::float3> tangents;
        Output<float> lengths;
        Output<float> segments;
        Output<float> ratios;
        return fill([&] { return GeometryAlgorithms::computeStrandTangents(*sample.strands, *tangents, nullptr); },
                    tangents) +
               fill(
                   [&] {
                       return GeometryAlgorithms::computeStrandLength(*sample.strands, *lengths, *segments, nullptr);
                   },
                   lengths, segments) +
               fill([&] { return GeometryAlgorithms::computeStrandRatio(*sample.strands, *ratios, nullptr); }, ratios);
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
                volume = Geometry::move_object_to_vld_volume_const(copy);
            } catch (...) {
                if (copy.size() != count)
                    throw std::logic_error("an object was left half moved");
                throw;
            }
            result += volume ? text(volume->componentRange()) : "null";
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
        Geometry::vldProxyFactory(*description, *proxies);
        auto const built = sphereVolume<VLD::TileTree3D::SmallTiles>(2);
        addPoints<VLD::TileTree3D::WideTiles>(*built);
        return text(proxies->keys()) + text(built->componentRange());
    }

    std::string accessors(Sample const& sample)
    {
        std::string result;
        for (auto const& key : sample.mesh->keys()) {
            result += text(Geometry::getTargetChain(*sample.mesh, key));
            result += Geometry::getTargetComponent(*sample.mesh, key).view();
            result += Geometry::getDataGeoProperty(*sample.mesh, key) ? 'd' : '-';
            result += Geometry::getRangeGeoPropIndices(*sample.mesh, key) ? 'r' : '-';
            result += text(Geometry::getGeoPropNamesByTarget(*sample.mesh, key));
            result += Geometry::getUniqueGeoPropName(key, *sample.mesh).view();
            result += Veldrin::mapGeoPropertyName(key, *sample.mesh, *sample.smallVolume).view();
        }
        return result + text(Geometry::getGeoPropsByName(*sample.mesh, "*o*")) +
               text(Geometry::getGeoPropNamesByPrototype(*sample.mesh, *Geometry::getComponentGeoPropPrototype()));
    }

    std::string population(Sample const& sample)
    {
        std::string result;
        for (auto const& populate : {&Geometry::populateVolume, &Geometry::populateLevelSet,
                                     &Geometry::populateFogVolume, &Geometry::populateInstances})
            result += text(filled(*populate)->keys());
        auto copy = sample.mesh;
        Nexil::MutablePtr<Object> own(std::move(copy));
        auto const before = own->size();
        Geometry::populatePlaneMesh(1, 2, *own);
        Geometry::populateSphereMesh(1, *own);
        if (!Geometry::setElementCount("point_component", 5, *own) ||
            !Geometry::setRangeGeoPropIndices("corner_index", array<unsigned int>({0}), *own))
            return "";
        return result + std::to_string(before) + text(own->keys());
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

    std::string load(Sample const& sample)
    {
        IO::InputMemoryBuf buffer(sample.stream.data(), sample.stream.size());
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
        return isRead ? std::to_string(objects.size()) + text(objects[objects.size() - 1]->keys()) : "";
    }

    std::string loadFile(Sample const& sample)
    {
        Nexil::String const path(std::string_view(sample.path));
        Objects objects;
        auto const header = createObject();
        IO::StreamLayout layout;
        if (!IO::deserialize(path, objects, {}, nullptr) || !IO::deserializeHeader(path, *header, nullptr) ||
            !IO::inspectStream(path, layout, nullptr))
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
        {"validate", validate},
        {"normals", normals},
        {"normals topology", normalsTopology},
        {"adjacency", adjacency},
        {"edges", edges},
        {"invariants", invariants},
        {"diagnosis", diagnosis},
        {"strand measures", strandMeasures},
        {"conversions", conversions},
        {"tags", tags},
        {"volume to object", volumeToObject},
        {"object to volume", objectToVolume},
        {"volume bounds", volumeBounds},
        {"volumes made", volumesMade},
        {"accessors", accessors},
        {"population", population},
        {"dumps", dumps},
        {"save at level 0", save<0>},
        {"save at level 9", save<9>},
        {"load", load},
        {"load of a file", loadFile},
    };
    return all;
}

} // namespace support
