#pragma once

#include <veldrin/io/internal/ItemReader.h>
#include <veldrin/io/internal/StreamTypes.h>

#include <cstddef>
#include <cstdint>

/// Reading chunk lists, [count, [chunk, ...]]: the bytes of plain values. Failures are thrown as `Nexil::String`.
namespace Veldrin::IO {

/// Where a chunk list stands decides the messages of its faults.
enum class ChunkFraming {
    Plain, ///< by itself: math values, and all arrays of versions 1 and 2
    Framed ///< as the payload of [kind, payload]
};

/// Reads a chunk list as an array of the row's type. Nothing is allocated before the list adds up.
[[nodiscard]] Nexil::Any readTrivialArray(ItemReader& item, msgpack::object const& list, ValueRow const& row,
                                          bool isCompressed, ChunkFraming framing);

/// Reads a chunk list of one element as a value of the row's type.
[[nodiscard]] Nexil::Any readMathValue(ItemReader& item, msgpack::object const& list, ValueRow const& row,
                                       bool isCompressed);

} // namespace Veldrin::IO
