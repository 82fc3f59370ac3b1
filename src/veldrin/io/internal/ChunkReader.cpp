#include <veldrin/io/internal/ChunkReader.h>

#include <nexil/Array.h>
#include <nexil/String.h>
#include <nexil/parallel/Parallel.h>
#include <veldrin/io/internal/Compressor.h>

#include <algorithm>
#include <limits>

namespace Veldrin::IO {

namespace {

    constexpr std::size_t kPagesGrainBytes = std::size_t(1) << 20;

    /// All pages of a fresh block, taken by all threads at once. Huge ones too, few as they are: the threads of the
    /// decompressor write close to each other, and where two come upon one such page at once, both clear it.
    void takePages(std::byte* bytes, std::uint64_t byteCount)
    {
        Nexil::parallel::forRange(
            static_cast<std::size_t>(byteCount), kPagesGrainBytes,
            [&](std::size_t begin, std::size_t end) { Nexil::Internal::takePages(bytes + begin, end - begin); });
    }

    class ChunkList {
    public:
        ChunkList(ItemReader& item, msgpack::object const& list, std::uint32_t elementSize, bool isCompressed,
                  ChunkFraming framing)
            : item_(item), isCompressed_(isCompressed), framing_(framing)
        {
            if (list.type != msgpack::type::ARRAY || list.via.array.size != 2)
                throwMalformed();
            count_ = list.via.array.ptr[0].as<std::uint64_t>();
            auto const& chunks = list.via.array.ptr[1];
            if (chunks.type != msgpack::type::ARRAY)
                throwMalformed();
            first_ = chunks.via.array.ptr;
            last_ = first_ + chunks.via.array.size;
            if (!std::all_of(first_, last_, &ItemReader::isBinary))
                throwMalformed();
            constexpr auto kMost = std::numeric_limits<std::uint64_t>::max();
            byteSize_ = count_ > kMost / elementSize ? kMost : count_ * elementSize;
            addUp();
        }

        [[nodiscard]] std::uint64_t count() const noexcept { return count_; }

        /// Brings the elements to `target`, which has room for all of them.
        void load(std::byte* target)
        {
            std::byte* const end = target + byteSize_;
            for (auto const* chunk = first_; chunk != last_; ++chunk)
                target += isCompressed_ ? loadCompressed(*chunk, target) : loadStored(*chunk, target);
            std::fill(target, end, std::byte(0));
        }

    private:
        /// Holds the sizes of all chunks against the number of elements.
        void addUp() const
        {
            std::uint64_t total = 0;
            for (auto const* chunk = first_; chunk != last_; ++chunk) {
                std::uint64_t const size = decodedSize(*chunk);
                if (size > byteSize_ - total)
                    throwOverrun();
                total += size;
            }
            if (total != byteSize_)
                checkShortfall();
        }

        [[nodiscard]] std::uint64_t decodedSize(msgpack::object const& chunk) const
        {
            std::uint64_t const size = item_.binarySize(chunk);
            if (!isCompressed_)
                return size;
            auto const header = readCompressedHeader(item_.binaryHead(chunk), size);
            if (!header.isSound)
                throw Nexil::String("Decompression error");
            return header.decodedSize;
        }

        [[noreturn]] void throwOverrun() const
        {
            if (framing_ == ChunkFraming::Framed)
                throw Nexil::String("Corrupt array");
            throw Nexil::String(isCompressed_ ? "Decompression error" : "Error reading array chunks");
        }

        void checkShortfall() const
        {
            if (framing_ == ChunkFraming::Framed)
                throw Nexil::String("Corrupt array deserialized");
            if (isCompressed_)
                throw Nexil::String("Decompression error");
            // Missing bytes of a plain list are zeros, but memory is not taken for more than one value on their account.
            if (count_ > 1)
                throw Nexil::String("Error reading array chunks");
        }

        std::uint64_t loadStored(msgpack::object const& chunk, std::byte* target)
        {
            item_.readBinary(chunk, target);
            return item_.binarySize(chunk);
        }

        std::uint64_t loadCompressed(msgpack::object const& chunk, std::byte* target)
        {
            std::uint64_t const size = item_.binarySize(chunk);
            // From the header that was held against the array: a file can change between two looks at it.
            auto const decoded = static_cast<std::size_t>(decodedSize(chunk));
            auto const* bytes = item_.binaryInMemory(chunk);
            if (!bytes) {
                Nexil::Internal::resizeUninitialized(compressed_, size);
                takePages(compressed_.data(), size);
                item_.readBinary(chunk, compressed_.data());
                bytes = compressed_.data();
            }
            decompressChunk(bytes, static_cast<std::size_t>(size), target, decoded);
            return decoded;
        }

        ItemReader& item_;
        bool isCompressed_;
        ChunkFraming framing_;
        std::uint64_t count_ = 0;
        std::uint64_t byteSize_ = 0;
        msgpack::object const* first_ = nullptr;
        msgpack::object const* last_ = nullptr;
        Nexil::Array<std::byte> compressed_; // one chunk at a time
    };

    /// A `bool` is 0 or 1 in memory, whatever byte a file holds.
    void normaliseBools(std::byte* bytes, std::uint64_t byteCount)
    {
        std::transform(bytes, bytes + byteCount, bytes,
                       [](std::byte byte) { return static_cast<std::byte>(byte != std::byte(0)); });
    }

} // namespace

Nexil::Any readTrivialArray(ItemReader& item, msgpack::object const& list, ValueRow const& row, bool isCompressed,
                            ChunkFraming framing)
{
    ChunkList chunks(item, list, row.elementSize, isCompressed, framing);
    NewArray array = row.newArray(chunks.count());
    takePages(array.bytes, chunks.count() * row.elementSize);
    chunks.load(array.bytes);
    if (row.holdsBools)
        normaliseBools(array.bytes, chunks.count() * row.elementSize);
    return std::move(array.pointer);
}

Nexil::Any readMathValue(ItemReader& item, msgpack::object const& list, ValueRow const& row, bool isCompressed)
{
    ChunkList chunks(item, list, row.elementSize, isCompressed, ChunkFraming::Plain);
    if (chunks.count() != 1)
        throw Nexil::String("Error reading array chunks");
    alignas(16) std::byte value[128]{};
    chunks.load(value);
    if (row.holdsBools)
        normaliseBools(value, row.elementSize);
    return row.fromBytes(value);
}

} // namespace Veldrin::IO
