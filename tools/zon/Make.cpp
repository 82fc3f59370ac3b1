#include "Command.h"
#include "GeoValues.h"
#include "MeshArrays.h"
#include "ZonFile.h"

#include <veldrin/algorithms/MeshNormals.h>
#include <veldrin/geometry/Population.h>

#include <CLI/CLI.hpp>
#include <fmt/format.h>

#include <cmath>
#include <memory>

namespace Zon {

namespace {

    using namespace Veldrin;

    struct Options {
        std::string output;
        int level = 9;
        float size = 1;
        unsigned int subdivisions = 1;
    };

    constexpr unsigned int kMostSubdivisions = 32767;

    std::string checkFinite(std::string const& text)
    {
        float value = 0;
        return CLI::detail::lexical_cast(text, value) && std::isfinite(value) ? "" : text + " is no finite number";
    }

    void addLevel(CLI::App& command, int& level)
    {
        command.add_option("--level", level, "Compression: 0 none, 1 quickest to 9 smallest")
            ->check(CLI::Range(0, 9))
            ->capture_default_str();
    }

    template <class Populate>
    void addShape(CLI::App& make, Run& run, char const* name, char const* description, char const* sizeOption,
                  char const* sizeText, bool hasSubdivisions, Populate const& populate)
    {
        auto const options = std::make_shared<Options>();
        auto* const command = make.add_subcommand(name, description);
        command->add_option("out", options->output, "zon file to write")->required();
        command->add_option(sizeOption, options->size, sizeText)->check(checkFinite)->capture_default_str();
        if (hasSubdivisions)
            command->add_option("--subdivisions", options->subdivisions, "Quads along a side")
                ->check(CLI::Range(1u, kMostSubdivisions))
                ->capture_default_str();
        addLevel(*command, options->level);
        command->callback([options, populate, &run] {
            run = [options, populate] {
                auto object = createObject();
                populate(*options, *object);
                writeZon({Nexil::Ptr<Object>(std::move(object))}, options->output, options->level);
                return kDone;
            };
        });
    }

    struct StrandOptions {
        std::string input;
        std::string output;
        int level = 9;
        float length = 1;
        unsigned int points = 4;
    };

    constexpr unsigned int kMostStrandPoints = 1000000;

    /// One straight strand from each point of the geometry along its normal.
    Nexil::Ptr<Object> growStrands(Object const& geometry, StrandOptions const& options)
    {
        auto const roots = dataOf<Math::float3>(geometry, Geometry::sPointPosition);
        auto normals = dataOf<Math::float3>(geometry, Geometry::sPointNormal);
        if (roots && !normals) {
            Nexil::Array<Math::float3> computed;
            GeometryAlgorithms::computeMeshVertexNormals(geometry, true, false, computed);
            normals = Nexil::makePtr<Nexil::Array<Math::float3>>(std::move(computed));
        }
        if (!roots || roots->empty() || roots->size() != normals->size())
            throw Failure(options.input + ": its first object has no points with normals");
        if (roots->size() * options.points > kMostElements)
            throw Failure(
                fmt::format("{}: {} points are too many for {} roots", options.input, options.points, roots->size()));
        Nexil::Array<Math::float3> positions;
        positions.reserve(roots->size() * options.points);
        Nexil::Array<unsigned int> offsets;
        offsets.reserve(roots->size() + 1);
        float const step = options.points > 1 ? options.length / static_cast<float>(options.points - 1) : 0;
        for (std::uint64_t i = 0; i < roots->size(); ++i) {
            offsets.push_back(static_cast<unsigned int>(positions.size()));
            for (unsigned int k = 0; k < options.points; ++k)
                positions.push_back((*roots)[i] + (*normals)[i] * (step * static_cast<float>(k)));
        }
        offsets.push_back(static_cast<unsigned int>(positions.size()));
        auto strands = createObject();
        Geometry::populateStrand(Nexil::makePtr<Nexil::Array<Math::float3>>(std::move(positions)),
                                 Nexil::makePtr<Nexil::Array<unsigned int>>(std::move(offsets)), *strands);
        return Nexil::Ptr<Object>(std::move(strands));
    }

    void addStrandShape(CLI::App& make, Run& run)
    {
        auto const options = std::make_shared<StrandOptions>();
        auto* const command =
            make.add_subcommand("strands", "Straight strands on the points of a geometry, as hair is");
        command->add_option("in", options->input, "zon file; strands stand on its first object")->required();
        command->add_option("out", options->output, "zon file to write")->required();
        command->add_option("--length", options->length, "Length of a strand")
            ->check(checkFinite)
            ->capture_default_str();
        command->add_option("--points", options->points, "Points of a strand")
            ->check(CLI::Range(1u, kMostStrandPoints))
            ->capture_default_str();
        addLevel(*command, options->level);
        command->callback([options, &run] {
            run = [options] {
                auto const objects = readZon(options->input);
                if (objects.empty() || !objects[0])
                    throw Failure(options->input + ": there is no object in it");
                writeZon({growStrands(*objects[0], *options)}, options->output, options->level);
                return kDone;
            };
        });
    }

} // namespace

void addMake(CLI::App& app, Run& run)
{
    auto* const make = app.add_subcommand("make", "Writes a simple shape as a zon file, or strands on one");
    make->require_subcommand(1);
    addShape(*make, run, "cube", "A cube around the origin, with normals", "--size", "Length of an edge", false,
             [](Options const& options, Object& mesh) { Geometry::populateCubeMesh(options.size, mesh); });
    addShape(*make, run, "plane", "A square in the plane y = 0 around the origin", "--size", "Length of a side", true,
             [](Options const& options, Object& mesh) {
                 if (!Geometry::populatePlaneMesh(options.size, options.subdivisions, mesh))
                     throw Failure(fmt::format("{} subdivisions are too many", options.subdivisions));
             });
    addShape(*make, run, "sphere", "A coarse sphere around the origin, with normals", "--radius", "Radius", false,
             [](Options const& options, Object& mesh) { Geometry::populateSphereMesh(options.size, mesh); });
    addStrandShape(*make, run);
}

} // namespace Zon
