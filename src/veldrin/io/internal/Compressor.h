#pragma once

#include <cstddef>
#include <cstdint>

/// The block compressor behind array chunks: the only callers of c-blosc. Failures are thrown as `Nexil::String`.
namespace Veldrin::IO {

/// Bytes by which a compressed chunk can be longer than what it holds.
inline constexpr std::size_t kMaxCompressionOverhead = 16;
/// Bytes of a compressed chunk that tell its size; the least that a chunk has.
inline constexpr std::size_t kCompressedHeaderSize = 16;

/// Compresses `byteCount` bytes (at most 2147483631) into `target`, which has room for kMaxCompressionOverhead more.
/// Answers the compressed size. Throws "compression error".
[[nodiscard]] std::size_t compressChunk(int level, std::size_t elementSize, void const* bytes, std::size_t byteCount,
                                        void* target);

/// Throws "compression error" for a level that the compressor does not know, so that nothing is begun with it.
void checkLevel(int level);

/// What a chunk claims to hold.
struct CompressedHeader {
    /// False when no honest writer made this header, so that the decompressor must not see the chunk.
    bool isSound = false;
    /// Bytes after decompression.
    std::uint64_t decodedSize = 0;
    /// Bytes after decompression of each block but the last.
    std::uint64_t blockSize = 0;
};

/// Reads the header of a chunk of `chunkSize` bytes of which at least min(chunkSize, kCompressedHeaderSize) are at
/// `header`. Sound is: known format, codec LZ4 or stored bytes, its size the chunk's, block size within the decoded size and
/// 4 MiB, and decoded size at most 255 times the chunk's, which is the most that the codec can reach.
[[nodiscard]] CompressedHeader readCompressedHeader(std::byte const* header, std::uint64_t chunkSize) noexcept;

/// Decompresses a chunk into exactly `decodedSize` bytes, once more checking its header. Throws "Decompression error".
void decompressChunk(std::byte const* chunk, std::size_t chunkSize, std::byte* target, std::size_t decodedSize);

} // namespace Veldrin::IO
