#pragma once

#include <cstddef>
#include <cstdint>
#include <limits>
#include <memory>
#include <streambuf>

namespace Veldrin::IO {

/// Reads a stream's bytes in order through a small window, and large runs of them straight to where they belong.
///
/// Positions are those of the stream. No byte at or behind `end` is ever asked for.
class ByteSource {
public:
    /// Which bytes are read before they are asked for.
    enum class ReadAhead {
        None,  ///< none: the stream stands exactly behind what was taken
        Window ///< up to a window: the stream must be able to seek
    };

    static constexpr std::uint64_t kUnknownEnd = std::numeric_limits<std::uint64_t>::max();

    /// The stream stands at `position`.
    ByteSource(std::streambuf& stream, std::uint64_t position, std::uint64_t end, ReadAhead readAhead);

    [[nodiscard]] std::uint64_t position() const noexcept { return windowPosition_ + taken_; }
    [[nodiscard]] std::uint64_t end() const noexcept { return end_; }
    [[nodiscard]] bool canSeek() const noexcept { return readAhead_ == ReadAhead::Window; }
    [[nodiscard]] std::uint64_t bytesLeft() const noexcept { return end_ - position(); }

    /// Takes the next byte. Throws like `read`.
    [[nodiscard]] std::uint8_t take();
    /// Takes `count` bytes into `target`. Throws msgpack::insufficient_bytes when the stream ends before.
    void read(void* target, std::size_t count);
    /// Goes to a position before the end.
    void seek(std::uint64_t position);

private:
    /// Fills the window, at least one byte; false at the end.
    bool fill();
    /// Brings the stream itself to `position`. Throws like `read` when it does not go there.
    void moveStream(std::uint64_t position);

    std::streambuf& stream_;
    std::uint64_t end_;
    ReadAhead readAhead_;
    std::size_t windowSize_;
    std::unique_ptr<char[]> window_;
    std::size_t nextFill_;   // bytes to read ahead next
    std::size_t filled_ = 0; // bytes in the window
    std::size_t taken_ = 0;  // bytes of them already taken
    std::uint64_t windowPosition_;
    std::uint64_t streamPosition_; // where the stream itself stands
};

} // namespace Veldrin::IO
