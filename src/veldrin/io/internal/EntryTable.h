#pragma once

#include <veldrin/io/internal/ByteSource.h>
#include <veldrin/io/internal/FileEntry.h>

#include <cstdint>
#include <vector>

namespace Veldrin::IO {

/// The entry table of versions 5 and 6, and where the items that it tells of lie.
struct EntryTable {
    std::vector<V5::FileEntry> entries; ///< as they stand in the table; nothing is checked but their form
    std::uint64_t itemsBegin = 0;
    std::uint64_t itemsEnd = 0;
};

[[nodiscard]] inline EntryRole roleOf(V5::FileEntry const& entry) noexcept
{
    return static_cast<EntryRole>(entry.mark & kRoleMask);
}

/// Reads the table offset at the source's position, which lies behind the header, and the table at the end. Throws
/// `Nexil::String` "Corrupt stream header" and "Corrupt handles".
[[nodiscard]] EntryTable readEntryTable(ByteSource& source);

} // namespace Veldrin::IO
