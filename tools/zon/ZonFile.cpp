#include "ZonFile.h"

#include "Command.h"
#include "Console.h"
#include "OutputFile.h"

#include <nexil/Stream.h>
#include <veldrin/io/ObjectStream.h>
#include <veldrin/io/StreamKeys.h>
#include <veldrin/object/Properties.h>

#include <fmt/format.h>

#include <sys/stat.h>

#include <algorithm>
#include <cerrno>
#include <fstream>
#include <streambuf>
#include <utility>

namespace Zon {

namespace {

    // Folders open like files and then fail without a reason.
    void checkReadable(std::string const& path, std::ifstream& file)
    {
        struct stat status {};
        if (stat(path.c_str(), &status) == 0 && S_ISDIR(status.st_mode))
            throw Failure(fmt::format("{}: cannot be read: {}", path, errorText(EISDIR)));
        if (S_ISFIFO(status.st_mode) || S_ISSOCK(status.st_mode))
            throw Failure(
                fmt::format("{}: cannot be read: a pipe gives its bytes only once; put them into a file", path));
        errno = 0;
        file.open(path, std::ios::binary);
        if (!file)
            throw Failure(fmt::format("{}: cannot be read: {}", path, errorText(errno ? errno : EIO)));
    }

    /// A number of the header, of whatever integer type; 0 when it is missing or does not fit.
    template <class Target>
    Target integerUnder(Veldrin::Object const& header, char const* key)
    {
        auto const value = header.getProperty(key);
        Target result = 0;
        auto const take = [&](auto const* number) {
            if (number && std::in_range<Target>(*number))
                result = static_cast<Target>(*number);
        };
        take(value.get<unsigned char>());
        take(value.get<unsigned short>());
        take(value.get<unsigned int>());
        take(value.get<unsigned long long>());
        take(value.get<signed char>());
        take(value.get<short>());
        take(value.get<int>());
        take(value.get<long long>());
        return result;
    }

    /// Takes bytes and keeps only how many there were.
    class CountingBuffer : public std::streambuf {
    public:
        [[nodiscard]] std::uint64_t size() const noexcept { return size_; }

    protected:
        std::streamsize xsputn(char const*, std::streamsize count) override
        {
            advance(position_ + static_cast<std::uint64_t>(count));
            return count;
        }
        int_type overflow(int_type character) override
        {
            advance(position_ + 1);
            return traits_type::not_eof(character);
        }
        pos_type seekoff(off_type offset, std::ios_base::seekdir direction, std::ios_base::openmode) override
        {
            auto const base = direction == std::ios_base::beg   ? off_type(0)
                              : direction == std::ios_base::cur ? static_cast<off_type>(position_)
                                                                : static_cast<off_type>(size_);
            if (base + offset < 0)
                return pos_type(off_type(-1));
            position_ = static_cast<std::uint64_t>(base + offset);
            return pos_type(base + offset);
        }
        pos_type seekpos(pos_type position, std::ios_base::openmode mode) override
        {
            return seekoff(off_type(position), std::ios_base::beg, mode);
        }

    private:
        void advance(std::uint64_t position) noexcept
        {
            position_ = position;
            size_ = size_ < position ? position : size_;
        }

        std::uint64_t position_ = 0;
        std::uint64_t size_ = 0;
    };

} // namespace

void Messages::logMessage(Nexil::RuntimeMessage message) const
{
    if (message.category() == Nexil::RuntimeMessageCategory::Error)
        error_ = std::string(message.text().view());
    else
        warn(message.text().view());
}

std::string Messages::errorText() const
{
    return error_.empty() ? "of no version that can be read" : error_;
}

ZonHeader readZonHeader(std::string const& path)
{
    std::ifstream file;
    checkReadable(path, file);
    Nexil::InputStream stream(file);
    auto const object = Veldrin::createObject();
    Messages messages;
    if (!Veldrin::IO::deserializeHeader(stream, *object, &messages))
        throw Failure(fmt::format("{}: no zon file: {}", path, messages.errorText()));
    ZonHeader header;
    header.version = integerUnder<unsigned int>(*object, Veldrin::IO::sStreamVersion);
    header.level = integerUnder<int>(*object, Veldrin::IO::sCompressionLevel);
    header.hasHandles = Veldrin::getPropertyAs<bool>(*object, Veldrin::IO::sStreamHandles);
    file.seekg(0, std::ios::end);
    header.fileSize = static_cast<std::uint64_t>(std::streamoff(file.tellg()));
    return header;
}

Objects readZon(std::string const& path)
{
    std::ifstream file;
    checkReadable(path, file);
    file.close();
    Objects objects;
    Messages messages;
    if (!Veldrin::IO::deserialize(Nexil::String(std::string_view(path)), objects, {}, &messages))
        throw Failure(fmt::format("{}: {}", path, messages.errorText()));
    return objects;
}

void writeZon(Objects const& objects, std::string const& path, int level)
{
    OutputFile file(path);
    Veldrin::IO::SerializationOptions options;
    options.compressionLevel = level;
    Messages messages;
    errno = 0;
    if (!Veldrin::IO::serialize(objects, Nexil::String(std::string_view(file.pathToWrite())), options, &messages)) {
        // What the system said is not part of the library's message, and the file it names is not the one asked for.
        int const systemError = errno;
        bool const isWriteFault = messages.errorText().starts_with("Cannot ");
        throw Failure(fmt::format("{}: {}", path,
                                  isWriteFault && systemError != 0 ? "cannot be written: " + errorText(systemError)
                                  : isWriteFault                   ? "cannot be written"
                                                                   : messages.errorText()));
    }
    file.commit();
}

void rewriteZon(Objects const& objects, std::string const& input, std::string const& output)
{
    auto const header = readZonHeader(input);
    if (header.hasHandles)
        warn(input + ": its list of handles is not kept");
    writeZon(objects, output.empty() ? input : output, std::clamp(header.level, 0, 9));
}

std::uint64_t streamSize(Objects const& objects, int level)
{
    CountingBuffer buffer;
    std::ostream standard(&buffer);
    Nexil::OutputStream stream(standard);
    Veldrin::IO::SerializationOptions options;
    options.compressionLevel = level;
    Messages messages;
    if (!Veldrin::IO::serialize(objects, stream, options, &messages))
        throw Failure(messages.errorText());
    return buffer.size();
}

} // namespace Zon
