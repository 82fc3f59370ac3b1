#include <veldrin/io/ObjectStream.h>

#include <nexil/JobCancel.h>
#include <veldrin/io/InputMemoryBuf.h>
#include <veldrin/io/StreamKeys.h>
#include <veldrin/io/internal/ByteSink.h>
#include <veldrin/io/internal/ByteSource.h>
#include <veldrin/io/internal/Compressor.h>
#include <veldrin/io/internal/EntryPoint.h>
#include <veldrin/io/internal/Msgpack.h>
#include <veldrin/io/internal/StreamHeader.h>
#include <veldrin/io/internal/StreamReader.h>
#include <veldrin/io/internal/StreamWriter.h>
#include <veldrin/volume/internal/ProxyDescription.h>

#include <cstring>
#include <fstream>
#include <stdexcept>
#include <vector>

namespace Veldrin::IO {

namespace {

    using Objects = Nexil::Array<Nexil::Ptr<Object>>;

    bool writeReported(Objects const& objects, WriterContext const& context, Nexil::OutputStream& stream)
    {
        return runReported(context.services, "Cannot write to stream", [&] {
            writeStream(objects, context, stream.standardStream());
            return true;
        });
    }

    /// Position of a stream that can seek, or -1.
    std::streamoff seekablePosition(std::streambuf& buffer)
    {
        return std::streamoff(buffer.pubseekoff(0, std::ios_base::cur, std::ios_base::in));
    }

    std::vector<char> readAll(std::streambuf& buffer)
    {
        std::vector<char> bytes;
        for (;;) {
            // Memory grows with what really came.
            std::size_t const have = bytes.size();
            bytes.resize(have + std::max<std::size_t>(have / 2, 64 << 10));
            auto const got = buffer.sgetn(bytes.data() + have, static_cast<std::streamsize>(bytes.size() - have));
            bytes.resize(have + static_cast<std::size_t>(got));
            if (got == 0)
                return bytes;
        }
    }

    /// Once everything is read: a stream that fails is told by its failure alone.
    void warnOfDamaged(Geometry::Internal::ProxyRebuilder const& proxies, Nexil::RuntimeServices const* services)
    {
        if (!services)
            return;
        for (Nexil::String const& name : proxies.damaged()) {
            Nexil::String text = "Volume component '";
            text += name;
            text += "' is damaged. It is kept as a plain object.";
            services->logMessage({Nexil::RuntimeMessageCategory::Warning, text});
        }
    }

    bool readObjects(std::streambuf& buffer, std::uint64_t position, std::uint64_t end, Objects& objects,
                     Nexil::RuntimeServices const* services)
    {
        Object header;
        ByteSource headerSource(buffer, position, end, ByteSource::ReadAhead::None);
        readHeader(headerSource, header);
        unsigned int const version = headerUnsigned(header, sStreamVersion);
        if (version == 0)
            return false;
        ByteSource source(buffer, headerSource.position(), end, ByteSource::ReadAhead::Window);
        Geometry::Internal::ProxyRebuilder proxies;
        objects = version <= 4 ? readSequentialStream(source, header, version)
                               : readEntryStream(source, header, version >= kCurrentVersion, &proxies);
        warnOfDamaged(proxies, services);
        return true;
    }

    bool readStream(std::istream& stream, Objects& objects, Nexil::RuntimeServices const* services)
    {
        std::streambuf* const buffer = stream.rdbuf();
        if (!buffer)
            throwTruncated();
        std::streamoff const position = seekablePosition(*buffer);
        std::streamoff const end =
            position < 0 ? -1 : std::streamoff(buffer->pubseekoff(0, std::ios_base::end, std::ios_base::in));
        if (end < position || end < 0) {
            std::vector<char> const bytes = readAll(*buffer);
            InputMemoryBuf memory(bytes.data(), bytes.size());
            return readObjects(memory, 0, bytes.size(), objects, services);
        }
        if (buffer->pubseekpos(std::streampos(position), std::ios_base::in) != std::streampos(position))
            throwTruncated();
        bool const isRead = readObjects(*buffer, static_cast<std::uint64_t>(position), static_cast<std::uint64_t>(end),
                                        objects, services);
        buffer->pubseekpos(std::streampos(end), std::ios_base::in);
        return isRead;
    }

    /// Reads a stream whole before the first object is appended: also the last step, leaving the stream, may fail.
    bool appendObjects(std::istream& stream, Objects& out, Nexil::RuntimeServices const* services)
    {
        Objects objects;
        if (!readStream(stream, objects, services))
            return false;
        out.reserve(out.size() + objects.size());
        for (auto& object : objects)
            out.push_back(std::move(object));
        return true;
    }

    bool readHeaderOnly(std::istream& stream, Object& header)
    {
        std::streambuf* const buffer = stream.rdbuf();
        if (!buffer)
            throwTruncated();
        std::streamoff const position = std::max<std::streamoff>(seekablePosition(*buffer), 0);
        ByteSource source(*buffer, static_cast<std::uint64_t>(position), ByteSource::kUnknownEnd,
                          ByteSource::ReadAhead::None);
        readHeader(source, header);
        return true;
    }

} // namespace

bool serialize(Objects const& objects, Nexil::String const& path, SerializationOptions const& options,
               Nexil::RuntimeServices const* services)
{
    WriterContext const context{options, false, {}, services};
    return runReported(services, Nexil::String("Cannot write to file: ") + path, [&] {
        // Before the file is opened, which empties it.
        checkLevel(options.compressionLevel);
        std::ofstream file(systemPath(path, kCannotOpenForWriting),
                           std::ios_base::out | std::ios_base::binary | std::ios_base::trunc);
        if (!file)
            throw Nexil::String(kCannotOpenForWriting) + path;
        writeStream(objects, context, file);
        file.close();
        if (!file)
            throw WriteFailure();
        return true;
    });
}

bool serialize(Objects const& objects, Nexil::OutputStream& stream, SerializationOptions const& options,
               Nexil::RuntimeServices const* services)
{
    return writeReported(objects, {options, false, {}, services}, stream);
}

bool serialize(Nexil::Array<Nexil::Ptr<Object>*> const& handles, Nexil::OutputStream& stream,
               SerializationOptions const& options, Nexil::RuntimeServices const* services)
{
    Objects objects;
    objects.reserve(handles.size());
    auto addresses = Nexil::makeMutable<Nexil::Array<unsigned long long>>();
    addresses->reserve(handles.size());
    for (auto const* handle : handles) {
        objects.push_back(handle ? *handle : Nexil::Ptr<Object>());
        addresses->push_back(reinterpret_cast<unsigned long long>(handle));
    }
    return writeReported(objects, {options, true, std::move(addresses), services}, stream);
}

bool deserialize(Nexil::InputStream& stream, Objects& out, DeserializationOptions const&,
                 Nexil::RuntimeServices const* services)
{
    return runReported(services, "Cannot read from stream",
                       [&] { return appendObjects(stream.standardStream(), out, services); });
}

bool deserialize(Nexil::String const& path, Objects& out, DeserializationOptions const&,
                 Nexil::RuntimeServices const* services)
{
    return withInputFile(path, services, [&](std::istream& file) { return appendObjects(file, out, services); });
}

bool deserializeHeader(Nexil::InputStream& stream, Object& header, Nexil::RuntimeServices const* services)
{
    return runReported(services, "Cannot read from stream",
                       [&] { return readHeaderOnly(stream.standardStream(), header); });
}

bool deserializeHeader(Nexil::String const& path, Object& header, Nexil::RuntimeServices const* services)
{
    return withInputFile(path, services, [&](std::istream& file) { return readHeaderOnly(file, header); });
}

} // namespace Veldrin::IO
