#pragma once

#include <nexil/Array.h>
#include <nexil/parallel/Parallel.h>

#include <algorithm>
#include <cstdint>

/// Loops over masks, byte by byte. A flag is a byte of 0 or 1, and rules on bytes compile to vector instructions where
/// the same rules on bool do not.
namespace Veldrin::Geometry::MaskLoops {

using Byte = unsigned char;
using Mask = Nexil::Array<bool>;

// Long enough that a task costs little beside it, short enough that a mask of a million flags feeds many cores.
constexpr std::size_t kFlagsPerTask = 65536;

constexpr auto kUnion = [](Byte left, Byte right) { return static_cast<Byte>(left | right); };
constexpr auto kIntersection = [](Byte left, Byte right) { return static_cast<Byte>(left & right); };
constexpr auto kDifference = [](Byte left, Byte right) { return static_cast<Byte>(left & (right ^ 1)); };
constexpr auto kComplement = [](Byte flag) { return static_cast<Byte>(flag ^ 1); };

inline Byte const* bytes(Mask const& mask) noexcept
{
    return reinterpret_cast<Byte const*>(mask.data());
}
inline Byte* bytes(Mask& mask) noexcept
{
    return reinterpret_cast<Byte*>(mask.data());
}

/// Calls run(begin, count) over disjoint chunks of [0, count).
template <class Run>
void forChunks(std::size_t count, Run const& run)
{
    Nexil::parallel::forRangeToTheEnd(count, kFlagsPerTask,
                                      [&run](std::size_t begin, std::size_t end) { run(begin, end - begin); });
}

// The loops themselves take plain values: a byte that is written may be part of anything that is read through a
// reference, which would then be read again for every byte.

template <class Rule>
void changeBytes(Byte* out, std::size_t count, Rule rule)
{
    for (std::size_t i = 0; i < count; ++i)
        out[i] = rule(out[i]);
}

template <class Rule>
void changeBytesBy(Byte* out, Byte const* in, std::size_t count, Rule rule)
{
    for (std::size_t i = 0; i < count; ++i)
        out[i] = rule(out[i], in[i]);
}

template <class Rule>
void fillBytes(Byte* out, Byte const* in, std::size_t count, Rule rule)
{
    for (std::size_t i = 0; i < count; ++i)
        out[i] = rule(in[i]);
}

template <class Rule>
void fillBytes(Byte* out, Byte const* a, Byte const* b, std::size_t count, Rule rule)
{
    for (std::size_t i = 0; i < count; ++i)
        out[i] = rule(a[i], b[i]);
}

/// target[i] = rule(target[i]).
template <class Rule>
void changeEach(Mask& target, Rule const& rule)
{
    forChunks(target.size(), [&, out = bytes(target)](std::size_t begin, std::size_t count) {
        changeBytes(out + begin, count, rule);
    });
}

/// target[i] = rule(target[i], other[i]) over the shorter of both.
template <class Rule>
void changeBy(Mask& target, Mask const& other, Rule const& rule)
{
    forChunks(std::min(target.size(), other.size()),
              [&, out = bytes(target), in = bytes(other)](std::size_t begin, std::size_t count) {
                  changeBytesBy(out + begin, in + begin, count, rule);
              });
}

/// target[i] = rule(source[i]) for a target that is as large as the source and no part of it.
template <class Rule>
void fill(Mask& target, Mask const& source, Rule const& rule)
{
    forChunks(target.size(), [&, out = bytes(target), in = bytes(source)](std::size_t begin, std::size_t count) {
        fillBytes(out + begin, in + begin, count, rule);
    });
}

/// target[i] = rule(left[i], right[i]) over the shorter of both, right[i] beyond it, for a target that is as large as
/// `right` and no part of either.
template <class Rule>
void fill(Mask& target, Mask const& left, Mask const& right, Rule const& rule)
{
    std::size_t const shared = std::min(left.size(), right.size());
    forChunks(shared,
              [&, out = bytes(target), a = bytes(left), b = bytes(right)](std::size_t begin, std::size_t count) {
                  fillBytes(out + begin, a + begin, b + begin, count, rule);
              });
    std::copy(right.begin() + shared, right.end(), target.begin() + shared);
}

} // namespace Veldrin::Geometry::MaskLoops
