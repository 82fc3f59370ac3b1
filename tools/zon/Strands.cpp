#include "Command.h"
#include "Console.h"
#include "JsonReport.h"
#include "Working.h"
#include "ZonFile.h"

#include <veldrin/algorithms/StrandMeasures.h>
#include <veldrin/geometry/GeoProperties.h>
#include <veldrin/geometry/Prototypes.h>

#include <CLI/CLI.hpp>
#include <fmt/format.h>
#include <fmt/ranges.h>

#include <algorithm>
#include <memory>
#include <optional>
#include <vector>

namespace Zon {

namespace {

    using namespace Veldrin;

    struct Options {
        std::string input;
        std::uint64_t mostLengths = 10;
        bool wantsJson = false;
    };

    struct Report {
        /// An array is shorter than the counts ask for: nothing is known then.
        bool isBroken = false;
        unsigned int points = 0;
        Nexil::Array<float> lengths;
        double total = 0;

        [[nodiscard]] float shortest() const { return lengths.empty() ? 0 : *std::ranges::min_element(lengths); }
        [[nodiscard]] float longest() const { return lengths.empty() ? 0 : *std::ranges::max_element(lengths); }
        [[nodiscard]] double mean() const { return lengths.empty() ? 0 : total / static_cast<double>(lengths.size()); }
    };

    /// Nothing for what is no strands.
    std::optional<Report> measure(Object const& object)
    {
        if (!Object::isA(object, *Geometry::getStrandPrototype()))
            return std::nullopt;
        Report report;
        Nexil::Array<float> segments;
        report.isBroken = !GeometryAlgorithms::computeStrandLength(object, report.lengths, segments, nullptr);
        report.points = Geometry::getElementCount(object, Geometry::sPointComp);
        for (float const length : report.lengths)
            report.total += length;
        return report;
    }

    std::vector<float> firstLengths(Report const& report, std::uint64_t most)
    {
        return {report.lengths.begin(), report.lengths.begin() + std::min<std::uint64_t>(report.lengths.size(), most)};
    }

    void print(std::size_t number, std::optional<Report> const& report, std::uint64_t most)
    {
        if (!report) {
            fmt::print("object {}: no strands\n", number);
            return;
        }
        if (report->isBroken) {
            fmt::print("object {}: {}\n", number,
                       colored(stdout, Color::Red,
                               "broken strands: arrays are too short for the counts; zon validate tells more"));
            return;
        }
        fmt::print("object {}: {}, {}\n", number, counted(report->lengths.size(), "strand"),
                   counted(report->points, "point"));
        fmt::print("    length {:.6g} in all; shortest {:.6g}, mean {:.6g}, longest {:.6g}\n", report->total,
                   report->shortest(), report->mean(), report->longest());
        if (most > 0 && !report->lengths.empty())
            fmt::print("    lengths: {:.6g}{}\n", fmt::join(firstLengths(*report, most), ", "),
                       report->lengths.size() > most ? ", ..." : "");
    }

    Json toJson(std::optional<Report> const& report, std::uint64_t most)
    {
        if (!report)
            return {{"is_strands", false}};
        if (report->isBroken)
            return {{"is_strands", true}, {"is_broken", true}};
        return {{"is_strands", true},       {"is_broken", false},           {"strands", report->lengths.size()},
                {"points", report->points}, {"total", report->total},       {"shortest", report->shortest()},
                {"mean", report->mean()},   {"longest", report->longest()}, {"lengths", firstLengths(*report, most)}};
    }

    ExitCode runStrands(Options const& options)
    {
        std::vector<std::optional<Report>> reports;
        {
            Working const working("strands");
            for (auto const& object : readZon(options.input))
                reports.push_back(object ? measure(*object) : std::nullopt);
        }
        Json list = Json::array();
        for (std::size_t i = 0; i < reports.size(); ++i) {
            if (options.wantsJson)
                list.push_back(toJson(reports[i], options.mostLengths));
            else
                print(i, reports[i], options.mostLengths);
        }
        if (options.wantsJson)
            printReport(Json{{"file", options.input}, {"objects", list}});
        bool const isWhole =
            std::ranges::none_of(reports, [](auto const& report) { return report && report->isBroken; });
        return isWhole ? kDone : kFindings;
    }

} // namespace

void addStrands(CLI::App& app, Run& run)
{
    auto const options = std::make_shared<Options>();
    auto* const command = app.add_subcommand("strands", "Measures the lengths of strands");
    command->add_option("file", options->input, "zon file")->required();
    command->add_option("--max", options->mostLengths, "How many lengths to list")->capture_default_str();
    command->add_flag("--json", options->wantsJson, "Report as JSON on stdout");
    command->callback([options, &run] { run = [options] { return runStrands(*options); }; });
}

} // namespace Zon
