#include "EntryTable.h"

#include "Command.h"
#include "ValueRows.h"

#include <fmt/format.h>

#define XXH_INLINE_ALL
#include <xxhash.h>

#include <algorithm>
#include <fstream>
#include <memory>

namespace Zon {

namespace {

    constexpr std::uint64_t kTableOffsetSize = 9;

    struct Record {
        std::uint64_t position;
        std::uint64_t mark;
    };

    /// The unsigned integer at `at`, in any of the forms that writers use; moves behind it.
    std::uint64_t takeUnsigned(std::string_view bytes, std::size_t& at)
    {
        if (at >= bytes.size())
            throw Failure("the entry table ends within a record");
        auto const first = static_cast<unsigned char>(bytes[at++]);
        if (first < 0x80)
            return first;
        if (first < 0xCC || first > 0xCF)
            throw Failure("the entry table holds something else than numbers");
        std::size_t const byteCount = std::size_t(1) << (first - 0xCC);
        if (bytes.size() - at < byteCount)
            throw Failure("the entry table ends within a record");
        std::uint64_t value = 0;
        for (std::size_t i = 0; i < byteCount; ++i)
            value = value << 8 | static_cast<unsigned char>(bytes[at++]);
        return value;
    }

    std::string readAt(std::ifstream& file, std::uint64_t position, std::uint64_t byteCount)
    {
        std::string bytes(static_cast<std::size_t>(byteCount), '\0');
        file.clear();
        file.seekg(static_cast<std::streamoff>(position));
        file.read(bytes.data(), static_cast<std::streamsize>(byteCount));
        bytes.resize(static_cast<std::size_t>(file.gcount()));
        return bytes;
    }

    std::vector<Record> readTable(std::ifstream& file, ZonHeader const& header, std::uint64_t& tablePosition)
    {
        auto const offset = readAt(file, header.size, kTableOffsetSize);
        std::size_t at = 0;
        if (offset.size() != kTableOffsetSize || offset[0] != '\xCF')
            throw Failure("the place of the entry table is missing");
        tablePosition = takeUnsigned(offset, at);
        std::uint64_t const first = header.size + kTableOffsetSize;
        if (tablePosition < first || tablePosition > header.fileSize)
            throw Failure("the entry table lies outside of the file");
        auto const bytes = readAt(file, tablePosition, header.fileSize - tablePosition);
        std::vector<Record> records;
        for (at = 0; at < bytes.size();) {
            auto const position = takeUnsigned(bytes, at);
            auto const mark = takeUnsigned(bytes, at);
            if (position < first || position >= tablePosition)
                throw Failure("the entry table points outside of the values");
            records.push_back({position, mark});
        }
        return records;
    }

    std::uint64_t hashOf(std::ifstream& file, std::uint64_t position, std::uint64_t byteCount, std::uint64_t seed)
    {
        constexpr std::uint64_t kPiece = 1 << 20;
        std::unique_ptr<XXH3_state_t, decltype(&XXH3_freeState)> const state(XXH3_createState(), &XXH3_freeState);
        XXH3_64bits_reset_withSeed(state.get(), seed);
        for (std::uint64_t done = 0; done < byteCount; done += kPiece) {
            auto const bytes = readAt(file, position + done, std::min(kPiece, byteCount - done));
            XXH3_64bits_update(state.get(), bytes.data(), bytes.size());
        }
        return XXH3_64bits_digest(state.get());
    }

    /// The type that an item's frame [code, payload] names.
    std::string typeOfItem(std::string_view bytes)
    {
        if (bytes.empty() || bytes[0] != '\x92')
            return "";
        try {
            std::size_t at = 1;
            return typeNameOfCode(takeUnsigned(bytes, at));
        } catch (Failure const&) {
            return "";
        }
    }

} // namespace

std::vector<EntryState> checkEntries(std::string const& path, ZonHeader const& header)
{
    std::ifstream file(path, std::ios::binary);
    std::uint64_t tablePosition = 0;
    auto const records = readTable(file, header, tablePosition);
    std::vector<std::uint64_t> ends;
    for (auto const& record : records)
        ends.push_back(record.position);
    ends.push_back(tablePosition);
    std::sort(ends.begin(), ends.end());

    std::vector<EntryState> entries;
    for (auto const& record : records) {
        EntryState entry;
        entry.position = record.position;
        entry.byteCount = *std::upper_bound(ends.begin(), ends.end(), record.position) - record.position;
        entry.role = record.mark & 3u;
        entry.type = typeOfItem(readAt(file, record.position, std::min<std::uint64_t>(entry.byteCount, 12)));
        std::uint64_t const seed = 8 * records.size() + (header.level >= 1 ? 4u : 0u) + entry.role;
        std::uint64_t const hash = hashOf(file, entry.position, entry.byteCount, seed);
        entry.isIntact = hash >> 2 == record.mark >> 2 && entry.role != 3;
        entries.push_back(std::move(entry));
    }
    return entries;
}

} // namespace Zon
