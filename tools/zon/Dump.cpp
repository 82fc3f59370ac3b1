#include "Command.h"
#include "Console.h"
#include "ZonFile.h"

#include <veldrin/geometry/DebugDump.h>

#include <CLI/CLI.hpp>
#include <fmt/format.h>

#include <cstdio>
#include <memory>

namespace Zon {

namespace {

    struct Options {
        std::string input;
        unsigned long long maxElements = 10;
    };

    class StandardOutput : public Veldrin::Geometry::Internal::DebugDumpInterface {
    public:
        void write(char const* text, std::uint64_t length) override
        {
            auto const safe = printable({text, static_cast<std::size_t>(length)}, true);
            std::fwrite(safe.data(), 1, safe.size(), stdout);
        }
    };

    ExitCode runDump(Options const& options)
    {
        auto const objects = readZon(options.input);
        StandardOutput output;
        for (std::uint64_t i = 0; i < objects.size(); ++i) {
            fmt::print("object {}:\n", i);
            if (objects[i])
                Veldrin::Geometry::Internal::debugDumpToStream(output, *objects[i], options.maxElements);
            else
                fmt::print("(null)");
            fmt::print("\n");
        }
        return kDone;
    }

} // namespace

void addDump(CLI::App& app, Run& run)
{
    auto const options = std::make_shared<Options>();
    auto* const command = app.add_subcommand("dump", "Prints the objects of a zon file as text");
    command->add_option("file", options->input, "zon file")->required();
    command->add_option("--max", options->maxElements, "How many elements of an array are printed")
        ->capture_default_str();
    command->callback([options, &run] { run = [options] { return runDump(*options); }; });
}

} // namespace Zon
