#include <veldrin/io/internal/StreamWriter.h>

#include <nexil/parallel/Parallel.h>
#include <veldrin/io/internal/ByteSink.h>
#include <veldrin/io/internal/FileEntry.h>
#include <veldrin/io/internal/ObjectGraph.h>
#include <veldrin/io/internal/PackVisitor.h>
#include <veldrin/io/internal/StreamHeader.h>
#include <veldrin/object/Properties.h>

#include <algorithm>
#include <vector>

namespace Veldrin::IO {

namespace {

    // Below this many entries a sort is done before another thread has woken up.
    constexpr std::size_t kParallelSortFrom = 500;

    /// The table's position, always in the 9-byte form, so that it can be written over in place.
    void writeTableOffset(ByteSink& sink, std::uint64_t position)
    {
        char bytes[9] = {static_cast<char>(0xCF)};
        for (int i = 8; i >= 1; --i) {
            bytes[i] = static_cast<char>(position & 0xFF);
            position >>= 8;
        }
        sink.write(bytes, sizeof(bytes));
    }

    void sortByIndex(std::vector<V5::FileEntry>& entries)
    {
        auto const less = [](V5::FileEntry const& a, V5::FileEntry const& b) { return a.index < b.index; };
        if (entries.size() < kParallelSortFrom)
            std::sort(entries.begin(), entries.end(), less);
        else
            Nexil::parallel::sort(entries.begin(), entries.end(), less);
        for (std::size_t i = 0; i < entries.size(); ++i)
            if (entries[i].index != i)
                throw Nexil::String("FileEntry sorting error");
    }

    class StreamWriter {
    public:
        StreamWriter(ByteSink& sink, WriterContext const& context, ObjectGraph const& graph, std::uint64_t slotCount)
            : sink_(sink), context_(context), graph_(graph), slotCount_(slotCount),
              entryCount_(graph.entries().size() + (context.serializeHandles ? 1 : 0)),
              pack_(sink, context.options.compressionLevel, &graph, context.services)
        {
        }

        /// Writes all items; answers their records in the order of their numbers.
        std::vector<V5::FileEntry> writeItems()
        {
            std::vector<V5::FileEntry> records;
            records.reserve(entryCount_);
            std::vector<std::size_t> recordOfSlot(slotCount_);
            for (std::uint64_t const number : graph_.writeOrder()) {
                if (number < slotCount_)
                    recordOfSlot[number] = records.size();
                EntryRole const role = number < slotCount_ ? EntryRole::TopLevel : EntryRole::Shared;
                records.push_back(writeItem(number, role, pack_, graph_.entries()[number].pointer));
            }
            for (std::uint64_t slot = 0; slot < slotCount_; ++slot) {
                std::uint64_t const same = graph_.entries()[slot].sameAs;
                if (same == slot)
                    continue;
                V5::FileEntry record = records[recordOfSlot[same]];
                record.index = slot;
                records.push_back(record);
            }
            if (context_.serializeHandles)
                records.push_back(writeHandleAddresses());
            sortByIndex(records);
            return records;
        }

    private:
        V5::FileEntry writeItem(std::uint64_t number, EntryRole role, V3::PackVisitor& pack, Nexil::Any const& pointer)
        {
            Nexil::Internal::throwIfJobCancelled();
            V5::FileEntry record{number, sink_.position(), 0};
            sink_.beginItem(hashSeed(entryCount_, context_.options.compressionLevel >= 1, role));
            pack.packEntry(pointer);
            record.mark = makeMark(sink_.endItem(), role);
            return record;
        }

        V5::FileEntry writeHandleAddresses()
        {
            auto object = createObject();
            setProperty(*object, kHandleAddresses, context_.handleAddresses);
            V3::PackVisitor inlinePack(sink_, context_.options.compressionLevel, nullptr, context_.services);
            return writeItem(entryCount_ - 1, EntryRole::HandleAddresses, inlinePack,
                             Nexil::Ptr<Object>(std::move(object)));
        }

        ByteSink& sink_;
        WriterContext const& context_;
        ObjectGraph const& graph_;
        std::uint64_t slotCount_;
        std::uint64_t entryCount_;
        V3::PackVisitor pack_;
    };

    void writeTable(ByteSink& sink, std::vector<V5::FileEntry> const& records)
    {
        Packer packer(sink);
        for (V5::FileEntry const& record : records) {
            packer.pack_uint64(record.position);
            packer.pack_uint64(record.mark);
        }
    }

} // namespace

void writeStream(Nexil::Array<Nexil::Ptr<Object>> const& objects, WriterContext const& context, std::ostream& stream)
{
    std::streambuf* const buffer = stream.rdbuf();
    std::streamoff start = -1;
    if (buffer && stream.good())
        start = std::streamoff(buffer->pubseekoff(0, std::ios_base::cur, std::ios_base::out));
    if (start < 0)
        throw WriteFailure();
    // Before the first byte: objects that cannot be written leave no half of a stream.
    ObjectGraph const graph(objects);

    ByteSink sink(*buffer, static_cast<std::uint64_t>(start));
    Object header;
    buildHeader(context.options.compressionLevel, context.serializeHandles, header);
    V3::PackVisitor(sink, kHeaderCompressionLevel, nullptr, context.services).packObject(header);
    std::uint64_t const offsetPosition = sink.position();
    writeTableOffset(sink, offsetPosition);

    auto const records = StreamWriter(sink, context, graph, objects.size()).writeItems();
    std::uint64_t const tablePosition = sink.position();
    writeTable(sink, records);
    sink.flush();

    auto const target = std::streampos(static_cast<std::streamoff>(offsetPosition));
    if (buffer->pubseekpos(target, std::ios_base::out) != target)
        throw WriteFailure();
    ByteSink offsetSink(*buffer, offsetPosition);
    writeTableOffset(offsetSink, tablePosition);
    offsetSink.flush();
    if (buffer->pubsync() != 0)
        throw WriteFailure();
    // A stream that appends wherever it stands has put the offset at its end.
    auto const behindOffset = std::streampos(static_cast<std::streamoff>(offsetSink.position()));
    if (buffer->pubseekoff(0, std::ios_base::cur, std::ios_base::out) != behindOffset)
        throw WriteFailure();
}

} // namespace Veldrin::IO
