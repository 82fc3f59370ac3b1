#pragma once

#include "ZonFile.h"

#include <cstdint>
#include <string>
#include <vector>

namespace Zon {

/// One entry of a file's table, and whether its item's bytes are those that were written.
struct EntryState {
    std::uint64_t position = 0;
    std::uint64_t byteCount = 0;
    unsigned int role = 0; ///< 0 shared value, 1 top-level slot, 2 handle addresses
    std::string type;      ///< as far as the item's first bytes tell
    bool isIntact = false;
};

/// The entries of a file from version 6 on, each with its hash checked. The items themselves are not read.
/// Errors: Failure that says why the table cannot be read.
[[nodiscard]] std::vector<EntryState> checkEntries(std::string const& path, ZonHeader const& header);

} // namespace Zon
