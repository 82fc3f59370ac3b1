#pragma once

#include <veldrin/io/internal/ByteSource.h>
#include <veldrin/object/Object.h>

#include <cstdint>

/// The header object in front of every stream.
namespace Veldrin::IO {

inline constexpr unsigned int kStreamIdentifier = 6611198;
inline constexpr unsigned int kCurrentVersion = 6;
/// Headers are packed at this level, whatever level they tell.
inline constexpr int kHeaderCompressionLevel = 9;
/// Property that holds the handles' addresses: of an entry's object, in version 5 of the header.
inline constexpr char kHandleAddresses[] = "serialize_handle_addresses";

/// Fills the header of the current version. It comes about version by version: each adds its own to the one before.
void buildHeader(int compressionLevel, bool serializeHandles, Object& header);

/// Unpacks the first item of a stream into `header`, taking not one byte more. Throws `Nexil::String` "bad header" when it
/// is no object, "Incorrect zon stream identifier", and what unpacking an object throws.
void readHeader(ByteSource& source, Object& header);

/// A number of the header, of whatever integer type. 0 when it is missing or does not fit.
[[nodiscard]] unsigned int headerUnsigned(Object const& header, char const* key);
[[nodiscard]] int headerSigned(Object const& header, char const* key);
/// A flag of the header; false when it is missing.
[[nodiscard]] bool headerFlag(Object const& header, char const* key);

} // namespace Veldrin::IO
