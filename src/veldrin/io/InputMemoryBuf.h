#pragma once

#include <veldrin/geometry/Export.h>

#include <cstddef>
#include <streambuf>

namespace Veldrin::IO {

/// A read-only stream buffer over a block of memory that somebody else owns and keeps.
///
///     InputMemoryBuf buffer(bytes.data(), bytes.size());
///     std::istream stream(&buffer);
///     Nexil::InputStream input(stream);
///
/// Positions are byte indices from the first byte. Nothing is ever written: putting back a character that differs from
/// the one before the current fails.
/// Cost: a read is one copy. Threads: one reader at a time.
class VELDRIN_API InputMemoryBuf : public std::streambuf {
public:
    InputMemoryBuf(char const* begin, std::size_t byteCount) noexcept;
    ~InputMemoryBuf() override;

protected:
    int_type pbackfail(int_type character) override;
    std::streamsize showmanyc() override;
    int_type underflow() override;
    int_type uflow() override;
    /// The open mode is ignored; a target outside of the block fails and changes nothing.
    pos_type seekoff(off_type offset, std::ios_base::seekdir direction, std::ios_base::openmode mode) override;
    pos_type seekpos(pos_type position, std::ios_base::openmode mode) override;
    std::streamsize xsgetn(char* target, std::streamsize count) override;

private:
    char const* begin_;
    char const* end_;
    char const* current_;
};

} // namespace Veldrin::IO
