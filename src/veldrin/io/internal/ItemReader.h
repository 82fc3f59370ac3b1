#pragma once

#include <veldrin/io/internal/ByteSource.h>
#include <veldrin/io/internal/Hash.h>
#include <veldrin/io/internal/Msgpack.h>

#include <array>
#include <cstddef>
#include <cstdint>
#include <vector>

namespace Veldrin::IO {

/// Most arrays and maps that may be nested in one item.
inline constexpr std::size_t kMaxNesting = 256;

/// Reads one MessagePack item after the other from a stream that is not trusted.
///
/// An item is walked first: every count and length is held against the bytes that are there, and its nesting against
/// kMaxNesting. Only then the MessagePack library unpacks it. Long binaries stay in the stream meanwhile: what the library
/// sees is a stand-in, and `readBinary` later brings the bytes straight to where they belong. So no byte of an array is
/// copied twice, and no memory is taken for bytes that are not there.
class ItemReader {
public:
    explicit ItemReader(ByteSource& source);

    /// Walks and unpacks the item at the source's position, which must end at or before `end`. The result is valid until
    /// the next call. Throws msgpack errors.
    [[nodiscard]] msgpack::object const& next(std::uint64_t end);
    /// The same, and takes the hash of the item's bytes, under `seed`, along with reading them.
    [[nodiscard]] msgpack::object const& next(std::uint64_t end, std::uint64_t hashSeed);

    /// Position behind the item.
    [[nodiscard]] std::uint64_t itemEnd() const noexcept { return itemEnd_; }

    /// True when the node is a binary.
    [[nodiscard]] static bool isBinary(msgpack::object const& node) noexcept;
    /// Number of its bytes.
    [[nodiscard]] std::uint64_t binarySize(msgpack::object const& node) const noexcept;
    /// Its first bytes: 16, or all when it has fewer.
    [[nodiscard]] std::byte const* binaryHead(msgpack::object const& node) const noexcept;
    /// All its bytes when they are in memory already, else null.
    [[nodiscard]] std::byte const* binaryInMemory(msgpack::object const& node) const noexcept;
    /// Brings its bytes to `target`. Binaries of one item are read in the order in which they stand in it.
    void readBinary(msgpack::object const& node, std::byte* target);

    /// Leaves the item: the source stands behind it. Answers the hash of its bytes when one was asked for.
    std::uint64_t finish();

    /// The hash of the bytes [begin, end), under `seed`, whatever they are.
    [[nodiscard]] std::uint64_t hashOf(std::uint64_t begin, std::uint64_t end, std::uint64_t seed);

private:
    /// A binary that was left in the stream, and the stand-in for it.
    struct LongBinary {
        std::uint64_t position; // of its first byte, behind its header
        std::uint64_t size;
        std::array<char, 5> header; // kind and length as they stand in the stream
        std::size_t standIn;        // where the stand-in starts in the skeleton
    };

    void walk(std::uint64_t end);
    void leaveInStream(std::uint64_t size, std::size_t headerBegin);
    void copyBytes(std::uint64_t count, std::uint64_t end);
    std::uint64_t copyBigEndian(unsigned int byteCount, std::uint64_t end);
    [[nodiscard]] LongBinary const* longBinary(msgpack::object const& node) const noexcept;
    void hashUpTo(std::size_t binary);
    void readHashed(std::uint64_t size, std::byte* target);
    void skipHashed(std::uint64_t size);

    ByteSource& source_;
    msgpack::zone zone_;
    msgpack::object object_;
    std::uint64_t itemEnd_ = 0;

    std::vector<char> skeleton_; // the item's bytes, long binaries replaced by stand-ins
    std::vector<LongBinary> longBinaries_;

    Hash hash_;
    bool isHashing_ = false;
    std::size_t binariesHashed_ = 0;
    std::size_t skeletonHashed_ = 0; // bytes of the skeleton, stand-ins included
    std::vector<std::byte> scratch_;
};

} // namespace Veldrin::IO
