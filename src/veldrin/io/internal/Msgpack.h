#pragma once

/// The MessagePack library with its version 1 interface, and what we take from it.

#include <msgpack.hpp>

namespace Veldrin::IO {

/// Thrown for items that are not what the format asks for; reported as "Unknown msgpack error occurred".
[[noreturn]] inline void throwMalformed()
{
    throw msgpack::type_error();
}

/// Thrown for items that end before their last byte; reported the same way.
[[noreturn]] inline void throwTruncated()
{
    throw msgpack::insufficient_bytes("truncated item");
}

} // namespace Veldrin::IO
