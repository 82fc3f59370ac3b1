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
#include <unordered_map>

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

    // What lies deeper, the dump does not print.
    constexpr unsigned int kMostLevels = 1000;

    using ObjectPtr = Nexil::Ptr<Veldrin::Object>;
    using ObjectListPtr = Nexil::Ptr<Nexil::Array<ObjectPtr>>;

    /// Objects with proxies of volumes as what a file holds of them: the indices of a container would have to be made.
    class Described {
    public:
        [[nodiscard]] ObjectPtr of(ObjectPtr const& object, unsigned int depth = 0)
        {
            if (!object || depth > kMostLevels)
                return object;
            // What is met again is printed again, but made once.
            if (auto const known = made_.find(object.get()); known != made_.end())
                return known->second;
            auto result = Nexil::makeMutable<Veldrin::Object>();
            if (!Veldrin::Geometry::describeVldProxy(*object, *result))
                for (auto const& key : object->keys())
                    result->setPropertyAny(key, valueOf(object->getProperty(key), depth + 1));
            return made_[object.get()] = std::move(result);
        }

    private:
        Nexil::Any valueOf(Nexil::Any value, unsigned int depth)
        {
            if (auto const* const part = value.get<ObjectPtr>())
                return of(*part, depth);
            if (auto const* const list = value.get<ObjectListPtr>(); list && *list) {
                Nexil::Array<ObjectPtr> parts;
                for (ObjectPtr const& part : **list)
                    parts.push_back(of(part, depth));
                return Nexil::makePtr<Nexil::Array<ObjectPtr>>(std::move(parts));
            }
            return value;
        }

        std::unordered_map<Veldrin::Object const*, ObjectPtr> made_;
    };

    ExitCode runDump(Options const& options)
    {
        auto const objects = readZon(options.input);
        StandardOutput output;
        for (std::uint64_t i = 0; i < objects.size(); ++i) {
            fmt::print("object {}:\n", i);
            if (objects[i])
                Veldrin::Geometry::Internal::debugDumpToStream(output, *Described().of(objects[i]),
                                                               options.maxElements);
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
