#pragma once

#include <istream>
#include <ostream>

namespace Nexil {

/// Base of the stream wrappers through which bytes enter and leave the library. They are only constructed and
/// destroyed by callers; the standard stream behind one must outlive it.
class Stream {
public:
    Stream(Stream const&) = delete;
    Stream& operator=(Stream const&) = delete;

protected:
    Stream() = default;
    ~Stream() = default;
};

/// A standard input stream, taken for reading.
class InputStream : public Stream {
public:
    explicit InputStream(std::istream& stream) noexcept : stream_(stream) {}
    [[nodiscard]] std::istream& standardStream() noexcept { return stream_; }

private:
    std::istream& stream_;
};

/// A standard output stream, taken for writing.
class OutputStream : public Stream {
public:
    explicit OutputStream(std::ostream& stream) noexcept : stream_(stream) {}
    [[nodiscard]] std::ostream& standardStream() noexcept { return stream_; }

private:
    std::ostream& stream_;
};

} // namespace Nexil
