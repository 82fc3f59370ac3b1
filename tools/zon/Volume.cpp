#include "Command.h"
#include "Console.h"
#include "GeoValues.h"
#include "JsonReport.h"
#include "ValueRows.h"
#include "VdbFile.h"
#include "VolumeParts.h"
#include "Working.h"
#include "ZonFile.h"

#include <veldrin/algorithms/MeshInvariants.h>
#include <veldrin/geometry/Prototypes.h>
#include <veldrin/math/BBox.h>
#include <veldrin/volume/VolumeBounds.h>
#include <vld/BuildFromPoints.h>
#include <vld/PointTopology.h>

#include <CLI/CLI.hpp>
#include <fmt/format.h>

#include <algorithm>
#include <cmath>
#include <memory>
#include <set>

namespace Zon {

namespace {

    using namespace Veldrin;
    using namespace VLD::TileTree3D;
    using Box = Math::bbox<Math::float3, float>;

    struct ReportOptions {
        std::string input;
        bool wantsJson = false;
    };

    struct MakeOptions {
        std::string input;
        std::string output;
        int level = 9;
        float voxelSize = 0;
        float radius = 0;
        float halfBand = 3;
    };

    // ------------------------------------------------------------------------------------------------- reports

    /// What the channels of a container or of points hold.
    template <class Owner>
    Json describeValues(VLD::Object const& volume, Owner const& owner)
    {
        Json channels = Json::array();
        std::uint64_t channelBytes = 0;
        for (auto const& channel : channelsOf(volume, owner)) {
            auto const bytes = decodedBytes(channel->data());
            channelBytes += bytes;
            channels.push_back({{"name", channel->name().view()},
                                {"type", typeName(channel->defaultValue())},
                                {"elements", channel->elementCount()},
                                {"bytes", bytes}});
        }
        return {{"channel_bytes", channelBytes}, {"channels", channels}};
    }

    template <class Traits>
    Json describeTiles(VoxelTopology<Traits> const& topology)
    {
        auto const parameters = Traits::parameters();
        return {{"name", topology.name().view()},
                {"tile_width", parameters.tileWidth},
                {"data_width", parameters.dataWidth},
                {"leaf_tiles", topology.leafCount()},
                {"inner_tiles", topology.innerCount()},
                {"voxels", topology.voxelCount()},
                {"elements", topology.elementCount()},
                {"tile_bytes", topology.byteSize()}};
    }

    template <class Traits>
    Json describe(VoxelTopology<Traits> const& topology)
    {
        Json json = describeTiles(topology);
        json["consistent"] = topology.isConsistent(false);
        return json;
    }

    template <class Traits>
    Json describe(VLD::Object const& volume, Container<Traits> const& container)
    {
        // The container's check looks at its tiles as well.
        Json json = describeTiles(*container.topology());
        json.update({{"name", container.name().view()},
                     {"topology", container.topologyName().view()},
                     {"voxel_size", container.voxelSize()},
                     {"consistent", container.checkConsistency(false)}});
        json.update(describeValues(volume, container));
        return json;
    }

    template <class Traits>
    Json describe(VLD::Object const& volume, PointTopology<Traits> const& points)
    {
        auto const bytes = points.leafOrigins().size() * sizeof(Coordinate) + points.offsets().size() * sizeof(int);
        Json json = {{"name", points.name().view()},
                     {"data_width", Traits::parameters().dataWidth},
                     {"leaf_tiles", points.leafOrigins().size()},
                     {"points", points.elementCount()},
                     {"tile_bytes", bytes},
                     {"consistent", points.isConsistent()}};
        json.update(describeValues(volume, points));
        return json;
    }

    /// A volume by its parts: containers, topologies that no container is over, and points.
    Json describe(Nexil::Ptr<Object> const& object)
    {
        Json containers = Json::array(), topologies = Json::array(), points = Json::array();
        auto const volume = object ? Geometry::shallow_copy_object_to_vld_volume(*object) : nullptr;
        if (volume) {
            std::set<void const*> used;
            forEachContainer(*volume, [&](auto const& container) {
                containers.push_back(describe(*volume, container));
                used.insert(container.topology().get());
            });
            forEachOf<VoxelTopology>(*volume, [&](auto const& topology) {
                if (!used.contains(&topology))
                    topologies.push_back(describe(topology));
            });
            forEachOf<PointTopology>(*volume, [&](auto const& each) { points.push_back(describe(*volume, each)); });
        }
        return {{"is_volume", volume && !volume->empty()},
                {"containers", containers},
                {"topologies", topologies},
                {"points", points}};
    }

    std::string textIn(Json const& part, char const* key)
    {
        return printable(part[key].get<std::string>());
    }

    std::string countedIn(Json const& part, char const* key, char const* noun)
    {
        return counted(part[key].get<std::uint64_t>(), noun);
    }

    /// The lines below the title of a part of a volume.
    void printTiles(Json const& part, std::string const& tiles)
    {
        fmt::print("        {}, {}\n        {} for tiles", tiles,
                   part["consistent"].get<bool>() ? "consistent" : "NOT consistent",
                   byteText(part["tile_bytes"].get<std::uint64_t>()));
        if (part.contains("channels"))
            fmt::print(", {} for values", byteText(part["channel_bytes"].get<std::uint64_t>()));
        fmt::print("\n");
        for (auto const& channel : part.value("channels", Json::array()))
            fmt::print("        channel {}: {}, {}\n", textIn(channel, "name"), channel["type"].get<std::string>(),
                       countedIn(channel, "elements", "element"));
    }

    void printVoxels(Json const& part, std::string const& over)
    {
        fmt::print("    {}{}\n", textIn(part, "name"), over);
        printTiles(part, fmt::format("{} with {} in all, {}", countedIn(part, "leaf_tiles", "leaf tile"),
                                     countedIn(part, "voxels", "voxel"), countedIn(part, "inner_tiles", "inner tile")));
    }

    void print(Json const& object)
    {
        auto const widths = [](Json const& part) {
            return fmt::format("tiles of {} x {} voxels along each axis", part["tile_width"].get<unsigned int>(),
                               part["data_width"].get<unsigned int>());
        };
        for (auto const& container : object["containers"])
            printVoxels(container, fmt::format(" over {}: {}, voxel size {}", textIn(container, "topology"),
                                               widths(container), container["voxel_size"].get<float>()));
        for (auto const& topology : object["topologies"])
            printVoxels(topology, " without a container: " + widths(topology));
        for (auto const& points : object["points"]) {
            fmt::print("    {}: points in tiles of {} voxels along each axis\n", textIn(points, "name"),
                       points["data_width"].get<unsigned int>());
            printTiles(points, fmt::format("{} with {} in all", countedIn(points, "leaf_tiles", "leaf tile"),
                                           countedIn(points, "points", "point")));
        }
    }

    ExitCode runInfo(ReportOptions const& options)
    {
        auto const objects = readZon(options.input);
        Json list = Json::array();
        for (auto const& object : objects)
            list.push_back(describe(object));
        if (options.wantsJson) {
            Json const json{{"file", options.input}, {"objects", list}};
            printReport(json);
            return kDone;
        }
        for (std::size_t i = 0; i < list.size(); ++i) {
            fmt::print("object {}: {}\n", i, list[i]["is_volume"].get<bool>() ? "volume" : "no volume");
            print(list[i]);
        }
        return kDone;
    }

    /// The box around the content of a volume, or around the points of anything else.
    Box boundsOf(Object const& object)
    {
        Box box;
        GeometryAlgorithms::getVolumeBounds(object, box);
        if (box.isEmpty())
            if (auto const points = dataOf<Math::float3>(object, Geometry::sPointPosition))
                for (auto const& point : *points)
                    box.extend(point);
        return box;
    }

    ExitCode runBounds(ReportOptions const& options)
    {
        auto const objects = readZon(options.input);
        Json list = Json::array();
        for (std::uint64_t i = 0; i < objects.size(); ++i) {
            Box const box = objects[i] ? boundsOf(*objects[i]) : Box();
            if (options.wantsJson) {
                auto const corner = [](Math::float3 const& c) { return Json{c.x, c.y, c.z}; };
                list.push_back(box.isEmpty() ? Json{{"min", nullptr}, {"max", nullptr}}
                                             : Json{{"min", corner(box.min)}, {"max", corner(box.max)}});
            } else if (box.isEmpty()) {
                fmt::print("object {}: no signed distance, fog density or points in it\n", i);
            } else {
                auto const size = box.max - box.min;
                fmt::print("object {}: {} {} {} to {} {} {}, size {} {} {}\n", i, box.min.x, box.min.y, box.min.z,
                           box.max.x, box.max.y, box.max.z, size.x, size.y, size.z);
            }
        }
        if (options.wantsJson) {
            Json const json{{"file", options.input}, {"objects", list}};
            printReport(json);
        }
        return kDone;
    }

    // ------------------------------------------------------------------------------------------------- makers

    /// The faces of a mesh as fans of triangles; throws Failure for what is no mesh of sound indices.
    Nexil::Array<unsigned int> trianglesOf(Object const& mesh, std::string const& place)
    {
        auto const corners = dataOf<unsigned int>(mesh, Geometry::sFaceVertex);
        auto const offsets = dataOf<unsigned int>(mesh, Geometry::sFaceOffset);
        auto const positions = dataOf<Math::float3>(mesh, Geometry::sPointPosition);
        if (!corners || !offsets || !positions || offsets->size() < 2)
            throw Failure(place + "there is no mesh with faces");
        Nexil::Array<unsigned int> triangles;
        triangles.reserve(corners->size() * 3);
        for (std::uint64_t face = 0; face + 1 < offsets->size(); ++face) {
            if ((*offsets)[face] > (*offsets)[face + 1] || (*offsets)[face + 1] > corners->size())
                throw Failure(place + "the corners of its faces do not fit together");
            for (std::uint64_t i = (*offsets)[face] + 2ull; i < (*offsets)[face + 1]; ++i)
                for (std::uint64_t const corner : {std::uint64_t((*offsets)[face]), i - 1, i}) {
                    if ((*corners)[corner] >= positions->size())
                        throw Failure(place + "a face has a corner at no point");
                    triangles.push_back((*corners)[corner]);
                }
        }
        for (auto const& p : *positions)
            if (!std::isfinite(p.x) || !std::isfinite(p.y) || !std::isfinite(p.z))
                throw Failure(place + "a position is no finite number");
        return triangles;
    }

    Nexil::Ptr<Object> fromMesh(Object const& mesh, std::string const& place, MakeOptions const& options)
    {
        auto const triangles = trianglesOf(mesh, place);
        std::uint64_t openEdges = 0;
        Geometry::Mesh::HalfEdgeDataStructure const edges(mesh);
        edges.forEachEdge(0, edges.pointCount(), [&](Geometry::Mesh::HalfEdgeDataStructure::Edge const& edge) {
            openEdges += edge.isBoundary() ? 1 : 0;
        });
        if (openEdges != 0)
            warn(fmt::format("{}its surface is not closed: {}; where a hole is wider than a voxel there is no inside",
                             place, counted(openEdges, "boundary edge")));
        try {
            return levelSetOfMesh(*dataOf<Math::float3>(mesh, Geometry::sPointPosition), triangles, options.voxelSize,
                                  options.halfBand);
        } catch (Failure const& failure) {
            throw Failure(place + failure.what());
        }
    }

    Nexil::Ptr<Object> fromPoints(Object const& cloud, std::string const& place, MakeOptions const& options)
    {
        auto const positions = dataOf<Math::float3>(cloud, Geometry::sPointPosition);
        if (!positions || positions->empty())
            throw Failure(place + "there are no points");
        GridDescription const description{.channelName = Geometry::sVoxelSignedDistance,
                                          .voxelSize = options.voxelSize};
        auto const grid = buildLevelSetFromPoints<SmallTiles>(description, *positions, {options.radius},
                                                              options.halfBand * options.voxelSize);
        auto volume = VLD::createObject();
        if (!grid.addTo(*volume))
            throw Failure(place +
                          "the spheres have more voxels than a volume holds, or too many of them overlap, or they lie "
                          "beyond the coordinates that there are; larger voxels help");
        return Geometry::move_vld_volume_to_object(*volume);
    }

    /// Turns every object of a file into a volume; its "name" stays.
    template <class Make>
    ExitCode runMake(MakeOptions const& options, Make const& make)
    {
        auto objects = readZon(options.input);
        {
            Working const working("making volumes");
            editEach(objects, [&](std::uint64_t number, Nexil::Ptr<Object>& object) {
                auto const name = getPropertyAs<Nexil::String>(*object, "name");
                auto const place = fmt::format("{}: object {}: ", options.input, number);
                Nexil::MutablePtr<Object> made(make(*object, place, options));
                if (boundsOf(*made).isEmpty())
                    warn(place + "no voxel lies inside of it");
                if (!name.empty())
                    setProperty(*made, "name", name);
                object = std::move(made);
            });
        }
        writeZon(objects, options.output, options.level);
        return kDone;
    }

    // ------------------------------------------------------------------------------------------------- options

    template <class RunReport>
    void addReport(CLI::App& volume, Run& run, char const* name, char const* description, RunReport const& runReport)
    {
        auto const options = std::make_shared<ReportOptions>();
        auto* const command = volume.add_subcommand(name, description);
        command->add_option("file", options->input, "zon file")->required();
        command->add_flag("--json", options->wantsJson, "Report as JSON on stdout");
        command->callback([options, runReport, &run] { run = [options, runReport] { return runReport(*options); }; });
    }

    std::string checkPositive(std::string const& text)
    {
        float value = 0;
        return CLI::detail::lexical_cast(text, value) && std::isfinite(value) && value > 0
                   ? ""
                   : text + " is no finite number above 0";
    }

    /// A thinner band than that leaves gaps, through which the inside of a mesh gets out.
    std::string checkBandOfMesh(std::string const& text)
    {
        float value = 0;
        return CLI::detail::lexical_cast(text, value) && std::isfinite(value) && value >= 1
                   ? ""
                   : text + " is no finite number of at least 1";
    }

    template <class Make>
    void addMaker(CLI::App& volume, Run& run, char const* name, char const* description, bool hasRadius,
                  Make const& make)
    {
        auto const options = std::make_shared<MakeOptions>();
        auto* const command = volume.add_subcommand(name, description);
        command
            ->add_option("in", options->input,
                         "zon file; each of its objects becomes a volume, and one that cannot is an error")
            ->required();
        command->add_option("out", options->output, "zon file to write")->required();
        command->add_option("--voxel-size", options->voxelSize, "Edge length of a voxel")
            ->required()
            ->check(checkPositive);
        if (hasRadius)
            command->add_option("--radius", options->radius, "Radius of the sphere around each point")
                ->required()
                ->check(checkPositive);
        command->add_option("--band", options->halfBand, "Voxels to each side of the surface that have a distance")
            ->check(hasRadius ? checkPositive : checkBandOfMesh)
            ->capture_default_str();
        command->add_option("--level", options->level, "Compression: 0 none, 1 quickest to 9 smallest")
            ->check(CLI::Range(0, 9))
            ->capture_default_str();
        command->callback([options, make, &run] { run = [options, make] { return runMake(*options, make); }; });
    }

} // namespace

void addVolume(CLI::App& app, Run& run)
{
    auto* const volume = app.add_subcommand("volume", "Measures sparse volumes, and makes level sets");
    volume->require_subcommand(1);
    addReport(*volume, run, "info", "Tells of the tiles and channels of volumes", runInfo);
    addReport(*volume, run, "bounds", "Tells the box around what is in volumes, and around the points of other objects",
              runBounds);
    addMaker(*volume, run, "from-mesh", "Level sets of closed meshes", false, fromMesh);
    addMaker(*volume, run, "from-points", "Level sets of spheres around points", true, fromPoints);
}

} // namespace Zon
