#include "Command.h"
#include "ZonFile.h"

#include <veldrin/geometry/Population.h>

#include <CLI/CLI.hpp>
#include <fmt/format.h>

#include <cmath>
#include <memory>

namespace Zon {

namespace {

    struct Options {
        std::string output;
        int level = 9;
        float size = 1;
        unsigned int subdivisions = 1;
    };

    constexpr unsigned int kMostSubdivisions = 32767;

    template <class Populate>
    void addShape(CLI::App& make, Run& run, char const* name, char const* description, char const* sizeOption,
                  char const* sizeText, bool hasSubdivisions, Populate const& populate)
    {
        auto const options = std::make_shared<Options>();
        auto* const command = make.add_subcommand(name, description);
        command->add_option("out", options->output, "zon file to write")->required();
        command->add_option(sizeOption, options->size, sizeText)
            ->check([](std::string const& text) {
                float value = 0;
                return CLI::detail::lexical_cast(text, value) && std::isfinite(value) ? ""
                                                                                      : text + " is no finite number";
            })
            ->capture_default_str();
        if (hasSubdivisions)
            command->add_option("--subdivisions", options->subdivisions, "Quads along a side")
                ->check(CLI::Range(1u, kMostSubdivisions))
                ->capture_default_str();
        command->add_option("--level", options->level, "Compression: 0 none, 1 quickest to 9 smallest")
            ->check(CLI::Range(0, 9))
            ->capture_default_str();
        command->callback([options, populate, &run] {
            run = [options, populate] {
                auto object = Veldrin::createObject();
                populate(*options, *object);
                writeZon({Nexil::Ptr<Veldrin::Object>(std::move(object))}, options->output, options->level);
                return kDone;
            };
        });
    }

} // namespace

void addMake(CLI::App& app, Run& run)
{
    using Veldrin::Object;
    auto* const make = app.add_subcommand("make", "Writes a simple shape as a zon file");
    make->require_subcommand(1);
    addShape(*make, run, "cube", "A cube around the origin, with normals", "--size", "Length of an edge", false,
             [](Options const& options, Object& mesh) { Veldrin::Geometry::populateCubeMesh(options.size, mesh); });
    addShape(*make, run, "plane", "A square in the plane y = 0 around the origin", "--size", "Length of a side", true,
             [](Options const& options, Object& mesh) {
                 if (!Veldrin::Geometry::populatePlaneMesh(options.size, options.subdivisions, mesh))
                     throw Failure(fmt::format("{} subdivisions are too many", options.subdivisions));
             });
    addShape(*make, run, "sphere", "A coarse sphere around the origin, with normals", "--radius", "Radius", false,
             [](Options const& options, Object& mesh) { Veldrin::Geometry::populateSphereMesh(options.size, mesh); });
}

} // namespace Zon
