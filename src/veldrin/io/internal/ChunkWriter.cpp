#include <veldrin/io/internal/ChunkWriter.h>

#include <nexil/Array.h>
#include <nexil/JobCancel.h>
#include <nexil/String.h>
#include <veldrin/io/internal/Compressor.h>

#include <algorithm>
#include <cstdlib>
#include <limits>

namespace Veldrin::IO {

namespace {

    constexpr std::uint64_t kMaxCompressedChunk = 2147483631;
    constexpr std::uint64_t kMaxStoredChunk = 4294967295;
    constexpr std::uint64_t kMaxChunkCount = 4294967295;

    /// The leading decimal number of `text`, 0 when there is none, the largest that fits when it is larger.
    std::uint64_t leadingNumber(char const* text)
    {
        while (*text == ' ' || (*text >= '\t' && *text <= '\r'))
            ++text;
        bool const isNegative = *text == '-';
        if (*text == '-' || *text == '+')
            ++text;
        std::uint64_t value = 0;
        for (; *text >= '0' && *text <= '9'; ++text) {
            auto const digit = static_cast<std::uint64_t>(*text - '0');
            if (value > (std::numeric_limits<std::uint64_t>::max() - digit) / 10)
                return isNegative ? 0 : std::numeric_limits<std::uint64_t>::max();
            value = value * 10 + digit;
        }
        return isNegative ? 0 : value;
    }

    std::uint64_t chunkLimit(std::uint64_t most)
    {
        char const* const text = std::getenv("VELDRIN_MAX_SERIALIZATION_ARRAY_SIZE");
        return text ? std::clamp<std::uint64_t>(leadingNumber(text), 1, most) : most;
    }

    void writeBinary(Packer& packer, ByteSink& sink, char const* bytes, std::uint64_t byteCount)
    {
        packer.pack_bin(static_cast<std::uint32_t>(byteCount));
        sink.write(bytes, static_cast<std::size_t>(byteCount));
    }

} // namespace

void writeChunks(Packer& packer, ByteSink& sink, std::byte const* bytes, std::uint64_t count, std::uint32_t elementSize,
                 int level)
{
    bool const isCompressed = level >= 1;
    std::uint64_t const limit = chunkLimit(isCompressed ? kMaxCompressedChunk : kMaxStoredChunk);
    std::uint64_t const byteSize = count * elementSize;
    std::uint64_t const chunkCount = byteSize / limit + (byteSize % limit != 0);
    if (chunkCount > kMaxChunkCount)
        throw Nexil::String(isCompressed ? "chunk limit exceeded" : "Array too large to serialize");

    packer.pack_array(2);
    packer.pack_uint64(count);
    packer.pack_array(static_cast<std::uint32_t>(chunkCount));
    Nexil::Array<char> compressed;
    if (isCompressed)
        Nexil::Internal::resizeUninitialized(compressed, std::min(byteSize, limit) + kMaxCompressionOverhead);
    auto const* next = reinterpret_cast<char const*>(bytes);
    for (std::uint64_t left = byteSize; left != 0;) {
        Nexil::Internal::throwIfJobCancelled();
        std::uint64_t const size = std::min(left, limit);
        if (isCompressed)
            writeBinary(packer, sink, compressed.data(),
                        compressChunk(level, elementSize, next, static_cast<std::size_t>(size), compressed.data()));
        else
            writeBinary(packer, sink, next, size);
        next += size;
        left -= size;
    }
}

} // namespace Veldrin::IO
