#include <veldrin/io/internal/ItemReader.h>

#include <algorithm>
#include <cstring>

namespace Veldrin::IO {

namespace {

    // From here on a binary is worth two seeks.
    constexpr std::uint64_t kLongBinaryBytes = std::uint64_t(64) << 10;

    // Bytes that are read at once while they are hashed: they are still in the cache when the hash comes by.
    constexpr std::size_t kHashedPieceBytes = std::size_t(512) << 10;

    // A stand-in is an extension item of a kind that no stream may hold: number of the binary, first 16 bytes.
    constexpr std::uint8_t kExt8 = 0xC7;
    constexpr char kStandInKind = 1;
    constexpr std::size_t kHeadSize = 16;
    constexpr std::size_t kStandInPayload = sizeof(std::uint32_t) + kHeadSize;
    constexpr std::size_t kStandInSize = 3 + kStandInPayload;

    bool alwaysByReference(msgpack::type::object_type, std::size_t, void*)
    {
        return true;
    }

} // namespace

ItemReader::ItemReader(ByteSource& source) : source_(source) {}

msgpack::object const& ItemReader::next(std::uint64_t end)
{
    isHashing_ = false;
    walk(end);
    zone_.clear();
    std::size_t offset = 0;
    bool referenced = false;
    object_ = msgpack::unpack(zone_, skeleton_.data(), skeleton_.size(), offset, referenced, &alwaysByReference);
    return object_;
}

msgpack::object const& ItemReader::next(std::uint64_t end, std::uint64_t hashSeed)
{
    auto const& object = next(end);
    isHashing_ = true;
    binariesHashed_ = 0;
    skeletonHashed_ = 0;
    hash_.restart(hashSeed);
    return object;
}

bool ItemReader::isBinary(msgpack::object const& node) noexcept
{
    return node.type == msgpack::type::BIN || node.type == msgpack::type::EXT;
}

ItemReader::LongBinary const* ItemReader::longBinary(msgpack::object const& node) const noexcept
{
    if (node.type != msgpack::type::EXT)
        return nullptr;
    std::uint32_t index;
    std::memcpy(&index, node.via.ext.data(), sizeof(index));
    return &longBinaries_[index];
}

std::uint64_t ItemReader::binarySize(msgpack::object const& node) const noexcept
{
    auto const* binary = longBinary(node);
    return binary ? binary->size : node.via.bin.size;
}

std::byte const* ItemReader::binaryHead(msgpack::object const& node) const noexcept
{
    return longBinary(node) ? reinterpret_cast<std::byte const*>(node.via.ext.data() + sizeof(std::uint32_t))
                            : binaryInMemory(node);
}

std::byte const* ItemReader::binaryInMemory(msgpack::object const& node) const noexcept
{
    return node.type == msgpack::type::BIN ? reinterpret_cast<std::byte const*>(node.via.bin.ptr) : nullptr;
}

void ItemReader::readBinary(msgpack::object const& node, std::byte* target)
{
    auto const* binary = longBinary(node);
    if (!binary) {
        if (node.via.bin.size != 0)
            std::memcpy(target, node.via.bin.ptr, node.via.bin.size);
        return;
    }
    if (isHashing_)
        hashUpTo(static_cast<std::size_t>(binary - longBinaries_.data()));
    source_.seek(binary->position);
    if (isHashing_) {
        readHashed(binary->size, target);
        ++binariesHashed_;
    } else {
        source_.read(target, static_cast<std::size_t>(binary->size));
    }
}

std::uint64_t ItemReader::finish()
{
    std::uint64_t hash = 0;
    if (isHashing_) {
        hashUpTo(longBinaries_.size());
        hash = hash_.digest();
    }
    source_.seek(itemEnd_);
    return hash;
}

std::uint64_t ItemReader::hashOf(std::uint64_t begin, std::uint64_t end, std::uint64_t seed)
{
    hash_.restart(seed);
    source_.seek(begin);
    skipHashed(end - begin);
    return hash_.digest();
}

void ItemReader::hashUpTo(std::size_t binary)
{
    for (;;) {
        bool const isLast = binariesHashed_ == longBinaries_.size();
        std::size_t const runEnd = isLast ? skeleton_.size() : longBinaries_[binariesHashed_].standIn;
        hash_.add(skeleton_.data() + skeletonHashed_, runEnd - skeletonHashed_);
        skeletonHashed_ = runEnd;
        if (isLast)
            return;
        LongBinary const& next = longBinaries_[binariesHashed_];
        hash_.add(next.header.data(), next.header.size());
        skeletonHashed_ += kStandInSize;
        if (binariesHashed_ == binary)
            return;
        // Nobody asked for this one.
        source_.seek(next.position);
        skipHashed(next.size);
        ++binariesHashed_;
    }
}

void ItemReader::readHashed(std::uint64_t size, std::byte* target)
{
    while (size != 0) {
        auto const piece = static_cast<std::size_t>(std::min<std::uint64_t>(size, kHashedPieceBytes));
        source_.read(target, piece);
        hash_.add(target, piece);
        target += piece;
        size -= piece;
    }
}

void ItemReader::skipHashed(std::uint64_t size)
{
    scratch_.resize(static_cast<std::size_t>(std::min<std::uint64_t>(size, kHashedPieceBytes)));
    while (size != 0) {
        auto const piece = static_cast<std::size_t>(std::min<std::uint64_t>(size, kHashedPieceBytes));
        source_.read(scratch_.data(), piece);
        hash_.add(scratch_.data(), piece);
        size -= piece;
    }
}

void ItemReader::copyBytes(std::uint64_t count, std::uint64_t end)
{
    if (count > end - source_.position())
        throwTruncated();
    // In pieces, so that memory grows with the bytes that really come.
    while (count != 0) {
        auto const piece = static_cast<std::size_t>(std::min<std::uint64_t>(count, kHashedPieceBytes));
        std::size_t const at = skeleton_.size();
        skeleton_.resize(at + piece);
        source_.read(skeleton_.data() + at, piece);
        count -= piece;
    }
}

std::uint64_t ItemReader::copyBigEndian(unsigned int byteCount, std::uint64_t end)
{
    std::size_t const at = skeleton_.size();
    copyBytes(byteCount, end);
    std::uint64_t value = 0;
    for (std::size_t i = at; i < skeleton_.size(); ++i)
        value = value << 8 | static_cast<unsigned char>(skeleton_[i]);
    return value;
}

void ItemReader::leaveInStream(std::uint64_t size, std::size_t headerBegin)
{
    LongBinary binary{source_.position(), size, {}, headerBegin};
    std::copy_n(skeleton_.begin() + static_cast<std::ptrdiff_t>(headerBegin), binary.header.size(),
                binary.header.begin());
    auto const index = static_cast<std::uint32_t>(longBinaries_.size());
    skeleton_.resize(headerBegin + kStandInSize);
    char* const standIn = skeleton_.data() + headerBegin;
    standIn[0] = static_cast<char>(kExt8);
    standIn[1] = static_cast<char>(kStandInPayload);
    standIn[2] = kStandInKind;
    std::memcpy(standIn + 3, &index, sizeof(index));
    source_.read(standIn + 3 + sizeof(index), kHeadSize);
    source_.seek(binary.position + size);
    longBinaries_.push_back(binary);
}

void ItemReader::walk(std::uint64_t end)
{
    skeleton_.clear();
    longBinaries_.clear();
    end = std::min(end, source_.end());

    std::array<std::uint64_t, kMaxNesting> owed; // items still to come in each open array or map
    std::size_t depth = 0;
    auto open = [&](std::uint64_t count) {
        if (count > end - source_.position() || depth == kMaxNesting)
            throwMalformed();
        owed[depth++] = count;
    };

    do {
        if (depth != 0)
            --owed[depth - 1];
        if (source_.position() >= end)
            throwTruncated();
        std::size_t const begin = skeleton_.size();
        std::uint8_t const first = source_.take();
        skeleton_.push_back(static_cast<char>(first));
        if (first < 0x80 || first >= 0xE0) {
            // a small integer
        } else if (first < 0x90) {
            open(std::uint64_t(first & 0x0Fu) * 2);
        } else if (first < 0xA0) {
            open(first & 0x0Fu);
        } else if (first < 0xC0) {
            copyBytes(first & 0x1Fu, end);
        } else {
            switch (first) {
            case 0xC0:
            case 0xC2:
            case 0xC3: break; // nil, false, true
            case 0xC4:
            case 0xC5:
            case 0xC6: { // binary
                std::uint64_t const size = copyBigEndian(1u << (first - 0xC4), end);
                if (size > end - source_.position())
                    throwTruncated();
                if (size >= kLongBinaryBytes && source_.canSeek())
                    leaveInStream(size, begin);
                else
                    copyBytes(size, end);
                break;
            }
            case 0xCA: copyBytes(4, end); break; // float 32
            case 0xCB: copyBytes(8, end); break; // float 64
            case 0xCC:
            case 0xD0: copyBytes(1, end); break; // 8-bit integers
            case 0xCD:
            case 0xD1: copyBytes(2, end); break; // 16-bit integers
            case 0xCE:
            case 0xD2: copyBytes(4, end); break; // 32-bit integers
            case 0xCF:
            case 0xD3: copyBytes(8, end); break; // 64-bit integers
            case 0xD9:
            case 0xDA:
            case 0xDB: // string
                copyBytes(copyBigEndian(1u << (first - 0xD9), end), end);
                break;
            case 0xDC:
            case 0xDD: open(copyBigEndian(2u << (first - 0xDC), end)); break; // array
            case 0xDE:
            case 0xDF: open(copyBigEndian(2u << (first - 0xDE), end) * 2); break; // map
            default: throwMalformed(); // never used, or an extension, which no stream holds
            }
        }
        while (depth != 0 && owed[depth - 1] == 0)
            --depth;
    } while (depth != 0);
    itemEnd_ = source_.position();
}

} // namespace Veldrin::IO
