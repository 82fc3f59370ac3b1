#include "Command.h"
#include "Console.h"
#include "MeshArrays.h"
#include "OutputFile.h"
#include "TextInput.h"
#include "ZonFile.h"

#include <CLI/CLI.hpp>
#include <fmt/format.h>
#include <nlohmann/json.hpp>

#include <algorithm>
#include <cctype>
#include <filesystem>
#include <memory>
#include <system_error>

namespace Zon {

namespace {

    using Json = nlohmann::ordered_json;

    struct Options {
        std::string input;
        std::string output;
        int level = 9;
        bool wantsJson = false;
    };

    MeshFile readMeshFile(std::string const& path)
    {
        auto extension = std::filesystem::path(path).extension().string();
        std::transform(extension.begin(), extension.end(), extension.begin(),
                       [](unsigned char c) { return c < 128 ? static_cast<char>(std::tolower(c)) : '?'; });
        using Read = MeshFile (*)(std::string const&, std::string_view);
        Read const read = extension == ".obj"   ? &readObj
                          : extension == ".off" ? &readOff
                          : extension == ".ply" ? &readPly
                          : extension == ".stl" ? &readStl
                                                : nullptr;
        if (!read)
            throw Failure(fmt::format("{}: meshes are read from .obj, .off, .ply and .stl, not from {}", path,
                                      extension.empty() ? "a name without ending" : inQuotes(extension)));
        auto const bytes = readWholeFile(path);
        return read(path, bytes);
    }

    ExitCode runImport(Options const& options)
    {
        checkIsOtherFile(options.input, options.output);
        auto file = readMeshFile(options.input);
        for (auto const& text : file.leftOut)
            warn(fmt::format("{}: not kept: {}", options.input, text));
        Json parts = Json::array();
        std::string report;
        Objects objects;
        for (auto& part : file.parts) {
            bool const isMesh = part.faceCount() > 0;
            report += fmt::format("  {}{}: {}{}\n", isMesh ? "mesh" : "point cloud",
                                  part.name ? " " + inQuotes(*part.name) : "", counted(part.positions.size(), "point"),
                                  isMesh ? ", " + counted(part.faceCount(), "face") : "");
            Json entry{{"kind", isMesh ? "mesh" : "point cloud"},
                       {"name", part.name ? Json(*part.name) : Json()},
                       {"points", part.positions.size()},
                       {"faces", part.faceCount()},
                       {"corners", part.corners.size()}};
            parts.push_back(std::move(entry));
            objects.push_back(makeObject(std::move(part)));
        }
        writeZon(objects, options.output, options.level);
        std::error_code isNoFile; // a pipe or a device has no size
        auto const size = std::filesystem::file_size(options.output, isNoFile);
        std::uint64_t const bytes = isNoFile ? 0 : size;
        if (options.wantsJson) {
            Json const json{{"input", options.input}, {"output", options.output}, {"level", options.level},
                            {"objects", parts},       {"not_kept", file.leftOut}, {"bytes", bytes}};
            fmt::print("{}\n", json.dump(2, ' ', false, Json::error_handler_t::replace));
        } else {
            fmt::print("{}: {}, {}\n{}", options.output, counted(objects.size(), "object"), byteText(bytes), report);
        }
        return kDone;
    }

} // namespace

void addImport(CLI::App& app, Run& run)
{
    auto const options = std::make_shared<Options>();
    auto* const command = app.add_subcommand("import", "Turns a mesh file into a zon file");
    command->add_option("mesh", options->input, "File to read: .obj, .off, .ply or .stl")->required();
    command->add_option("out", options->output, "zon file to write")->required();
    command->add_option("--level", options->level, "Compression: 0 none, 1 quickest to 9 smallest")
        ->check(CLI::Range(0, 9))
        ->capture_default_str();
    command->add_flag("--json", options->wantsJson, "Report as JSON on stdout");
    command->callback([options, &run] { run = [options] { return runImport(*options); }; });
}

} // namespace Zon
