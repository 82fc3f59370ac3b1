#pragma once

#include <cstddef>
#include <cstdint>

/// Records of the entry table of versions 5 and 6.
namespace Veldrin::IO {

/// What an entry is for: the lowest two bits of its mark.
enum class EntryRole : std::uint64_t { Shared = 0, TopLevel = 1, HandleAddresses = 2 };

inline constexpr std::uint64_t kRoleMask = 3;

[[nodiscard]] constexpr std::uint64_t makeMark(std::uint64_t hash, EntryRole role) noexcept
{
    return (hash & ~kRoleMask) | static_cast<std::uint64_t>(role);
}

/// The seed under which an item is hashed. It ties the hash to what stands outside of the item, so that damage there is
/// noticed too: how many entries there are, whether chunks are compressed, and the item's role.
[[nodiscard]] constexpr std::uint64_t hashSeed(std::uint64_t entryCount, bool isCompressed, EntryRole role) noexcept
{
    return entryCount * 8 + (isCompressed ? 4 : 0) + static_cast<std::uint64_t>(role);
}

namespace V5 {

    struct FileEntry {
        std::uint64_t index = 0;
        std::uint64_t position = 0; ///< of the item's first byte in the stream
        std::uint64_t mark = 0;     ///< role and hash
    };

} // namespace V5

} // namespace Veldrin::IO
