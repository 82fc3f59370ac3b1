#pragma once

#include <veldrin/io/internal/Hash.h>

#include <cstddef>
#include <cstdint>
#include <streambuf>
#include <vector>

namespace Veldrin::IO {

/// Thrown when the stream takes no more bytes.
struct WriteFailure {};

/// Writes bytes to a stream: small ones together, long runs straight from where they lie. Knows its position without
/// asking the stream, and hashes what passes.
class ByteSink {
public:
    /// The stream stands at `position`.
    ByteSink(std::streambuf& stream, std::uint64_t position);

    /// Takes bytes; they are gone out after the next `flush`. The MessagePack packer writes here. Throws WriteFailure.
    void write(char const* bytes, std::size_t byteCount);

    [[nodiscard]] std::uint64_t position() const noexcept { return streamPosition_ + buffer_.size(); }

    /// Hashes what is written from here on, until `endItem` answers the hash.
    void beginItem(std::uint64_t hashSeed);
    [[nodiscard]] std::uint64_t endItem();

    /// Hands all bytes to the stream. Throws WriteFailure.
    void flush();

private:
    void hashBuffered();
    void put(char const* bytes, std::size_t byteCount);

    std::streambuf& stream_;
    std::uint64_t streamPosition_;
    std::vector<char> buffer_;
    Hash hash_;
    bool isHashing_ = false;
    std::size_t hashed_ = 0; // bytes of the buffer that are hashed or belong to no item
};

} // namespace Veldrin::IO
