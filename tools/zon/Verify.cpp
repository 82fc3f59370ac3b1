#include "Command.h"
#include "Console.h"
#include "EntryTable.h"
#include "ZonFile.h"

#include <CLI/CLI.hpp>
#include <fmt/format.h>
#include <nlohmann/json.hpp>

#include <algorithm>
#include <memory>
#include <optional>

namespace Zon {

namespace {

    using Json = nlohmann::ordered_json;

    constexpr unsigned int kFirstVersionWithHashes = 6;
    constexpr char const* kRoles[] = {"shared", "top", "handles", "unknown"};

    struct Options {
        std::string input;
        bool wantsJson = false;
    };

    /// What was found out about the file.
    struct Report {
        ZonHeader header;
        std::vector<EntryState> entries;
        std::string tableFault; ///< "" when the table could be read, or there is none
        std::string readFault;  ///< the library's message; "" when everything could be read
        std::uint64_t objectCount = 0;

        [[nodiscard]] bool hasHashes() const { return header.version >= kFirstVersionWithHashes; }
        [[nodiscard]] std::uint64_t damagedCount() const
        {
            return static_cast<std::uint64_t>(
                std::count_if(entries.begin(), entries.end(), [](EntryState const& entry) { return !entry.isIntact; }));
        }
        [[nodiscard]] bool isIntact() const { return tableFault.empty() && readFault.empty() && damagedCount() == 0; }
    };

    Report verify(std::string const& path)
    {
        Report report;
        report.header = readZonHeader(path);
        if (report.hasHashes()) {
            try {
                report.entries = checkEntries(path, report.header);
            } catch (Failure const& failure) {
                report.tableFault = failure.what();
            }
        }
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
        for (std::size_t i = 0; i < report.entries.size(); ++i) {
            auto const& entry = report.entries[i];
            fmt::print("  entry {:>4}  at {:>10}  {:>12} bytes  {:<7}  {}  {}\n", i, entry.position, entry.byteCount,
                       kRoles[entry.role], entry.isIntact ? ok : damaged, entry.type);
        }
        if (!report.hasHashes())
            fmt::print("  version {} has no hashes: values were read, not checked\n", report.header.version);
        if (!report.tableFault.empty())
            fmt::print("  {}: {}\n", damaged, report.tableFault);
        if (!report.readFault.empty())
            fmt::print("  {}: {}\n", damaged, report.readFault);
        if (report.isIntact())
            fmt::print("{}: {}, {}\n", ok, counted(report.objectCount, "object"),
                       report.entries.size() == 1 ? "1 entry" : fmt::format("{} entries", report.entries.size()));
    }

    void printJson(Options const& options, Report const& report)
    {
        Json entries = Json::array();
        for (auto const& entry : report.entries)
            entries.push_back({{"position", entry.position},
                               {"bytes", entry.byteCount},
                               {"role", kRoles[entry.role]},
                               {"type", entry.type},
                               {"ok", entry.isIntact}});
        auto const textOrNull = [](std::string const& text) { return text.empty() ? Json() : Json(text); };
        Json const json{{"file", options.input},
                        {"version", report.header.version},
                        {"level", report.header.level},
                        {"bytes", report.header.fileSize},
                        {"ok", report.isIntact()},
                        {"hashes_checked", report.hasHashes()},
                        {"objects", report.readFault.empty() ? Json(report.objectCount) : Json()},
                        {"entries", entries},
                        {"table_fault", textOrNull(report.tableFault)},
                        {"read_fault", textOrNull(report.readFault)}};
        fmt::print("{}\n", json.dump(2, ' ', false, Json::error_handler_t::replace));
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
