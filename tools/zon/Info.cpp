#include "Command.h"
#include "Console.h"
#include "GeometryKind.h"
#include "JsonReport.h"
#include "ValueRows.h"
#include "ZonFile.h"

#include <veldrin/geometry/GeoProperties.h>
#include <veldrin/geometry/Prototypes.h>
#include <veldrin/object/Properties.h>

#include <CLI/CLI.hpp>
#include <fmt/format.h>

#include <algorithm>
#include <memory>

namespace Zon {

namespace {

    using namespace Veldrin;
    using ObjectPtr = Nexil::Ptr<Object>;

    struct Options {
        std::string input;
        bool wantsJson = false;
    };

    struct PropertyLine {
        std::string name;
        std::string role; ///< "component", "data", "range" or "value"
        std::string type;
        std::uint64_t elements = 0;
        std::uint64_t storedBytes = 0;
        std::uint64_t decodedBytes = 0;
        std::string target;
    };

    struct ObjectReport {
        std::string kind;
        std::string name;
        std::vector<std::pair<std::string, unsigned int>> components;
        std::vector<PropertyLine> properties;
    };

    /// What a property adds to a file of its own that is written at this level.
    std::uint64_t storedAlone(Nexil::String const& name, Nexil::Any const& value, int level)
    {
        auto const withProperty = createObject();
        withProperty->setPropertyAny(name, Nexil::Any(value));
        Objects with;
        with.push_back(ObjectPtr(Nexil::makeMutable<Object>(*withProperty)));
        Objects without;
        without.push_back(ObjectPtr(createObject()));
        return streamSize(with, level) - streamSize(without, level);
    }

    PropertyLine describe(Nexil::String const& name, Nexil::Any const& value, int level)
    {
        PropertyLine line;
        line.name = std::string(name.view());
        line.role = "value";
        line.type = typeName(value);
        line.elements = Nexil::AnyArray::is_any_array(value) ? Nexil::AnyArray::get_any_array_size(value) : 1;
        line.storedBytes = storedAlone(name, value, level);
        line.decodedBytes = decodedBytes(value);
        auto const* const part = value.get<ObjectPtr>();
        if (!part || !*part)
            return line;
        line.elements = (*part)->size();
        line.target = std::string(Geometry::getGeoPropTargetName(**part).view());
        auto const data = (*part)->getProperty(Geometry::sData);
        auto const takeArray = [&](char const* role, Nexil::Any const& array) {
            line.role = role;
            line.type = typeName(array);
            line.elements = Nexil::AnyArray::get_any_array_size(array);
        };
        if (Nexil::AnyArray::is_any_array(data))
            takeArray("data", data);
        else if (Object::isA(**part, *Geometry::getRangeGeoPropPrototype())) {
            takeArray("range", Nexil::Ptr<Nexil::Array<unsigned int>>());
            // Not read, as those of a volume are only made then.
            line.elements = (*part)->propertyInfo(Geometry::sIndices).arraySize;
        } else if (Object::isA(**part, *Geometry::getComponentGeoPropPrototype()))
            line.role = "component";
        return line;
    }

    ObjectReport describe(Object const& object, int level)
    {
        ObjectReport report;
        report.kind = nameOf(kindOf(object));
        report.name = std::string(getPropertyAs<Nexil::String>(object, "name").view());
        for (auto const& key : object.keys()) {
            auto line = describe(key, object.getProperty(key), level);
            if (line.role == "component")
                report.components.emplace_back(line.name, Geometry::getElementCount(object, key));
            else
                report.properties.push_back(std::move(line));
        }
        return report;
    }

    void printTable(std::vector<PropertyLine> const& lines)
    {
        std::size_t nameWidth = 8;
        std::size_t typeWidth = 4;
        for (auto const& line : lines) {
            nameWidth = std::max(nameWidth, line.name.size());
            typeWidth = std::max(typeWidth, line.type.size());
        }
        auto const head =
            fmt::format("    {:<{}}  {:<5}  {:<{}}  {:>12}  {:>14}  {:>14}  {}", "property", nameWidth, "role", "type",
                        typeWidth, "elements", "stored (alone)", "decoded bytes", "target");
        fmt::print("{}\n", colored(stdout, Color::Bold, head));
        for (auto const& line : lines) {
            auto const text = fmt::format("    {:<{}}  {:<5}  {:<{}}  {:>12}  {:>14}  {:>14}  {}", printable(line.name),
                                          nameWidth, line.role, line.type, typeWidth, line.elements, line.storedBytes,
                                          line.decodedBytes, printable(line.target));
            fmt::print("{}\n", std::string_view(text).substr(0, text.find_last_not_of(' ') + 1));
        }
    }

    void printText(Options const& options, ZonHeader const& header, std::vector<ObjectReport> const& reports)
    {
        fmt::print("{}: zon version {}, level {}{}, {}, {}\n", options.input, header.version, header.level,
                   header.hasHandles ? ", with handles" : "", counted(reports.size(), "object"),
                   byteText(header.fileSize));
        for (std::size_t i = 0; i < reports.size(); ++i) {
            auto const& report = reports[i];
            fmt::print("\nobject {}: {}{}\n", i, report.kind,
                       report.name.empty() ? "" : " \"" + printable(report.name) + "\"");
            for (auto const& [name, count] : report.components)
                fmt::print("    {}: {}\n", printable(name), count);
            if (!report.properties.empty())
                printTable(report.properties);
        }
    }

    Json toJson(ObjectReport const& report)
    {
        Json components = Json::array();
        for (auto const& [name, count] : report.components)
            components.push_back({{"name", name}, {"count", count}});
        Json properties = Json::array();
        for (auto const& line : report.properties)
            properties.push_back({{"name", line.name},
                                  {"role", line.role},
                                  {"type", line.type},
                                  {"elements", line.elements},
                                  {"stored_alone_bytes", line.storedBytes},
                                  {"decoded_bytes", line.decodedBytes},
                                  {"target", line.target}});
        return {{"kind", report.kind}, {"name", report.name}, {"components", components}, {"properties", properties}};
    }

    ExitCode runInfo(Options const& options)
    {
        auto const header = readZonHeader(options.input);
        auto const objects = readZon(options.input);
        // Levels that a file may state but no writer takes are measured at the highest there is.
        int const level = std::clamp(header.level, 0, 9);
        std::vector<ObjectReport> reports;
        Progress progress("measuring", objects.size());
        for (auto const& object : objects) {
            if (object)
                reports.push_back(describe(*object, level));
            else
                reports.push_back({"null", "", {}, {}});
            progress.update(reports.size());
        }
        if (!options.wantsJson) {
            printText(options, header, reports);
            return kDone;
        }
        Json list = Json::array();
        for (auto const& report : reports)
            list.push_back(toJson(report));
        Json const json{{"file", options.input},        {"version", header.version}, {"level", header.level},
                        {"handles", header.hasHandles}, {"bytes", header.fileSize},  {"objects", list}};
        printReport(json);
        return kDone;
    }

} // namespace

void addInfo(CLI::App& app, Run& run)
{
    auto const options = std::make_shared<Options>();
    auto* const command = app.add_subcommand("info", "Tells what a zon file holds");
    command->add_option("file", options->input, "zon file")->required();
    command->add_flag("--json", options->wantsJson, "Report as JSON on stdout");
    command->callback([options, &run] { run = [options] { return runInfo(*options); }; });
}

} // namespace Zon
