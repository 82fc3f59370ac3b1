#include "Command.h"
#include "Compare.h"
#include "Console.h"
#include "JsonReport.h"

#include <CLI/CLI.hpp>
#include <fmt/format.h>

#include <cmath>
#include <memory>

namespace Zon {

namespace {

    struct Options {
        std::string first;
        std::string second;
        double tolerance = -1;
        std::uint64_t maxDifferences = 20;
        bool wantsJson = false;
    };

    ExitCode runDiff(Options const& options)
    {
        CompareOptions compareOptions;
        if (!std::isfinite(options.tolerance))
            throw Failure("--tolerance: is no finite number");
        if (options.tolerance >= 0)
            compareOptions.tolerance = options.tolerance;
        compareOptions.maxDifferences = options.maxDifferences;
        auto const differences = compare(readZon(options.first), readZon(options.second), compareOptions);
        // The comparison ends with the last difference that it may report.
        bool const isComplete = differences.size() < options.maxDifferences;
        if (options.wantsJson) {
            Json list = Json::array();
            for (auto const& difference : differences)
                list.push_back({{"path", difference.path},
                                {"what", difference.what},
                                {"first", difference.first},
                                {"second", difference.second}});
            Json const json{{"first", options.first},
                            {"second", options.second},
                            {"equal", differences.empty()},
                            {"complete", isComplete},
                            {"differences", list}};
            printReport(json);
        } else if (differences.empty()) {
            fmt::print("{}\n", colored(stdout, Color::Green, "equal"));
        } else {
            for (auto const& difference : differences)
                fmt::print("{}: {}: {} | {}\n", colored(stdout, Color::Bold, printable(pathText(difference))),
                           printable(difference.what), colored(stdout, Color::Red, printable(difference.first)),
                           colored(stdout, Color::Green, printable(difference.second)));
            fmt::print("{}{}\n", counted(differences.size(), "difference"),
                       isComplete ? "" : ", and not compared any further");
        }
        return differences.empty() ? kDone : kFindings;
    }

} // namespace

void addDiff(CLI::App& app, Run& run)
{
    auto const options = std::make_shared<Options>();
    auto* const command = app.add_subcommand("diff", "Compares the objects of two zon files");
    command->add_option("first", options->first, "zon file")->required();
    command->add_option("second", options->second, "zon file")->required();
    command->add_option("--tolerance", options->tolerance, "How far floats may be apart; bits must be equal without it")
        ->check(CLI::NonNegativeNumber);
    command->add_option("--max", options->maxDifferences, "Stop after so many differences")
        ->check(CLI::Range(std::uint64_t(1), ~std::uint64_t(0)))
        ->capture_default_str();
    command->add_flag("--json", options->wantsJson, "Report as JSON on stdout");
    command->callback([options, &run] { run = [options] { return runDiff(*options); }; });
}

} // namespace Zon
