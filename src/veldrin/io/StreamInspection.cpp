#include <veldrin/io/StreamInspection.h>

#include <veldrin/io/StreamKeys.h>
#include <veldrin/io/internal/EntryPoint.h>
#include <veldrin/io/internal/EntryTable.h>
#include <veldrin/io/internal/ItemReader.h>
#include <veldrin/io/internal/StreamHeader.h>
#include <veldrin/io/internal/StreamTypes.h>
#include <veldrin/object/Object.h>

#include <algorithm>
#include <map>
#include <utility>
#include <vector>

namespace Veldrin::IO {

namespace {

    constexpr unsigned int kFirstVersionWithTable = 5;

    /// The code in an item's frame, 0x92 and a number, as far as its first bytes tell.
    unsigned int typeCodeOf(ByteSource& source, V5::FileEntry const& entry, std::uint64_t end)
    {
        source.seek(entry.position);
        if (end - entry.position < 4 || source.take() != 0x92)
            return TypeCode::kUnknown;
        unsigned int const first = source.take();
        if (first < 0x80)
            return first;
        // Codes end at 369, so writers need no longer form.
        unsigned int const second = source.take();
        if (first == 0xCC)
            return second;
        return first == 0xCD ? second << 8 | source.take() : TypeCode::kUnknown;
    }

    void inspectEntries(ByteSource& source, StreamLayout& layout)
    {
        EntryTable const table = readEntryTable(source);
        std::vector<std::uint64_t> borders{table.itemsEnd};
        for (auto const& entry : table.entries) {
            if (entry.position < table.itemsBegin || entry.position >= table.itemsEnd)
                throw Nexil::String("Corrupt handles");
            borders.push_back(entry.position);
        }
        std::sort(borders.begin(), borders.end());

        ItemReader reader(source);
        // Any number of records may name one item; its bytes are hashed once for each role that they give it.
        std::map<std::pair<std::uint64_t, std::uint64_t>, std::uint64_t> hashes;
        auto hashOf = [&](V5::FileEntry const& entry, std::uint64_t end) {
            auto const [place, isNew] = hashes.try_emplace({entry.position, entry.mark & kRoleMask});
            if (isNew)
                place->second = reader.hashOf(
                    entry.position, end, hashSeed(table.entries.size(), layout.compressionLevel >= 1, roleOf(entry)));
            return place->second;
        };
        layout.entries.reserve(table.entries.size());
        for (auto const& entry : table.entries) {
            Nexil::Internal::throwIfJobCancelled();
            std::uint64_t const end = *std::upper_bound(borders.begin(), borders.end(), entry.position);
            auto const role = static_cast<StreamEntry::Role>(entry.mark & kRoleMask);
            bool const isIntact = !layout.hasHashes || makeMark(hashOf(entry, end), roleOf(entry)) == entry.mark;
            layout.entries.push_back({entry.position, end - entry.position, role, typeCodeOf(source, entry, end),
                                      isIntact && role != StreamEntry::Role::Unknown});
        }
    }

} // namespace

bool inspectStream(Nexil::String const& path, StreamLayout& layout, Nexil::RuntimeServices const* services)
{
    return withInputFile(path, services, [&](std::ifstream& file) {
        std::streambuf& buffer = *file.rdbuf();
        std::streamoff const size = std::streamoff(buffer.pubseekoff(0, std::ios_base::end, std::ios_base::in));
        if (size < 0 || buffer.pubseekpos(0, std::ios_base::in) != std::streampos(0))
            throw Nexil::String("Cannot read from file: ") + path;
        auto const end = static_cast<std::uint64_t>(size);

        Object header;
        ByteSource headerSource(buffer, 0, end, ByteSource::ReadAhead::None);
        readHeader(headerSource, header);
        StreamLayout found;
        found.version = headerUnsigned(header, sStreamVersion);
        found.compressionLevel = headerSigned(header, sCompressionLevel);
        found.hasHandles = headerFlag(header, sStreamHandles);
        found.hasHashes = found.version >= kCurrentVersion;
        found.byteCount = end;
        if (found.version >= kFirstVersionWithTable) {
            ByteSource source(buffer, headerSource.position(), end, ByteSource::ReadAhead::Window);
            inspectEntries(source, found);
        }
        layout = std::move(found);
        return true;
    });
}

} // namespace Veldrin::IO
