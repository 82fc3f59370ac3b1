#include "Command.h"
#include "Compare.h"
#include "Console.h"
#include "FileEnding.h"
#include "JsonReport.h"
#include "MeshArrays.h"
#include "OutputFile.h"
#include "TextInput.h"
#include "VdbFile.h"

#include <veldrin/geometry/GeoProperties.h>
#include <veldrin/geometry/Prototypes.h>
#include <veldrin/object/Properties.h>

#include <CLI/CLI.hpp>
#include <fmt/format.h>

#include <cerrno>
#include <cmath>
#include <cstdio>
#include <filesystem>
#include <limits>
#include <memory>
#include <system_error>

namespace Zon {

namespace {

    using namespace Veldrin;
    using Geometry::kInvalidIndex;

    struct Options {
        std::string input;
        std::string output;
        bool wantsJson = false;
    };

    // More differences than this are summed up in one line.
    constexpr std::uint64_t kMostWarnings = 20;

    template <class T>
    Nexil::Array<T> copyOfData(Object const& object, char const* name)
    {
        auto const data = dataOf<T>(object, name);
        return data ? *data : Nexil::Array<T>();
    }

    /// Every NaN is written as "nan", which reads back as one NaN.
    template <class T>
    void makeNaNsAlike(Nexil::Array<T>& values)
    {
        for (T& value : values)
            for (int i = 0; i < T::kSize; ++i)
                if (std::isnan(value[i]))
                    value[i] = std::numeric_limits<float>::quiet_NaN();
    }

    void checkIndices(Nexil::Array<unsigned int> const& indices, std::uint64_t count, bool mayBeInvalid,
                      std::string const& name)
    {
        for (std::uint64_t i = 0; i < indices.size(); ++i)
            if (indices[i] >= count && !(mayBeInvalid && indices[i] == kInvalidIndex))
                throw Failure(fmt::format("{}[{}] is {}, of {} elements", name, i, indices[i], count));
    }

    /// Values behind a range over the corners; nothing when the property is of another form.
    template <class T>
    std::optional<CornerValues<T>> cornerValuesOf(Object const& object, char const* name, std::uint64_t cornerCount,
                                                  std::string const& place)
    {
        auto const rangeName = Geometry::getGeoPropRangeName(name);
        auto const property = getPropertyAs<Nexil::Ptr<Object>>(object, name);
        auto const indices = Geometry::getRangeGeoPropIndices(object, rangeName);
        if (!property || !indices || !(Geometry::getGeoPropTargetName(*property) == rangeName) ||
            !(Geometry::getGeoPropTargetName(object, rangeName) == Geometry::sFaceVertexComp))
            return std::nullopt;
        CornerValues<T> result{copyOfData<T>(object, name), *indices};
        if (result.values.empty() || result.indices.size() != cornerCount)
            return std::nullopt;
        checkIndices(result.indices, result.values.size(), true, place + std::string(rangeName.view()));
        makeNaNsAlike(result.values);
        return result;
    }

    /// A name that one line can hold and that reads back the same; "" is no name.
    std::string cleanName(std::string name)
    {
        for (char& c : name)
            if (static_cast<unsigned char>(c) < 32 || c == '#')
                c = '_';
        auto const begin = name.find_first_not_of(' ');
        if (begin == std::string::npos)
            return "";
        name = name.substr(begin, name.find_last_not_of(' ') + 1 - begin);
        // At the end of a line a backslash would take in the next one.
        if (name.back() == '\\')
            name.back() = '_';
        return name;
    }

    MeshArrays arraysOf(Object const& object, std::string const& place)
    {
        MeshArrays arrays;
        arrays.positions = copyOfData<Math::float3>(object, Geometry::sPointPosition);
        makeNaNsAlike(arrays.positions);
        if (auto const name = cleanName(std::string(getPropertyAs<Nexil::String>(object, "name").view()));
            !name.empty())
            arrays.name = name;
        if (!Object::isA(object, *Geometry::getMeshPrototype()))
            return arrays;
        arrays.corners = copyOfData<unsigned int>(object, Geometry::sFaceVertex);
        auto offsets = copyOfData<unsigned int>(object, Geometry::sFaceOffset);
        if (offsets.size() < 2)
            return arrays;
        for (std::uint64_t face = 0; face + 1 < offsets.size(); ++face)
            if (offsets[face] >= offsets[face + 1] || offsets[face + 1] > arrays.corners.size())
                throw Failure(fmt::format("{}face {} has no corners", place, face));
        if (offsets[0] != 0 || offsets[offsets.size() - 1] != arrays.corners.size())
            throw Failure(fmt::format("{}corners without a face", place));
        checkIndices(arrays.corners, arrays.positions.size(), false, place + Geometry::sFaceVertex);
        arrays.offsets = std::move(offsets);
        arrays.cornerNormals =
            cornerValuesOf<Math::float3>(object, Geometry::sFaceVertexNormal, arrays.corners.size(), place);
        arrays.cornerUVs = cornerValuesOf<Math::float2>(object, Geometry::sFaceVertexUV, arrays.corners.size(), place);
        return arrays;
    }

    /// What reading the OBJ will not give back, in words.
    std::vector<std::string> lossesOf(Object const& object, MeshArrays const& arrays, std::string const& place)
    {
        Objects before;
        before.push_back(Nexil::Ptr<Object>(Nexil::makeMutable<Object>(object)));
        Objects after;
        after.push_back(makeObject(MeshArrays(arrays)));
        CompareOptions options;
        options.maxDifferences = kMostWarnings + 1;
        std::vector<std::string> losses;
        for (auto const& difference : compare(before, after, options)) {
            if (losses.size() == kMostWarnings) {
                losses.push_back(place + "and more");
                break;
            }
            auto path = pathText(difference);
            // The path starts with the number that the object has here, where it is alone.
            path.erase(0, std::min(path.size(), path.find('/') + 1));
            losses.push_back(difference.what == "missing"
                                 ? fmt::format("{}{} ({})", place, path, difference.first)
                                 : fmt::format("{}{}: {} {} becomes {}", place, path, difference.what, difference.first,
                                               difference.second));
        }
        return losses;
    }

    void writeText(std::string const& text, std::string const& path)
    {
        OutputFile file(path);
        std::FILE* const stream = std::fopen(file.pathToWrite().c_str(), "wb");
        bool const isWritten =
            stream && std::fwrite(text.data(), 1, text.size(), stream) == text.size() && std::fflush(stream) == 0;
        int const errorNumber = errno;
        if (stream)
            std::fclose(stream);
        if (!isWritten)
            throw Failure(fmt::format("{}: cannot be written: {}", path, errorText(errorNumber)));
        file.commit();
    }

    ExitCode report(Options const& options, char const* noun, std::uint64_t count,
                    std::vector<std::string> const& losses, std::uint64_t bytes)
    {
        for (auto const& loss : losses)
            warn(fmt::format("not kept: {}", loss));
        if (options.wantsJson) {
            Json const json{{"input", options.input},
                            {"output", options.output},
                            {std::string(noun) + "s", count},
                            {"not_kept", losses},
                            {"bytes", bytes}};
            printReport(json);
        } else {
            fmt::print("{}: {}, {}\n", options.output, counted(count, noun), byteText(bytes));
        }
        return kDone;
    }

    ExitCode exportVolumes(Options const& options)
    {
        auto const objects = readZon(options.input);
        auto const written = writeVdb(objects, options.output);
        if (written.gridCount == 0)
            throw Failure(fmt::format("{}: there is no volume with values in it that a grid holds{}", options.input,
                                      written.leftOut.empty() ? "" : "; " + written.leftOut[0]));
        std::error_code isNoFile; // a pipe or a device has no size
        auto const size = std::filesystem::file_size(options.output, isNoFile);
        return report(options, "grid", written.gridCount, written.leftOut, isNoFile ? 0 : size);
    }

    ExitCode exportMeshes(Options const& options)
    {
        auto const objects = readZon(options.input);
        std::vector<MeshArrays> parts;
        std::vector<std::string> losses;
        for (std::uint64_t i = 0; i < objects.size(); ++i) {
            auto const place = fmt::format("object {}: ", i);
            if (!objects[i] || !Object::isA(*objects[i], *Geometry::getPointCloudPrototype()) ||
                copyOfData<Math::float3>(*objects[i], Geometry::sPointPosition).empty()) {
                losses.push_back(place + "neither a mesh nor a point cloud with points");
                continue;
            }
            try {
                parts.push_back(arraysOf(*objects[i], place));
            } catch (Failure const& failure) {
                throw Failure(fmt::format("{}: {}", options.input, failure.what()));
            }
            auto const own = lossesOf(*objects[i], parts.back(), place);
            losses.insert(losses.end(), own.begin(), own.end());
        }
        if (parts.empty())
            throw Failure(fmt::format("{}: there is no mesh and no point cloud in it", options.input));
        auto const text = writeObj(parts);
        writeText(text, options.output);
        return report(options, "object", parts.size(), losses, text.size());
    }

    ExitCode runExport(Options const& options)
    {
        checkIsOtherFile(options.input, options.output);
        auto const ending = fileEnding(options.output);
        if (ending == ".vdb")
            return exportVolumes(options);
        if (ending != ".obj" && !ending.empty())
            throw Failure(fmt::format("{}: meshes are written to .obj, volumes to .vdb, but not to {}", options.output,
                                      inQuotes(ending)));
        return exportMeshes(options);
    }

} // namespace

void addExport(CLI::App& app, Run& run)
{
    auto const options = std::make_shared<Options>();
    auto* const command =
        app.add_subcommand("export", "Turns a zon file into an OBJ file, or its volumes into a VDB file");
    command->add_option("in", options->input, "zon file")->required();
    command
        ->add_option("out", options->output,
                     "File to write: .obj or a name without ending for meshes, .vdb for volumes")
        ->required();
    command->add_flag("--json", options->wantsJson, "Report as JSON on stdout");
    command->callback([options, &run] { run = [options] { return runExport(*options); }; });
}

} // namespace Zon
