#include "Command.h"
#include "Console.h"
#include "ZonFile.h"

#include <veldrin/geometry/DebugDump.h>
#include <veldrin/object/Object.h>
#include <veldrin/volume/VldProxyDescription.h>

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

    /// The object with proxies of volumes as what a file holds of them: the indices of a container would have to be made.
    Veldrin::Object described(Veldrin::Object const& object)
    {
        Veldrin::Object result;
        if (Veldrin::Geometry::describeVldProxy(object, result))
            return result;
        for (auto const& key : object.keys()) {
            auto value = object.getProperty(key);
            auto const* const part = value.get<Nexil::Ptr<Veldrin::Object>>();
            Veldrin::Object description;
            if (part && *part && Veldrin::Geometry::describeVldProxy(**part, description))
                value = Nexil::Ptr<Veldrin::Object>(Nexil::makePtr<Veldrin::Object>(std::move(description)));
            result.setPropertyAny(key, std::move(value));
        }
        return result;
    }

    ExitCode runDump(Options const& options)
    {
        auto const objects = readZon(options.input);
        StandardOutput output;
        for (std::uint64_t i = 0; i < objects.size(); ++i) {
            fmt::print("object {}:\n", i);
            if (objects[i])
                Veldrin::Geometry::Internal::debugDumpToStream(output, described(*objects[i]), options.maxElements);
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
