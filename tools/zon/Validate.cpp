#include "Command.h"
#include "Console.h"
#include "GeometryKind.h"
#include "JsonReport.h"
#include "MeshFindings.h"
#include "Working.h"
#include "ZonFile.h"

#include <veldrin/geometry/Prototypes.h>
#include <veldrin/validation/MeshValidator.h>
#include <veldrin/validation/PointCloudValidator.h>
#include <veldrin/validation/StrandValidator.h>
#include <veldrin/validation/VolumeValidator.h>

#include <CLI/CLI.hpp>
#include <fmt/format.h>

#include <algorithm>
#include <array>
#include <memory>
#include <set>
#include <string>
#include <vector>

namespace Zon {

namespace {

    using namespace Veldrin;
    using Geometry::GeoValidator;
    using Geometry::Mesh::Diagnostic;
    using ObjectPtr = Nexil::Ptr<Object>;

    struct Options {
        std::vector<std::string> inputs;
        bool wantsJson = false;
        bool wantsAll = false;
        bool isStrict = false;
    };

    /// An object of a file, and how it is reached: a list number, then names of properties and places in arrays.
    struct Place {
        ObjectPtr object;
        std::size_t parent = 0; ///< among the places; its own place for an object of the file's list
        std::string step;
    };

    struct Report {
        std::string path;
        GeometryKind kind = GeometryKind::None;
        Nexil::Array<GeoValidator::Failure> failures;
        Diagnostic found;
    };

    /// Every object of a file once, those of the list first and each before what it holds. Parts of a geometry, which are
    /// judged with it, are among them.
    class Places {
    public:
        explicit Places(Objects const& objects)
        {
            for (std::uint64_t i = 0; i < objects.size(); ++i)
                add(objects[i], places_.size(), std::to_string(i));
            listSize_ = places_.size();
            // Grows while it is walked.
            for (std::size_t i = 0; i < places_.size(); ++i)
                addPartsOf(i);
        }

        [[nodiscard]] std::size_t size() const { return places_.size(); }
        [[nodiscard]] Object const& object(std::size_t place) const { return *places_[place].object; }
        [[nodiscard]] bool isInList(std::size_t place) const { return place < listSize_; }
        [[nodiscard]] std::string path(std::size_t place) const
        {
            std::vector<std::string const*> steps{&places_[place].step};
            for (; places_[place].parent != place; place = places_[place].parent)
                steps.push_back(&places_[places_[place].parent].step);
            std::string text;
            for (auto step = steps.rbegin(); step != steps.rend(); ++step)
                text += **step;
            return text;
        }

    private:
        void add(ObjectPtr const& object, std::size_t parent, std::string step)
        {
            if (object && known_.insert(object.get()).second)
                places_.push_back({object, parent, std::move(step)});
        }

        void addPartsOf(std::size_t place)
        {
            auto const object = places_[place].object;
            for (auto const& key : object->keys()) {
                // Other properties are not fetched: what stands behind them may have to be built.
                auto const type = object->propertyInfo(key).type;
                bool const isArray = type == Nexil::TypeId::of<Nexil::Ptr<Objects>>();
                if (!isArray && type != Nexil::TypeId::of<ObjectPtr>())
                    continue;
                auto const value = object->getProperty(key);
                auto const step = "/" + std::string(key.view());
                if (auto const* const part = value.get<ObjectPtr>())
                    add(*part, place, step);
                if (auto const* const parts = value.get<Nexil::Ptr<Objects>>(); parts && *parts)
                    for (std::uint64_t i = 0; i < (*parts)->size(); ++i)
                        add((**parts)[i], place, fmt::format("{}[{}]", step, i));
            }
        }

        std::vector<Place> places_;
        std::set<Object const*> known_;
        std::size_t listSize_ = 0;
    };

    Nexil::Array<GeoValidator::Failure> failuresOf(Object const& object, GeometryKind kind)
    {
        switch (kind) {
        case GeometryKind::Mesh: return Geometry::MeshValidator().findFailures(object);
        case GeometryKind::Strands: return Geometry::StrandValidator().findFailures(object);
        case GeometryKind::PointCloud: return Geometry::PointCloudValidator().findFailures(object);
        case GeometryKind::LevelSet:
        case GeometryKind::FogVolume:
        case GeometryKind::Volume: return Geometry::VolumeValidator().findFailures(object);
        default: return GeoValidator().findFailures(object);
        }
    }

    Report judge(Object const& object, GeometryKind kind, bool wantsAll)
    {
        Report report;
        report.kind = kind;
        report.failures = failuresOf(object, kind);
        if (!wantsAll && !report.failures.empty())
            report.failures.resize(1);
        if (Object::isA(object, *Geometry::getMeshPrototype()))
            report.found = Geometry::Mesh::diagnose(object);
        return report;
    }

    std::vector<Report> judgeFile(std::string const& path, bool wantsAll)
    {
        Working const working("validation");
        std::vector<Report> reports;
        Places const places(readZon(path));
        for (std::size_t place = 0; place < places.size(); ++place) {
            auto const kind = intendedKindOf(places.object(place));
            if (kind == GeometryKind::None && !places.isInList(place))
                continue;
            reports.push_back(judge(places.object(place), kind, wantsAll));
            reports.back().path = places.path(place);
        }
        return reports;
    }

    char const* codeName(GeoValidator::ErrorCode code)
    {
        static constexpr std::array<char const*, 8> kNames{
            "Success",      "InvalidObject", "InvalidProperty", "", "InvalidElementCount",
            "InvalidIndex", "MissingTarget", "InvalidTarget"};
        return kNames[static_cast<std::size_t>(code)];
    }

    void print(std::string const& file, Report const& report)
    {
        bool const isValid = report.failures.empty();
        fmt::print("{}: object {}: {}: {}\n", file, printable(report.path), nameOf(report.kind),
                   isValid ? colored(stdout, Color::Green, "valid") : colored(stdout, Color::Red, "invalid"));
        for (auto const& failure : report.failures)
            fmt::print("    {} {}: {}\n", static_cast<unsigned int>(failure.status.code), codeName(failure.status.code),
                       printable(failure.status.message.view()));
        for (auto const& kind : findingKinds())
            if (!(report.found.*kind.elements).empty())
                fmt::print("    {} {}\n        {}\n", colored(stdout, Color::Yellow, "note:"),
                           findingText(kind, report.found), kind.remedy);
    }

    Json toJson(Report const& report)
    {
        Json failures = Json::array();
        for (auto const& failure : report.failures)
            failures.push_back({{"code", static_cast<unsigned int>(failure.status.code)},
                                {"name", codeName(failure.status.code)},
                                {"property", failure.property.view()},
                                {"message", failure.status.message.view()}});
        Json notes = Json::array();
        for (auto const& kind : findingKinds())
            if (!(report.found.*kind.elements).empty()) {
                Json note{{"finding", kind.key}};
                note.update(findingJson(kind, report.found));
                note["remedy"] = kind.remedy;
                notes.push_back(std::move(note));
            }
        return {{"path", report.path},
                {"kind", nameOf(report.kind)},
                {"valid", report.failures.empty()},
                {"failures", failures},
                {"notes", notes}};
    }

    ExitCode runValidate(Options const& options)
    {
        Json files = Json::array();
        bool areValid = true;
        bool hasNotes = false;
        for (auto const& file : options.inputs) {
            Json objects = Json::array();
            for (auto const& report : judgeFile(file, options.wantsAll)) {
                areValid = areValid && report.failures.empty();
                hasNotes = hasNotes || report.found != Diagnostic{};
                if (options.wantsJson)
                    objects.push_back(toJson(report));
                else
                    print(file, report);
            }
            files.push_back({{"file", file}, {"objects", std::move(objects)}});
        }
        if (options.wantsJson)
            printReport(Json{{"valid", areValid}, {"files", files}});
        return areValid && !(options.isStrict && hasNotes) ? kDone : kFindings;
    }

} // namespace

void addValidate(CLI::App& app, Run& run)
{
    auto const options = std::make_shared<Options>();
    auto* const command =
        app.add_subcommand("validate", "Judges whether objects are well-formed geometry of their kind");
    command->add_option("files", options->inputs, "zon files")->required();
    command->add_flag("--json", options->wantsJson, "Report as JSON on stdout");
    command->add_flag("--all", options->wantsAll, "Name every broken property, not only the first of an object");
    command->add_flag("--strict", options->isStrict, "Count notes on meshes as findings");
    command->callback([options, &run] { run = [options] { return runValidate(*options); }; });
}

} // namespace Zon
