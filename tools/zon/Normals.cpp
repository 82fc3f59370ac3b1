#include "Command.h"
#include "Console.h"
#include "GeoValues.h"
#include "JsonReport.h"
#include "Working.h"
#include "ZonFile.h"

#include <veldrin/algorithms/MeshNormals.h>
#include <veldrin/algorithms/NormalsTopology.h>
#include <veldrin/geometry/GeoProperties.h>
#include <veldrin/geometry/Population.h>
#include <veldrin/geometry/Prototypes.h>

#include <CLI/CLI.hpp>
#include <fmt/format.h>

#include <memory>
#include <numbers>
#include <optional>
#include <vector>

namespace Zon {

namespace {

    using namespace Veldrin;
    using Normals = Nexil::Array<Math::float3>;

    struct Options {
        std::string input;
        std::string output;
        bool isPerPoint = false;
        bool isPerFace = false;
        bool isPerFaceVertex = false;
        bool isAngleWeighted = false;
        bool isAreaWeighted = false;
        double creaseDegrees = 30;
        bool wantsJson = false;
    };

    /// What was stored on an object.
    struct Stored {
        std::size_t object = 0;
        char const* property = "";
        std::uint64_t normalCount = 0;
        std::uint64_t elementCount = 0;
    };

    /// A mesh in which each group of face-vertices is a point of its own, at the position of the point that it belongs to.
    Nexil::Ptr<Object> splitPoints(Object const& mesh, Nexil::Array<unsigned int> const& groups,
                                   unsigned int groupCount)
    {
        auto const& corners = *dataOf<unsigned int>(mesh, Geometry::sFaceVertex);
        auto const& positions = *dataOf<Math::float3>(mesh, Geometry::sPointPosition);
        Normals groupPositions;
        groupPositions.resize(groupCount);
        for (std::uint64_t i = 0; i < groups.size(); ++i)
            if (groups[i] < groupCount)
                groupPositions[groups[i]] = positions[corners[i]];
        auto split = createObject();
        if (!Geometry::populateMesh(Nexil::makePtr<Normals>(std::move(groupPositions)),
                                    Nexil::makePtr<Nexil::Array<unsigned int>>(groups),
                                    dataOf<unsigned int>(mesh, Geometry::sFaceOffset), *split))
            return nullptr;
        return Nexil::Ptr<Object>(std::move(split));
    }

    /// One normal for each group of corners that no crease parts; nothing where the topology is broken.
    std::optional<CornerValues<Math::float3>> creasedNormals(Object const& mesh, Options const& options)
    {
        auto const radians = static_cast<float>(options.creaseDegrees * std::numbers::pi / 180);
        CornerValues<Math::float3> corners;
        unsigned int groupCount = Geometry::kInvalidIndex;
        GeometryAlgorithms::computeMeshNormalsTopology(mesh, {}, radians, corners.indices, groupCount, nullptr);
        if (groupCount == Geometry::kInvalidIndex)
            return std::nullopt;
        auto const split = splitPoints(mesh, corners.indices, groupCount);
        if (!split)
            return std::nullopt;
        GeometryAlgorithms::computeMeshVertexNormals(*split, options.isAngleWeighted, options.isAreaWeighted,
                                                     corners.values);
        return corners;
    }

    /// Stores the normals that were asked for in the mesh; false, and nothing stored, where the topology is broken.
    bool storeNormals(Options const& options, Object& mesh, Stored& stored)
    {
        if (options.isPerFaceVertex) {
            auto corners = creasedNormals(mesh, options);
            if (!corners)
                return false;
            stored.property = Geometry::sFaceVertexNormal;
            stored.normalCount = corners->values.size();
            stored.elementCount = corners->indices.size();
            storeCornerValues(stored.property, std::move(*corners), mesh);
            return true;
        }
        char const* const component = options.isPerFace ? Geometry::sFaceComp : Geometry::sPointComp;
        stored.property = options.isPerFace ? Geometry::sFaceNormal : Geometry::sPointNormal;
        stored.elementCount = Geometry::getElementCount(mesh, component);
        Normals normals;
        if (options.isPerFace)
            GeometryAlgorithms::computeMeshFaceNormals(mesh, normals);
        else
            GeometryAlgorithms::computeMeshVertexNormals(mesh, options.isAngleWeighted, options.isAreaWeighted,
                                                         normals);
        stored.normalCount = normals.size();
        if (stored.normalCount != stored.elementCount)
            return false;
        storeElementValues(stored.property, component, std::move(normals), mesh);
        return true;
    }

    void print(Stored const& stored)
    {
        if (std::string_view(stored.property) == Geometry::sFaceVertexNormal)
            fmt::print(
                "object {}: {}: {} for {}\n", stored.object, stored.property, counted(stored.normalCount, "normal"),
                stored.elementCount == 1 ? "1 face-vertex" : fmt::format("{} face-vertices", stored.elementCount));
        else
            fmt::print("object {}: {}: {}\n", stored.object, stored.property, counted(stored.normalCount, "normal"));
    }

    ExitCode runNormals(Options const& options)
    {
        std::vector<Stored> all;
        std::vector<std::string> warnings;
        {
            Working const working("normals");
            auto objects = readZon(options.input);
            editEach(objects, [&](std::size_t number, Nexil::Ptr<Object>& object) {
                if (!Object::isA(*object, *Geometry::getMeshPrototype())) {
                    warnings.push_back(fmt::format("object {}: is no mesh", number));
                    return;
                }
                Nexil::MutablePtr<Object> own(std::move(object));
                Stored stored{number};
                if (storeNormals(options, *own, stored))
                    all.push_back(stored);
                else
                    warnings.push_back(fmt::format("object {}: positions or topology are broken", number));
                object = std::move(own);
            });
            if (!all.empty())
                rewriteZon(objects, options.input, options.output);
        }
        for (auto const& warning : warnings)
            warn(warning);
        Json list = Json::array();
        for (auto const& stored : all) {
            if (!options.wantsJson)
                print(stored);
            list.push_back({{"object", stored.object},
                            {"property", stored.property},
                            {"normals", stored.normalCount},
                            {"elements", stored.elementCount}});
        }
        if (options.wantsJson)
            printReport(Json{{"file", options.input}, {"stored", list}});
        return all.empty() ? kFindings : kDone;
    }

} // namespace

void addNormals(CLI::App& app, Run& run)
{
    auto const options = std::make_shared<Options>();
    auto* const command = app.add_subcommand("normals", "Computes the normals of meshes and stores them");
    command->add_option("file", options->input, "zon file")->required();
    auto* const perPoint =
        command->add_flag("--point", options->isPerPoint, "One normal per point: \"point_normal\" (the default)");
    auto* const perFace =
        command->add_flag("--face", options->isPerFace, "One normal per face: \"face_normal\"")->excludes(perPoint);
    command
        ->add_flag("--face-vertex", options->isPerFaceVertex,
                   "Normals for corners, parted at creases: an indexed \"face_vertex_normal\"")
        ->excludes(perPoint)
        ->excludes(perFace);
    command->add_flag("--angle", options->isAngleWeighted, "Weight faces by their angle at the point")
        ->excludes(perFace);
    command->add_flag("--area", options->isAreaWeighted, "Weight faces by their area")->excludes(perFace);
    auto* const crease =
        command->add_option("--crease", options->creaseDegrees, "Angle between faces, in degrees, that makes a crease")
            ->check([](std::string const& text) {
                double degrees = -1;
                // "nan" is a number to the parser and compares with nothing.
                return CLI::detail::lexical_cast(text, degrees) && degrees >= 0 && degrees <= 180
                           ? ""
                           : text + " is no angle from 0 to 180";
            })
            ->capture_default_str()
            ->excludes(perPoint)
            ->excludes(perFace);
    command->add_option("-o,--output", options->output, "zon file to write instead of changing the one read");
    command->add_flag("--json", options->wantsJson, "Report as JSON on stdout");
    command->callback([options, crease, &run] {
        options->isPerFaceVertex = options->isPerFaceVertex || crease->count() > 0;
        run = [options] { return runNormals(*options); };
    });
}

} // namespace Zon
