#pragma once

#include <nexil/Array.h>
#include <nexil/RuntimeMessage.h>
#include <nexil/String.h>
#include <veldrin/geometry/Export.h>

#include <cstdint>

/// Looks at how a stream is laid out, without making objects of it: for tools that report on files.
namespace Veldrin::IO {

/// One record of a stream's entry table.
struct StreamEntry {
    enum class Role : unsigned int { Shared = 0, TopLevel = 1, HandleAddresses = 2, Unknown = 3 };

    std::uint64_t position = 0;  ///< of the item's first byte in the file
    std::uint64_t byteCount = 0; ///< of the item; slots that hold one object share an item
    Role role = Role::Unknown;
    /// Type code of the item, as docs/zon-format.md lists them; 0xFFFFFFFF when its bytes do not tell.
    unsigned int typeCode = 0xFFFFFFFF;
    /// Whether the item's bytes have the hash that the table tells; true in version 5, which has none.
    bool isIntact = false;
};

/// A stream's layout.
struct StreamLayout {
    unsigned int version = 0;
    int compressionLevel = 0;
    bool hasHandles = false;
    bool hasHashes = false;
    std::uint64_t byteCount = 0;       ///< of the whole file
    Nexil::Array<StreamEntry> entries; ///< by number; empty before version 5, which has no table
};

/// Reads the header and the entry table of the file `path` and checks the hash of every item.
///
/// layout: untouched on failure. Damaged items are no failure: see `StreamEntry::isIntact`.
/// Errors: false with one message, as `deserialize` gives it, when header or table cannot be read.
/// Cost: one pass over the file's bytes; no memory but the table.
VELDRIN_API bool inspectStream(Nexil::String const& path, StreamLayout& layout, Nexil::RuntimeServices const* services);

} // namespace Veldrin::IO
