#include "Command.h"
#include "Console.h"
#include "GeoValues.h"
#include "JsonReport.h"
#include "MeshFindings.h"
#include "Working.h"
#include "ZonFile.h"

#include <veldrin/algorithms/MeshInvariants.h>
#include <veldrin/geometry/GeoProperties.h>
#include <veldrin/geometry/Prototypes.h>

#include <CLI/CLI.hpp>
#include <fmt/format.h>

#include <algorithm>
#include <memory>
#include <optional>
#include <vector>

namespace Zon {

namespace {

    using namespace Veldrin;
    using Geometry::Mesh::Diagnostic;
    using Geometry::Mesh::HalfEdgeDataStructure;

    struct Options {
        std::string input;
        bool wantsJson = false;
    };

    struct Report {
        /// An array is missing or shorter than the counts ask for: nothing but these is known then.
        bool isBroken = false;
        unsigned int points = 0;
        unsigned int faces = 0;
        unsigned int faceVertices = 0;
        std::uint64_t edges = 0;
        std::uint64_t boundaryEdges = 0;
        int eulerCharacteristic = 0;
        int components = 0;
        Math::int3 bettiNumbers;
        Diagnostic found;
    };

    Report examine(Object const& mesh)
    {
        Report report;
        report.points = Geometry::getElementCount(mesh, Geometry::sPointComp);
        report.faces = Geometry::getElementCount(mesh, Geometry::sFaceComp);
        report.faceVertices = Geometry::getElementCount(mesh, Geometry::sFaceVertexComp);
        auto const positions = dataOf<Math::float3>(mesh, Geometry::sPointPosition);
        report.components = Geometry::Mesh::connectedComponents(mesh);
        report.isBroken = report.components == -1 || !positions || positions->size() < report.points;
        if (report.isBroken)
            return report;
        {
            HalfEdgeDataStructure const edges(mesh);
            report.edges = edges.edgeCount();
            edges.forEachEdge(0, edges.pointCount(), [&](HalfEdgeDataStructure::Edge const& edge) {
                report.boundaryEdges += edge.isBoundary() ? 1 : 0;
            });
            report.eulerCharacteristic = Geometry::Mesh::eulerCharacteristic(mesh, edges);
        }
        report.bettiNumbers = Geometry::Mesh::bettiNumbers(mesh);
        report.found = Geometry::Mesh::diagnose(mesh);
        return report;
    }

    void print(std::size_t number, std::optional<Report> const& report)
    {
        if (!report) {
            fmt::print("object {}: no mesh\n", number);
            return;
        }
        if (report->isBroken) {
            fmt::print("object {}: {}, {}\n    {}\n", number, counted(report->points, "point"),
                       counted(report->faces, "face"),
                       colored(stdout, Color::Red, "broken: arrays are too short for these; zon validate tells more"));
            return;
        }
        fmt::print("object {}: {}, {}, {}, {} of them on a border\n", number, counted(report->points, "point"),
                   counted(report->faces, "face"), counted(report->edges, "edge"), report->boundaryEdges);
        fmt::print("    Euler characteristic {}; {}\n", report->eulerCharacteristic,
                   counted(static_cast<std::uint64_t>(report->components), "component"));
        fmt::print("    Betti numbers {}, {}, {}\n", report->bettiNumbers.x, report->bettiNumbers.y,
                   report->bettiNumbers.z);
        for (auto const& kind : findingKinds())
            if (!(report->found.*kind.elements).empty())
                fmt::print("    {}\n", colored(stdout, Color::Yellow, findingText(kind, report->found)));
        if (report->found == Diagnostic{})
            fmt::print("    {}\n", colored(stdout, Color::Green, "nothing found"));
    }

    Json toJson(std::optional<Report> const& report)
    {
        if (!report)
            return {{"is_mesh", false}};
        if (report->isBroken)
            return {{"is_mesh", true}, {"is_broken", true}};
        Json findings = Json::object();
        for (auto const& kind : findingKinds())
            findings[kind.key] = findingJson(kind, report->found);
        auto const& betti = report->bettiNumbers;
        return {{"is_mesh", true},
                {"is_broken", false},
                {"points", report->points},
                {"faces", report->faces},
                {"face_vertices", report->faceVertices},
                {"edges", report->edges},
                {"boundary_edges", report->boundaryEdges},
                {"euler_characteristic", report->eulerCharacteristic},
                {"components", report->components},
                {"betti_numbers", {betti.x, betti.y, betti.z}},
                {"findings", findings}};
    }

    ExitCode runDiagnose(Options const& options)
    {
        std::vector<std::optional<Report>> reports;
        {
            Working const working("diagnosis");
            for (auto const& object : readZon(options.input)) {
                reports.emplace_back();
                if (object && Object::isA(*object, *Geometry::getMeshPrototype()))
                    reports.back() = examine(*object);
            }
        }
        Json list = Json::array();
        for (std::size_t i = 0; i < reports.size(); ++i) {
            if (options.wantsJson)
                list.push_back(toJson(reports[i]));
            else
                print(i, reports[i]);
        }
        if (options.wantsJson)
            printReport(Json{{"file", options.input}, {"objects", list}});
        bool const isClean = std::ranges::all_of(reports, [](auto const& report) {
            return !report || (!report->isBroken && report->found == Diagnostic{});
        });
        return isClean ? kDone : kFindings;
    }

} // namespace

void addDiagnose(CLI::App& app, Run& run)
{
    auto const options = std::make_shared<Options>();
    auto* const command = app.add_subcommand("diagnose", "Measures the topology of meshes and looks for faults in it");
    command->add_option("file", options->input, "zon file")->required();
    command->add_flag("--json", options->wantsJson, "Report as JSON on stdout");
    command->callback([options, &run] { run = [options] { return runDiagnose(*options); }; });
}

} // namespace Zon
