#include <veldrin/io/internal/ByteSink.h>

#include <nexil/JobCancel.h>
#include <nexil/parallel/Parallel.h>

#include <algorithm>

namespace Veldrin::IO {

namespace {

    // Streams pass on what they get in large portions, so the portions are made here.
    constexpr std::size_t kBufferBytes = std::size_t(2) << 20;
    // Runs from here on skip the buffer.
    constexpr std::size_t kLongRunBytes = std::size_t(64) << 10;
    // Bytes that the stream gets at once: between two of them cancellation is asked for.
    constexpr std::size_t kPieceBytes = std::size_t(1) << 20;
    // Runs from here on are hashed beside being written: hashing takes a fifth of the time of writing.
    constexpr std::size_t kHashBesideFromBytes = std::size_t(1) << 20;

} // namespace

ByteSink::ByteSink(std::streambuf& stream, std::uint64_t position) : stream_(stream), streamPosition_(position) {}

void ByteSink::write(char const* bytes, std::size_t byteCount)
{
    if (byteCount < kLongRunBytes) {
        if (buffer_.size() + byteCount > kBufferBytes)
            flush();
        buffer_.insert(buffer_.end(), bytes, bytes + byteCount);
        return;
    }
    flush();
    auto hashRun = [&] {
        if (isHashing_)
            hash_.add(bytes, byteCount);
    };
    auto putRun = [&] {
        for (std::size_t done = 0; done < byteCount; done += kPieceBytes) {
            Nexil::Internal::throwIfJobCancelled();
            put(bytes + done, std::min(byteCount - done, kPieceBytes));
        }
    };
    if (byteCount >= kHashBesideFromBytes) {
        Nexil::parallel::invoke(hashRun, putRun);
    } else {
        hashRun();
        putRun();
    }
}

void ByteSink::beginItem(std::uint64_t hashSeed)
{
    hash_.restart(hashSeed);
    hashed_ = buffer_.size();
    isHashing_ = true;
}

std::uint64_t ByteSink::endItem()
{
    hashBuffered();
    isHashing_ = false;
    return hash_.digest();
}

void ByteSink::flush()
{
    hashBuffered();
    put(buffer_.data(), buffer_.size());
    buffer_.clear();
    hashed_ = 0;
}

void ByteSink::hashBuffered()
{
    if (isHashing_)
        hash_.add(buffer_.data() + hashed_, buffer_.size() - hashed_);
    hashed_ = buffer_.size();
}

void ByteSink::put(char const* bytes, std::size_t byteCount)
{
    if (byteCount == 0)
        return;
    auto const put = stream_.sputn(bytes, static_cast<std::streamsize>(byteCount));
    if (put != static_cast<std::streamsize>(byteCount))
        throw WriteFailure();
    streamPosition_ += byteCount;
}

} // namespace Veldrin::IO
