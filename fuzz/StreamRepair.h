#pragma once

#include <xxhash.h>

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <optional>
#include <vector>

namespace fuzz {

/// Gives the entry table of a mutated stream of the current version the checksums that its items now have, as far as the
/// table can still be read. Roles, positions and everything else stay as they are.
inline void repairMarks(std::uint8_t* data, std::size_t size)
{
    constexpr std::size_t kHeaderSize = 82;
    constexpr std::size_t kLevelAt = 60;
    constexpr std::size_t kItemsAt = kHeaderSize + 9;
    std::size_t at = kHeaderSize;
    // The next number, of the 8 bytes of the longest form or of fewer.
    auto const next = [&]() -> std::optional<std::uint64_t> {
        if (at >= size || (data[at] >= 0x80 && (data[at] < 0xCC || data[at] > 0xCF)))
            return {};
        std::size_t const count = data[at] < 0x80 ? 0 : std::size_t(1) << (data[at] - 0xCC);
        std::uint64_t value = count == 0 ? data[at] : 0;
        if (count >= size - at)
            return {};
        for (std::size_t i = 1; i <= count; ++i)
            value = value << 8 | data[at + i];
        at += count + 1;
        return value;
    };
    auto const table = next();
    if (!table || at != kItemsAt || *table < kItemsAt || *table > size)
        return;

    struct Record {
        std::uint64_t position;
        std::size_t markAt;
    };
    std::vector<Record> records;
    std::vector<std::uint64_t> starts{*table};
    for (at = *table; at < size;) {
        auto const position = next();
        std::size_t const mark = at;
        if (!position || !next() || at != mark + 9)
            return;
        records.push_back({*position, mark + 1});
        starts.push_back(*position);
    }
    std::sort(starts.begin(), starts.end());
    std::uint64_t const level = data[kLevelAt] >= 1 && data[kLevelAt] < 0x80 ? 4 : 0;
    for (Record const& record : records) {
        auto const end = std::upper_bound(starts.begin(), starts.end(), record.position);
        if (end == starts.end() || *end > *table)
            continue;
        std::uint64_t const role = data[record.markAt + 7] & 3u;
        std::uint64_t const seed = records.size() * 8 + level + role;
        std::uint64_t mark =
            (XXH3_64bits_withSeed(data + record.position, *end - record.position, seed) & ~3ull) | role;
        for (std::size_t i = 8; i-- > 0; mark >>= 8)
            data[record.markAt + i] = static_cast<std::uint8_t>(mark & 0xFF);
    }
}

} // namespace fuzz
