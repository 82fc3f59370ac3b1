/// One array of any type in a stream of one object: its count, how its chunk is packed, and the bytes of the chunk are the
/// input. Mutants are mostly chunks that the compressor made, or that at least tell their own size.

#include "StreamCheck.h"

#include <blosc.h>
#include <msgpack.hpp>

#include <algorithm>
#include <cstdint>
#include <cstring>
#include <sstream>
#include <string>

extern "C" std::size_t LLVMFuzzerMutate(std::uint8_t* data, std::size_t size, std::size_t maxSize);

namespace {

// What the input begins with: type code (2 bytes), version (1), how it is packed (1), number of elements (4).
constexpr std::size_t kHeadSize = 8;
constexpr std::size_t kChunkHeaderSize = 16;
constexpr std::size_t kPlaceOfChunkSize = 12;

/// What write(packer) packs.
template <class Write>
std::string packed(Write const& write)
{
    std::ostringstream stream;
    msgpack::packer<std::ostream> packer(stream);
    write(packer);
    return stream.str();
}

template <class Packer>
void packBytes(Packer& packer, std::string const& bytes)
{
    packer.pack_bin(static_cast<std::uint32_t>(bytes.size()));
    packer.pack_bin_body(bytes.data(), static_cast<std::uint32_t>(bytes.size()));
}

template <class Packer>
void packFrame(Packer& packer, unsigned int code, std::uint64_t value)
{
    packer.pack_array(2).pack(code).pack(value);
}

/// The stream whose one array the input describes.
std::string streamOf(std::uint8_t const* data, std::size_t size)
{
    unsigned int const code = (data[0] + 256u * data[1]) % 260;
    unsigned int const version = 1 + data[2] % 5;
    unsigned int const packing = data[3];
    std::uint32_t count = 0;
    std::memcpy(&count, data + 4, sizeof count);
    std::string const bytes(reinterpret_cast<char const*>(data + kHeadSize), size - kHeadSize);
    // One chunk, or two with the cut anywhere.
    auto const cut = packing & 2 ? bytes.size() * (packing >> 2) / 64 : bytes.size();
    bool const isBare = version < 3 || (code >= 12 && code < 120);
    auto const object = packed([&](auto& packer) {
        packer.pack_array(2).pack("p").pack_array(2).pack(code);
        if (!isBare)
            packer.pack_array(2).pack(0);
        packer.pack_array(2).pack(count).pack_array(cut < bytes.size() ? 2 : 1);
        packBytes(packer, bytes.substr(0, cut));
        if (cut < bytes.size())
            packBytes(packer, bytes.substr(cut));
    });
    auto const header = packed([&](auto& packer) {
        packer.pack_array(version > 3 ? 8 : 6);
        packFrame(packer.pack("file_identifier"), 2, 6611198);
        packFrame(packer.pack("file_version"), 2, version);
        packFrame(packer.pack("compression_level"), 6, packing & 1);
        if (version > 3)
            packer.pack("serialize_handles").pack_array(2).pack(10).pack(false);
    });
    if (version < 5)
        return header + object;
    auto const item = packed([](auto& packer) { packer.pack_array(2).pack(362); }) + object;
    auto const position = header.size() + 9;
    return header + packed([&](auto& packer) { packer.pack_fix_uint64(position + item.size()); }) + item +
           packed([&](auto& packer) { packer.pack(position).pack(1); });
}

} // namespace

extern "C" std::size_t LLVMFuzzerCustomMutator(std::uint8_t* data, std::size_t size, std::size_t maxSize,
                                               unsigned int seed)
{
    size = LLVMFuzzerMutate(data, size, maxSize);
    if (size <= kHeadSize)
        return size;
    auto* const chunk = data + kHeadSize;
    auto chunkSize = size - kHeadSize;
    if (seed % 4 == 0) {
        std::string const plain(reinterpret_cast<char const*>(chunk), chunkSize);
        auto const packed = blosc_compress_ctx(9, BLOSC_SHUFFLE, 1 + seed / 4 % 16, plain.size(), plain.data(), chunk,
                                               maxSize - kHeadSize, "lz4", 0, 1);
        chunkSize = packed > 0 ? static_cast<std::size_t>(packed) : chunkSize;
        auto const elements = static_cast<std::uint32_t>(plain.size() >> (seed / 64 % 5));
        std::memcpy(data + 4, &elements, sizeof elements);
    }
    if (seed % 4 < 3 && chunkSize >= kChunkHeaderSize) {
        auto const told = static_cast<std::uint32_t>(chunkSize);
        std::memcpy(chunk + kPlaceOfChunkSize, &told, sizeof told);
    }
    return kHeadSize + chunkSize;
}

extern "C" int LLVMFuzzerTestOneInput(std::uint8_t const* data, std::size_t size)
{
    if (size >= kHeadSize)
        fuzz::checkStream(streamOf(data, size));
    return 0;
}
