#include <veldrin/io/internal/ByteSource.h>

#include <veldrin/io/internal/Msgpack.h>

#include <algorithm>
#include <cstring>

namespace Veldrin::IO {

namespace {

    constexpr std::size_t kWindowBytes = std::size_t(64) << 10;
    // Behind a jump often only the few bytes up to the next one are wanted: reading ahead begins small and doubles.
    constexpr std::size_t kFirstFillBytes = std::size_t(2) << 10;

} // namespace

ByteSource::ByteSource(std::streambuf& stream, std::uint64_t position, std::uint64_t end, ReadAhead readAhead)
    : stream_(stream), end_(end), readAhead_(readAhead),
      windowSize_(readAhead == ReadAhead::None
                      ? 1
                      : static_cast<std::size_t>(std::min<std::uint64_t>(kWindowBytes, end - position + 1))),
      window_(std::make_unique_for_overwrite<char[]>(windowSize_)), nextFill_(kFirstFillBytes),
      windowPosition_(position), streamPosition_(position)
{
}

bool ByteSource::fill()
{
    std::uint64_t const next = position();
    std::size_t const wanted =
        static_cast<std::size_t>(std::min<std::uint64_t>(std::min(windowSize_, nextFill_), end_ - next));
    nextFill_ = std::min(nextFill_ * 2, kWindowBytes);
    moveStream(next);
    auto const got = wanted == 0 ? 0 : stream_.sgetn(window_.get(), static_cast<std::streamsize>(wanted));
    windowPosition_ = next;
    taken_ = 0;
    filled_ = static_cast<std::size_t>(std::max<std::streamsize>(got, 0));
    streamPosition_ += filled_;
    return filled_ != 0;
}

void ByteSource::moveStream(std::uint64_t position)
{
    if (streamPosition_ == position)
        return;
    auto const target = std::streampos(static_cast<std::streamoff>(position));
    if (stream_.pubseekpos(target, std::ios_base::in) != target)
        throwTruncated();
    streamPosition_ = position;
}

std::uint8_t ByteSource::take()
{
    if (taken_ == filled_ && !fill())
        throwTruncated();
    return static_cast<std::uint8_t>(window_[taken_++]);
}

void ByteSource::read(void* target, std::size_t count)
{
    if (count > bytesLeft())
        throwTruncated();
    auto* out = static_cast<char*>(target);
    while (count != 0) {
        if (taken_ == filled_ && count >= windowSize_) {
            std::uint64_t const next = position();
            moveStream(next);
            auto const got = stream_.sgetn(out, static_cast<std::streamsize>(count));
            filled_ = taken_ = 0;
            windowPosition_ = streamPosition_ = next + static_cast<std::uint64_t>(std::max<std::streamsize>(got, 0));
            if (windowPosition_ != next + count)
                throwTruncated();
            return;
        }
        if (taken_ == filled_ && !fill())
            throwTruncated();
        std::size_t const piece = std::min(count, filled_ - taken_);
        std::memcpy(out, window_.get() + taken_, piece);
        taken_ += piece;
        out += piece;
        count -= piece;
    }
}

void ByteSource::seek(std::uint64_t position)
{
    if (position >= windowPosition_ && position <= windowPosition_ + filled_) {
        taken_ = static_cast<std::size_t>(position - windowPosition_);
        return;
    }
    // The next fill moves the stream itself.
    windowPosition_ = position;
    filled_ = taken_ = 0;
    nextFill_ = kFirstFillBytes;
}

} // namespace Veldrin::IO
