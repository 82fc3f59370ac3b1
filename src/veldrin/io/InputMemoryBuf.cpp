#include <veldrin/io/InputMemoryBuf.h>

#include <algorithm>
#include <cstring>

namespace Veldrin::IO {

// The get area of the base stays empty, so every read comes here and `current_` is the only position.

InputMemoryBuf::InputMemoryBuf(char const* begin, std::size_t byteCount) noexcept
    : begin_(begin), end_(begin + byteCount), current_(begin)
{
}

InputMemoryBuf::~InputMemoryBuf() = default;

InputMemoryBuf::int_type InputMemoryBuf::pbackfail(int_type character)
{
    if (current_ == begin_)
        return traits_type::eof();
    // The byte before is compared as a signed character: a byte above 127 can be stepped back over, not be named.
    if (character != traits_type::eof() && character != static_cast<signed char>(current_[-1]))
        return traits_type::eof();
    --current_;
    return traits_type::to_int_type(*current_);
}

std::streamsize InputMemoryBuf::showmanyc()
{
    return end_ - current_;
}

InputMemoryBuf::int_type InputMemoryBuf::underflow()
{
    return current_ == end_ ? traits_type::eof() : traits_type::to_int_type(*current_);
}

InputMemoryBuf::int_type InputMemoryBuf::uflow()
{
    return current_ == end_ ? traits_type::eof() : traits_type::to_int_type(*current_++);
}

InputMemoryBuf::pos_type InputMemoryBuf::seekoff(off_type offset, std::ios_base::seekdir direction,
                                                 std::ios_base::openmode)
{
    off_type const size = end_ - begin_;
    off_type base = 0;
    if (direction == std::ios_base::cur)
        base = current_ - begin_;
    else if (direction == std::ios_base::end)
        base = size;
    else if (direction != std::ios_base::beg)
        return pos_type(off_type(-1));
    // Compared without adding first: base and size are small, offset is anything.
    if (offset < -base || offset > size - base)
        return pos_type(off_type(-1));
    current_ = begin_ + base + offset;
    return pos_type(base + offset);
}

InputMemoryBuf::pos_type InputMemoryBuf::seekpos(pos_type position, std::ios_base::openmode mode)
{
    return seekoff(off_type(position), std::ios_base::beg, mode);
}

std::streamsize InputMemoryBuf::xsgetn(char* target, std::streamsize count)
{
    auto const available = std::min<std::streamsize>(count, end_ - current_);
    if (available <= 0)
        return 0;
    std::memcpy(target, current_, static_cast<std::size_t>(available));
    current_ += available;
    return available;
}

} // namespace Veldrin::IO
