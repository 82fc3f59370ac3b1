#include "Command.h"
#include "Console.h"
#include "JsonReport.h"
#include "ValueRows.h"
#include "ZonFile.h"

#include <veldrin/io/StreamInspection.h>

#include <CLI/CLI.hpp>
#include <fmt/format.h>

#include <algorithm>
#include <memory>

namespace Zon {

namespace {

    using Veldrin::IO::StreamEntry;

    constexpr char const* kRoles[] = {"shared", "top", "handles", "unknown"};

    struct Options {
        std::string input;
        bool wantsJson = false;
    };

    /// What was found out about the file.
    struct Report {
        ZonHeader header;
        Veldrin::IO::StreamLayout layout;
        std::string tableFault; ///< "" when the table could be read, or there is none
        std::string readFault;  ///< the library's message; "" when everything could be read
        std::uint64_t objectCount = 0;

        [[nodiscard]] bool areEntriesIntact() const
        {
            return std::all_of(layout.entries.begin(), layout.entries.end(),
                               [](StreamEntry const& entry) { return entry.isIntact; });
        }
        [[nodiscard]] bool isIntact() const { return tableFault.empty() && readFault.empty() && areEntriesIntact(); }
    };

    Report verify(std::string const& path)
    {
        Report report;
        report.header = readZonHeader(path);
        Messages messages;
        if (!Veldrin::IO::inspectStream(Nexil::String(std::string_view(path)), report.layout, &messages))
            report.tableFault = messages.errorText();
        try {
            report.objectCount = readZon(path).size();
        } catch (Failure const& failure) {
            std::string_view text = failure.what();
            text.remove_prefix(std::min(text.size(), path.size() + 2));
            report.readFault = std::string(text);
        }
        return report;
    }

    void printText(Options const& options, Report const& report)
    {
        auto const damaged = colored(stdout, Color::Red, "damaged");
        auto const ok = colored(stdout, Color::Green, "ok");
        fmt::print("{}: zon version {}, level {}, {} bytes\n", options.input, report.header.version,
                   report.header.level, report.header.fileSize);
        for (std::size_t i = 0; i < report.layout.entries.size(); ++i) {
            auto const& entry = report.layout.entries[i];
            fmt::print("  entry {:>4}  at {:>10}  {:>12} bytes  {:<7}  {}  {}\n", i, entry.position, entry.byteCount,
                       kRoles[static_cast<unsigned int>(entry.role)],
                       !entry.isIntact           ? damaged
                       : report.layout.hasHashes ? ok
                                                 : "unhashed",
                       typeNameOfCode(entry.typeCode));
        }
        if (report.tableFault.empty() && !report.layout.hasHashes)
            fmt::print("  version {} has no hashes: values were read, not checked\n", report.header.version);
        if (!report.tableFault.empty())
            fmt::print("  {}: {}\n", damaged, report.tableFault);
        if (!report.readFault.empty() && report.readFault != report.tableFault)
            fmt::print("  {}: {}\n", damaged, report.readFault);
        if (report.isIntact())
            fmt::print("{}: {}, {}\n", ok, counted(report.objectCount, "object"),
                       report.layout.entries.size() == 1 ? "1 entry"
                                                         : fmt::format("{} entries", report.layout.entries.size()));
    }

    void printJson(Options const& options, Report const& report)
    {
        Json entries = Json::array();
        for (auto const& entry : report.layout.entries)
            entries.push_back({{"position", entry.position},
                               {"bytes", entry.byteCount},
                               {"role", kRoles[static_cast<unsigned int>(entry.role)]},
                               {"type", typeNameOfCode(entry.typeCode)},
                               {"ok", entry.isIntact}});
        auto const textOrNull = [](std::string const& text) { return text.empty() ? Json() : Json(text); };
        Json const json{{"file", options.input},
                        {"version", report.header.version},
                        {"level", report.header.level},
                        {"bytes", report.header.fileSize},
                        {"ok", report.isIntact()},
                        {"hashes_checked", report.layout.hasHashes},
                        {"objects", report.readFault.empty() ? Json(report.objectCount) : Json()},
                        {"entries", entries},
                        {"table_fault", textOrNull(report.tableFault)},
                        {"read_fault", textOrNull(report.readFault)}};
        printReport(json);
    }

    ExitCode runVerify(Options const& options)
    {
        auto const report = verify(options.input);
        if (options.wantsJson)
            printJson(options, report);
        else
            printText(options, report);
        return report.isIntact() ? kDone : kFindings;
    }

} // namespace

void addVerify(CLI::App& app, Run& run)
{
    auto const options = std::make_shared<Options>();
    auto* const command = app.add_subcommand("verify", "Reads a zon file whole and checks every hash");
    command->add_option("file", options->input, "zon file")->required();
    command->add_flag("--json", options->wantsJson, "Report as JSON on stdout");
    command->callback([options, &run] { run = [options] { return runVerify(*options); }; });
}

} // namespace Zon
