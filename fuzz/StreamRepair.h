#pragma once

#include <xxhash.h>

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <vector>

namespace fuzz {

/// Gives the entry table of a mutated stream of the current version the checksums that its items now have, as far as the
/// table can still be read. Roles, positions and everything else stay as they are.
inline void repairMarks(std::uint8_t* data, std::size_t size)
{
    constexpr std::size_t kHeaderSize = 82;
    constexpr std::size_t kLevelAt = 60;
    constexpr std::size_t kItemsAt = kHeaderSize + 9;
    auto bigEndian = [&](std::size_t at, std::size_t count) {
        std::uint64_t value = 0;
        for (std::size_t i = 0; i < count; ++i)
            value = value << 8 | data[at + i];
        return value;
    };
    if (size < kItemsAt || data[kHeaderSize] != 0xCF)
        return;
    std::uint64_t const table = bigEndian(kHeaderSize + 1, 8);
    if (table < kItemsAt || table > size)
        return;

    struct Record {
        std::uint64_t position;
        std::size_t markAt; // of the 8 bytes of a mark in its longest form
    };
    std::vector<Record> records;
    std::vector<std::uint64_t> starts{table};
    std::size_t at = table;
    while (at < size) {
        std::uint64_t position = data[at++];
        if (position >= 0xCC && position <= 0xCF) {
            std::size_t const count = std::size_t(1) << (position - 0xCC);
            if (at + count > size)
                return;
            position = bigEndian(at, count);
            at += count;
        }
        if (at + 9 > size || data[at] != 0xCF)
            return;
        records.push_back({position, at + 1});
        starts.push_back(position);
        at += 9;
    }
    std::sort(starts.begin(), starts.end());
    std::uint64_t const level = data[kLevelAt] >= 1 && data[kLevelAt] < 0x80 ? 4 : 0;
    for (Record const& record : records) {
        auto const end = std::upper_bound(starts.begin(), starts.end(), record.position);
        if (end == starts.end() || *end > table)
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
