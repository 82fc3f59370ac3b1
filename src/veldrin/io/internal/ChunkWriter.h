#pragma once

#include <veldrin/io/internal/ByteSink.h>
#include <veldrin/io/internal/Packer.h>

#include <cstddef>
#include <cstdint>

namespace Veldrin::IO {

/// Writes plain values as a chunk list, [count, [chunk, ...]]. Throws `Nexil::String`.
///
/// level: below 1 chunks are the bytes themselves, else compressed at that level.
/// The environment variable VELDRIN_MAX_SERIALIZATION_ARRAY_SIZE, read at every call, lowers the most bytes of a chunk.
void writeChunks(Packer& packer, ByteSink& sink, std::byte const* bytes, std::uint64_t count, std::uint32_t elementSize,
                 int level);

} // namespace Veldrin::IO
