#include "Command.h"
#include "Console.h"
#include "JsonReport.h"
#include "TagTable.h"
#include "ZonFile.h"

#include <CLI/CLI.hpp>
#include <fmt/format.h>

#include <algorithm>
#include <memory>

namespace Zon {

namespace {

    struct Options {
        std::string input;
        bool wantsJson = false;
    };

    void printTable(std::size_t number, std::vector<Tag> const& tags)
    {
        fmt::print("object {}: {}\n", number, counted(tags.size(), "tag"));
        if (tags.empty())
            return;
        std::size_t nameWidth = 3;
        std::size_t componentWidth = 9;
        for (auto const& tag : tags) {
            nameWidth = std::max(nameWidth, tag.name.size());
            componentWidth = std::max(componentWidth, tag.component.size());
        }
        auto const line = [&](auto const& name, auto const& component, auto const& selected, auto const& elements,
                              auto const& share) {
            return fmt::format("    {:<{}}  {:<{}}  {:>10}  {:>10}  {:>7}", name, nameWidth, component, componentWidth,
                               selected, elements, share);
        };
        fmt::print("{}\n", colored(stdout, Color::Bold, line("tag", "component", "selected", "of", "share")));
        for (auto const& tag : tags) {
            auto const selected = countSelected(*tag.mask);
            fmt::print("{}\n", line(printable(tag.name), printable(tag.component), selected, tag.mask->size(),
                                    shareText(selected, tag.mask->size())));
        }
    }

    Json toJson(std::vector<Tag> const& tags)
    {
        Json list = Json::array();
        for (auto const& tag : tags)
            list.push_back({{"name", tag.name},
                            {"component", tag.component},
                            {"selected", countSelected(*tag.mask)},
                            {"elements", tag.mask->size()}});
        return {{"tags", list}};
    }

    ExitCode runTags(Options const& options)
    {
        auto const objects = readZon(options.input);
        Json list = Json::array();
        for (std::size_t i = 0; i < objects.size(); ++i) {
            auto const tags = objects[i] ? tagsOf(*objects[i]) : std::vector<Tag>();
            if (options.wantsJson)
                list.push_back(toJson(tags));
            else
                printTable(i, tags);
        }
        if (options.wantsJson)
            printReport(Json{{"file", options.input}, {"objects", list}});
        return kDone;
    }

} // namespace

void addTags(CLI::App& app, Run& run)
{
    auto const options = std::make_shared<Options>();
    auto* const command = app.add_subcommand("tags", "Lists the tags of a zon file: named selections of elements");
    command->add_option("file", options->input, "zon file")->required();
    command->add_flag("--json", options->wantsJson, "Report as JSON on stdout");
    command->callback([options, &run] { run = [options] { return runTags(*options); }; });
}

} // namespace Zon
