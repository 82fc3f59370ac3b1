#include "Command.h"
#include "Console.h"
#include "FileEnding.h"
#include "GeometryKind.h"
#include "JsonReport.h"
#include "MeshArrays.h"
#include "OutputFile.h"
#include "TextInput.h"
#include "VdbFile.h"
#include "ZonFile.h"

#include <veldrin/geometry/GeoProperties.h>
#include <veldrin/object/Properties.h>

#include <CLI/CLI.hpp>
#include <fmt/format.h>

#include <filesystem>
#include <memory>
#include <system_error>

namespace Zon {

namespace {

    using namespace Veldrin;

    struct Options {
        std::string input;
        std::string output;
        int level = 9;
        bool wantsJson = false;
    };

    /// What came of a file.
    struct Imported {
        Objects objects;
        std::vector<std::string> leftOut;
        std::string report; ///< a line per object
        Json parts = Json::array();
    };

    MeshFile readMeshFile(std::string const& path)
    {
        auto const extension = fileEnding(path);
        using Read = MeshFile (*)(std::string const&, std::string_view);
        Read const read = extension == ".obj"   ? &readObj
                          : extension == ".off" ? &readOff
                          : extension == ".ply" ? &readPly
                          : extension == ".stl" ? &readStl
                                                : nullptr;
        if (!read)
            throw Failure(
                fmt::format("{}: meshes are read from .obj, .off, .ply and .stl, volumes from .vdb, but not from {}",
                            path, extension.empty() ? "a name without ending" : inQuotes(extension)));
        auto const bytes = readWholeFile(path);
        return read(path, bytes);
    }

    Imported importMeshes(std::string const& path)
    {
        auto file = readMeshFile(path);
        Imported result;
        result.leftOut = std::move(file.leftOut);
        for (auto& part : file.parts) {
            bool const isMesh = part.faceCount() > 0;
            result.report += fmt::format(
                "  {}{}: {}{}\n", isMesh ? "mesh" : "point cloud", part.name ? " " + inQuotes(*part.name) : "",
                counted(part.positions.size(), "point"), isMesh ? ", " + counted(part.faceCount(), "face") : "");
            Json entry{{"kind", isMesh ? "mesh" : "point cloud"},
                       {"name", part.name ? Json(*part.name) : Json()},
                       {"points", part.positions.size()},
                       {"faces", part.faceCount()},
                       {"corners", part.corners.size()}};
            result.parts.push_back(std::move(entry));
            result.objects.push_back(makeObject(std::move(part)));
        }
        return result;
    }

    Imported importVolumes(std::string const& path)
    {
        auto file = readVdb(path);
        Imported result;
        result.leftOut = std::move(file.leftOut);
        for (auto const& object : file.objects) {
            auto const kind = std::string(nameOf(kindOf(*object)));
            auto const name = std::string(getPropertyAs<Nexil::String>(*object, "name").view());
            auto const elements = Geometry::getElementCount(*object, Geometry::sVoxelComp);
            result.report += fmt::format("  {}{}: {}\n", kind, name.empty() ? "" : " " + inQuotes(name),
                                         counted(elements, "element"));
            result.parts.push_back(
                {{"kind", kind}, {"name", name.empty() ? Json() : Json(name)}, {"elements", elements}});
        }
        result.objects = std::move(file.objects);
        return result;
    }

    ExitCode runImport(Options const& options)
    {
        checkIsOtherFile(options.input, options.output);
        auto const [objects, leftOut, report, parts] =
            fileEnding(options.input) == ".vdb" ? importVolumes(options.input) : importMeshes(options.input);
        for (auto const& text : leftOut)
            warn(fmt::format("{}: not kept: {}", options.input, text));
        writeZon(objects, options.output, options.level);
        std::error_code isNoFile; // a pipe or a device has no size
        auto const size = std::filesystem::file_size(options.output, isNoFile);
        std::uint64_t const bytes = isNoFile ? 0 : size;
        if (options.wantsJson) {
            Json const json{{"input", options.input}, {"output", options.output}, {"level", options.level},
                            {"objects", parts},       {"not_kept", leftOut},      {"bytes", bytes}};
            printReport(json);
        } else {
            fmt::print("{}: {}, {}\n{}", options.output, counted(objects.size(), "object"), byteText(bytes), report);
        }
        return kDone;
    }

} // namespace

void addImport(CLI::App& app, Run& run)
{
    auto const options = std::make_shared<Options>();
    auto* const command = app.add_subcommand("import", "Turns a mesh file or a volume file into a zon file");
    command->add_option("file", options->input, "File to read: .obj, .off, .ply, .stl or .vdb")->required();
    command->add_option("out", options->output, "zon file to write")->required();
    command->add_option("--level", options->level, "Compression: 0 none, 1 quickest to 9 smallest")
        ->check(CLI::Range(0, 9))
        ->capture_default_str();
    command->add_flag("--json", options->wantsJson, "Report as JSON on stdout");
    command->callback([options, &run] { run = [options] { return runImport(*options); }; });
}

} // namespace Zon
