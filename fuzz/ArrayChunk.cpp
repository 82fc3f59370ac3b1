/// One array of any type in a stream of one object: its count, how its chunk is packed, and the bytes of the chunk are the
/// input. Mutants are mostly chunks that the compressor made, or that at least tell their own size.

#include <support/StreamDescription.h>
#include <support/Streams.h>

#include <blosc.h>

#include <algorithm>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <string>
#include <vector>

extern "C" std::size_t LLVMFuzzerMutate(std::uint8_t* data, std::size_t size, std::size_t maxSize);

namespace {

// What the input begins with: type code (2 bytes), version (1), how it is packed (1), number of elements (4).
constexpr std::size_t kHeadSize = 8;
constexpr std::size_t kChunkHeaderSize = 16;
constexpr std::size_t kPlaceOfChunkSize = 12;

void check(bool condition)
{
    if (!condition)
        std::abort();
}

void putNumber(std::string& item, std::uint64_t number, int byteCount)
{
    for (int shift = 8 * (byteCount - 1); shift >= 0; shift -= 8)
        item += static_cast<char>(number >> shift);
}

std::string number(std::uint64_t value)
{
    std::string item = "\xcf";
    putNumber(item, value, 8);
    return item;
}

std::string text(std::string const& value)
{
    std::string item = "\xdb";
    putNumber(item, value.size(), 4);
    return item + value;
}

std::string binary(std::string const& value)
{
    std::string item = "\xc6";
    putNumber(item, value.size(), 4);
    return item + value;
}

std::string list(std::vector<std::string> const& items)
{
    std::string item = "\xdd";
    putNumber(item, items.size(), 4);
    for (auto const& each : items)
        item += each;
    return item;
}

std::string numberFrame(unsigned int code, std::uint64_t value)
{
    return list({number(code), number(value)});
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
    auto const chunks =
        cut < bytes.size() ? list({binary(bytes.substr(0, cut)), binary(bytes.substr(cut))}) : list({binary(bytes)});
    auto const payload = list({number(count), chunks});
    bool const isBare = version < 3 || (code >= 12 && code < 120);
    auto const object = list({text("p"), list({number(code), isBare ? payload : list({number(0), payload})})});

    std::vector<std::string> head{text("file_identifier"), numberFrame(2, 6611198),   text("file_version"),
                                  numberFrame(2, version), text("compression_level"), numberFrame(6, packing & 1)};
    if (version > 3) {
        head.push_back(text("serialize_handles"));
        head.push_back(list({number(10), "\xc2"}));
    }
    auto const header = list(head);
    if (version < 5)
        return header + object;
    auto const item = list({number(362), object});
    auto const position = header.size() + 9;
    return header + number(position + item.size()) + item + number(position) + number(1);
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
    if (size < kHeadSize)
        return 0;
    auto const found = support::read(streamOf(data, size));
    check(found.isRead ? found.errors.empty() : found.errors.size() <= 1 && found.objects.empty());
    if (!found.isRead)
        return 0;
    auto const again = support::read(support::written(found.objects, 9));
    check(again.isRead && support::describeObjects(again.objects) == support::describeObjects(found.objects));
    return 0;
}
