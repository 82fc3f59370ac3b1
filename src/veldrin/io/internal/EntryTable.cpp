#include <veldrin/io/internal/EntryTable.h>

#include <nexil/String.h>
#include <veldrin/io/internal/ItemReader.h>

namespace Veldrin::IO {

namespace {

    constexpr std::uint64_t kTableOffsetSize = 9;

    std::uint64_t readTableOffset(ByteSource& source)
    {
        std::uint64_t const itemsBegin = source.position() + kTableOffsetSize;
        if (source.bytesLeft() < kTableOffsetSize || source.take() != 0xCF)
            throw Nexil::String("Corrupt stream header");
        std::uint64_t offset = 0;
        for (int i = 0; i < 8; ++i)
            offset = offset << 8 | source.take();
        if (offset < itemsBegin || offset > source.end())
            throw Nexil::String("Corrupt stream header");
        return offset;
    }

    /// Reads a number of the table, in any of the forms of an unsigned integer.
    std::uint64_t readNumber(ItemReader& reader, ByteSource& source)
    {
        try {
            auto const& item = reader.next(source.end());
            if (item.type == msgpack::type::POSITIVE_INTEGER)
                return item.via.u64;
        } catch (msgpack::type_error const&) {
        } catch (msgpack::insufficient_bytes const&) {
        }
        throw Nexil::String("Corrupt handles");
    }

} // namespace

EntryTable readEntryTable(ByteSource& source)
{
    EntryTable table;
    table.itemsBegin = source.position() + kTableOffsetSize;
    table.itemsEnd = readTableOffset(source);
    source.seek(table.itemsEnd);
    ItemReader reader(source);
    while (source.position() < source.end()) {
        V5::FileEntry entry{table.entries.size()};
        entry.position = readNumber(reader, source);
        entry.mark = readNumber(reader, source);
        table.entries.push_back(entry);
    }
    return table;
}

} // namespace Veldrin::IO
