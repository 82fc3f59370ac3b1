#pragma once

#include <support/Geometry.h>

#include <nexil/RuntimeMessage.h>
#include <veldrin/io/InputMemoryBuf.h>
#include <veldrin/io/ObjectStream.h>

#include <cstring>
#include <fstream>
#include <iterator>
#include <memory>
#include <sstream>
#include <string>
#include <vector>

/// Writing to and reading from memory, and what the library has to say meanwhile.
namespace support {

using Objects = Nexil::Array<Nexil::Ptr<Veldrin::Object>>;

class Messages : public Nexil::RuntimeServices {
public:
    void logMessage(Nexil::RuntimeMessage message) const override { heard.push_back(std::move(message)); }

    [[nodiscard]] std::vector<std::string> texts(Nexil::RuntimeMessageCategory category) const
    {
        std::vector<std::string> found;
        for (auto const& message : heard)
            if (message.category() == category)
                found.emplace_back(message.text().view());
        return found;
    }
    [[nodiscard]] std::vector<std::string> errors() const { return texts(Nexil::RuntimeMessageCategory::Error); }

    mutable std::vector<Nexil::RuntimeMessage> heard;
};

/// The objects as a stream's bytes; "" when writing failed.
inline std::string written(Objects const& objects, int level = 9, Nexil::RuntimeServices const* services = nullptr)
{
    std::ostringstream stream;
    Nexil::OutputStream output(stream);
    Veldrin::IO::SerializationOptions options;
    options.compressionLevel = level;
    return Veldrin::IO::serialize(objects, output, options, services) ? stream.str() : std::string();
}

/// All that there is to objects, sharing included: by their stream, and by their dumps, which owe nothing to the writer.
inline std::string contentOf(Objects const& objects)
{
    std::string content;
    for (auto const& object : objects)
        content += object ? dump(*object, 1000) : "null";
    return content + written(objects, 0);
}

struct ReadResult {
    bool isRead = false;
    Objects objects;
    std::vector<std::string> errors;
    std::vector<std::string> warnings;
};

/// What the library makes of the bytes, which it sees in a block of exactly their size.
inline ReadResult read(std::string const& bytes)
{
    auto const exact = std::make_unique<char[]>(bytes.size());
    std::memcpy(exact.get(), bytes.data(), bytes.size());
    Veldrin::IO::InputMemoryBuf buffer(exact.get(), bytes.size());
    std::istream stream(&buffer);
    Nexil::InputStream input(stream);
    Messages messages;
    ReadResult result;
    result.isRead = Veldrin::IO::deserialize(input, result.objects, {}, &messages);
    result.errors = messages.errors();
    result.warnings = messages.texts(Nexil::RuntimeMessageCategory::Warning);
    return result;
}

inline std::string fileBytes(std::string const& path)
{
    std::ifstream file(path, std::ios::binary);
    return {std::istreambuf_iterator<char>(file), {}};
}

} // namespace support
