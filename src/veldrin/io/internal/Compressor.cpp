#include <veldrin/io/internal/Compressor.h>

#include <nexil/String.h>

#include <blosc.h>

#include <algorithm>
#include <cstring>
#include <limits>
#include <thread>

namespace Veldrin::IO {

namespace {

    constexpr std::uint8_t kFormatVersion = 2;
    constexpr std::uint8_t kFlagStored = 0x02;
    constexpr unsigned int kCodecShift = 5;
    constexpr unsigned int kCodecLz4 = 1;
    constexpr int kMaxLevel = 9;
    constexpr std::uint64_t kMaxRatio = 255;
    // Four times the largest block that the compressor chooses.
    constexpr std::uint64_t kMaxBlockSize = std::uint64_t(4) << 20;
    // Decompressing less than this takes no longer than starting a thread.
    constexpr std::uint64_t kBytesPerThread = std::uint64_t(64) << 10;

    int threadCount() noexcept
    {
        // More than 256 threads make chunks of several blocks fail.
        return static_cast<int>(std::clamp(std::thread::hardware_concurrency(), 1u, 256u));
    }

    /// Each thread decompresses into two blocks of its own, and blocks are as large as a file says: together they stay
    /// below 32 MiB and an eighth of the result. Nor do many short chunks of many blocks start a thread for each.
    int decompressionThreads(std::uint64_t decodedSize, std::uint64_t blockSize) noexcept
    {
        std::uint64_t const memory = (std::uint64_t(32) << 20) + decodedSize / 8;
        std::uint64_t const most = std::min(memory / (2 * blockSize), decodedSize / kBytesPerThread);
        return static_cast<int>(std::clamp<std::uint64_t>(most, 1, static_cast<std::uint64_t>(threadCount())));
    }

    std::uint32_t littleEndian32(std::byte const* bytes) noexcept
    {
        std::uint32_t value = 0;
        for (int i = 3; i >= 0; --i)
            value = value << 8 | static_cast<std::uint32_t>(bytes[i]);
        return value;
    }

} // namespace

void checkLevel(int level)
{
    // The compressor refuses other levels too, but complains on the standard error stream.
    if (level > kMaxLevel)
        throw Nexil::String("compression error");
}

std::size_t compressChunk(int level, std::size_t elementSize, void const* bytes, std::size_t byteCount, void* target)
{
    checkLevel(level);
    int const result = blosc_compress_ctx(level, BLOSC_SHUFFLE, elementSize, byteCount, bytes, target,
                                          byteCount + kMaxCompressionOverhead, BLOSC_LZ4_COMPNAME, 0, threadCount());
    // Beyond its own limit on the size the compressor answers 0.
    if (result <= 0)
        throw Nexil::String("compression error");
    return static_cast<std::size_t>(result);
}

CompressedHeader readCompressedHeader(std::byte const* header, std::uint64_t chunkSize) noexcept
{
    if (chunkSize < kCompressedHeaderSize)
        return {};
    auto const version = static_cast<std::uint8_t>(header[0]);
    auto const flags = static_cast<std::uint8_t>(header[2]);
    bool const isStored = (flags & kFlagStored) != 0;
    std::uint64_t const decodedSize = littleEndian32(header + 4);
    std::uint64_t const blockSize = littleEndian32(header + 8);
    bool const isSound = version == kFormatVersion && header[3] != std::byte(0) &&
                         littleEndian32(header + 12) == chunkSize && (isStored || flags >> kCodecShift == kCodecLz4) &&
                         decodedSize >= 1 && decodedSize <= kMaxRatio * chunkSize && blockSize >= 1 &&
                         blockSize <= decodedSize && blockSize <= kMaxBlockSize &&
                         (!isStored || decodedSize + kCompressedHeaderSize == chunkSize);
    return {isSound, decodedSize, blockSize};
}

void decompressChunk(std::byte const* chunk, std::size_t chunkSize, std::byte* target, std::size_t decodedSize)
{
    auto const header = readCompressedHeader(chunk, chunkSize);
    std::size_t validatedSize = 0;
    bool const isSound = header.isSound && header.decodedSize == decodedSize &&
                         decodedSize <= std::numeric_limits<std::int32_t>::max() &&
                         blosc_cbuffer_validate(chunk, chunkSize, &validatedSize) == 0 && validatedSize == decodedSize;
    if (!isSound)
        throw Nexil::String("Decompression error");
    int const result =
        blosc_decompress_ctx(chunk, target, decodedSize, decompressionThreads(decodedSize, header.blockSize));
    if (result < 0 || static_cast<std::size_t>(result) != decodedSize)
        throw Nexil::String("Decompression error");
}

} // namespace Veldrin::IO
