#include <veldrin/io/internal/StreamHeader.h>

#include <veldrin/io/StreamKeys.h>
#include <veldrin/io/internal/ItemReader.h>
#include <veldrin/io/internal/UnpackVisitor.h>
#include <veldrin/object/Properties.h>

#include <optional>
#include <utility>

namespace Veldrin::IO {

char const* const sStreamIdentifier = "file_identifier";
char const* const sStreamVersion = "file_version";
char const* const sCompressionLevel = "compression_level";
char const* const sStreamHandles = "serialize_handles";

namespace {

    void buildHeader1(int compressionLevel, Object& header)
    {
        setProperty(header, sStreamIdentifier, kStreamIdentifier);
        setProperty(header, sStreamVersion, 1u);
        setProperty(header, sCompressionLevel, compressionLevel);
    }

    void buildHeader2(int compressionLevel, Object& header)
    {
        buildHeader1(compressionLevel, header);
        setProperty(header, sStreamVersion, 2u);
    }

    void buildHeader3(int compressionLevel, Object& header)
    {
        buildHeader2(compressionLevel, header);
        setProperty(header, sStreamVersion, 3u);
    }

    void buildHeader4(int compressionLevel, bool serializeHandles, Object& header)
    {
        buildHeader3(compressionLevel, header);
        setProperty(header, sStreamVersion, 4u);
        setProperty(header, sStreamHandles, serializeHandles);
    }

    void buildHeader5(int compressionLevel, bool serializeHandles, Object& header)
    {
        buildHeader4(compressionLevel, serializeHandles, header);
        setProperty(header, sStreamVersion, 5u);
    }

    void buildHeader6(int compressionLevel, bool serializeHandles, Object& header)
    {
        buildHeader5(compressionLevel, serializeHandles, header);
        setProperty(header, sStreamVersion, kCurrentVersion);
    }

    template <class Target, class... Integers>
    Target integerAs(Nexil::Any const& value)
    {
        Target result = 0;
        auto tryType = [&]<class Integer>(Integer const* number) {
            if (number && std::in_range<Target>(*number))
                result = static_cast<Target>(*number);
        };
        (tryType(value.get<Integers>()), ...);
        return result;
    }

    template <class Target>
    Target anyIntegerAs(Nexil::Any const& value)
    {
        return integerAs<Target, unsigned char, unsigned short, unsigned int, unsigned long long, signed char, short,
                         int, long long>(value);
    }

} // namespace

void buildHeader(int compressionLevel, bool serializeHandles, Object& header)
{
    buildHeader6(compressionLevel, serializeHandles, header);
}

void readHeader(ByteSource& source, Object& header)
{
    ItemReader reader(source);
    auto const& item = reader.next(source.end());
    if (item.type != msgpack::type::ARRAY)
        throw Nexil::String("bad header");
    Object unpacked;
    V3::UnpackVisitor(reader, true, nullptr, nullptr).unpackObject(item, unpacked);
    if (headerUnsigned(unpacked, sStreamIdentifier) != kStreamIdentifier)
        throw Nexil::String("Incorrect zon stream identifier");
    moveProperties(unpacked, header);
}

unsigned int headerUnsigned(Object const& header, char const* key)
{
    return anyIntegerAs<unsigned int>(header.getProperty(key));
}

int headerSigned(Object const& header, char const* key)
{
    return anyIntegerAs<int>(header.getProperty(key));
}

bool headerFlag(Object const& header, char const* key)
{
    return getPropertyAs<bool>(header, key);
}

} // namespace Veldrin::IO
