/// Reads every stream of a folder and writes it into another under the same name, by the library.
///
///     rewrite FROM TO LEVEL

#include <veldrin/io/ObjectStream.h>

#include <cstdio>
#include <cstdlib>
#include <filesystem>

int main(int, char** arguments)
{
    Veldrin::IO::SerializationOptions options;
    options.compressionLevel = std::atoi(arguments[3]);
    for (auto const& entry : std::filesystem::directory_iterator(arguments[1])) {
        if (entry.path().extension() != ".zon")
            continue;
        auto const target = std::filesystem::path(arguments[2]) / entry.path().filename();
        Nexil::Array<Nexil::Ptr<Veldrin::Object>> objects;
        if (!Veldrin::IO::deserialize(entry.path().c_str(), objects, {}, nullptr) ||
            !Veldrin::IO::serialize(objects, target.c_str(), options, nullptr)) {
            std::fprintf(stderr, "%s: was not rewritten\n", entry.path().c_str());
            return EXIT_FAILURE;
        }
    }
    return EXIT_SUCCESS;
}
