#include <veldrin/io/internal/StreamReader.h>

#include <nexil/JobCancel.h>
#include <nexil/String.h>
#include <veldrin/io/StreamKeys.h>
#include <veldrin/io/internal/EntryTable.h>
#include <veldrin/io/internal/StreamHeader.h>
#include <veldrin/io/internal/UnpackVisitor.h>
#include <veldrin/object/Properties.h>

#include <algorithm>
#include <vector>

namespace Veldrin::IO {

namespace {

    using AddressArray = Nexil::Ptr<Nexil::Array<unsigned long long>>;

    [[noreturn]] void throwCorruptHandles()
    {
        throw Nexil::String("Corrupt handles");
    }

    /// One item of the stream: what its bytes are, and what was read from them.
    struct Item {
        std::uint64_t position;
        std::uint64_t mark;
        unsigned int code = TypeCode::kUnknown;
        bool isRead = false;
        bool isReferred = false;
        Nexil::Any value{};
    };

    class EntryReader final : private V3::References {
    public:
        EntryReader(ByteSource& source, Object const& header, bool hasHashes,
                    Geometry::Internal::ProxyRebuilder* proxies)
            : source_(source), hasHashes_(hasHashes), isCompressed_(headerSigned(header, sCompressionLevel) > 0),
              hasHandles_(headerFlag(header, sStreamHandles)), table_(readEntryTable(source)), entries_(table_.entries),
              reader_(source), visitor_(reader_, isCompressed_, this, proxies)
        {
            checkRoles();
            layOutItems();
            if (hasHandles_ && !hasHashes_)
                checkAddresses(header);
        }

        Nexil::Array<Nexil::Ptr<Object>> read()
        {
            for (std::size_t i = 0; i < items_.size(); ++i)
                readItem(i);
            Nexil::Array<Nexil::Ptr<Object>> objects;
            objects.reserve(slotCount_);
            for (std::uint64_t slot = 0; slot < slotCount_; ++slot)
                objects.push_back(*items_[itemOfEntry_[slot]].value.get<Nexil::Ptr<Object>>());
            for (std::size_t i = slotCount_; i < entries_.size(); ++i) {
                Item const& item = items_[itemOfEntry_[i]];
                if (roleOf(entries_[i]) == EntryRole::HandleAddresses)
                    checkAddresses(**item.value.get<Nexil::Ptr<Object>>());
                else if (!item.isReferred)
                    throwCorruptHandles();
            }
            return objects;
        }

    private:
        /// Top-level slots come first, then shared values, then at most one entry of handle addresses.
        void checkRoles()
        {
            auto const isTopLevel = [](V5::FileEntry const& entry) { return roleOf(entry) == EntryRole::TopLevel; };
            auto const isShared = [](V5::FileEntry const& entry) { return roleOf(entry) == EntryRole::Shared; };
            auto const firstShared = std::find_if_not(entries_.begin(), entries_.end(), isTopLevel);
            auto const firstOther = std::find_if_not(firstShared, entries_.end(), isShared);
            slotCount_ = static_cast<std::uint64_t>(firstShared - entries_.begin());
            bool const mustHaveAddresses = hasHandles_ && hasHashes_;
            if (entries_.end() - firstOther != (mustHaveAddresses ? 1 : 0) ||
                (mustHaveAddresses && roleOf(*firstOther) != EntryRole::HandleAddresses))
                throwCorruptHandles();
        }

        /// The positions must cut [itemsBegin, itemsEnd) into items; only top-level slots may name one item twice.
        void layOutItems()
        {
            std::vector<std::uint64_t> byPosition(entries_.size());
            for (std::size_t i = 0; i < byPosition.size(); ++i)
                byPosition[i] = i;
            std::sort(byPosition.begin(), byPosition.end(), [this](std::uint64_t a, std::uint64_t b) {
                return entries_[a].position != entries_[b].position ? entries_[a].position < entries_[b].position
                                                                    : a < b;
            });
            itemOfEntry_.resize(entries_.size());
            items_.reserve(entries_.size());
            for (std::uint64_t const index : byPosition) {
                V5::FileEntry const& entry = entries_[index];
                if (items_.empty() || items_.back().position != entry.position)
                    items_.push_back({entry.position, entry.mark});
                else if (comparedMark(items_.back().mark) != comparedMark(entry.mark) ||
                         roleOf(entry) != EntryRole::TopLevel)
                    throwCorruptHandles();
                itemOfEntry_[index] = items_.size() - 1;
            }
            std::uint64_t const first = items_.empty() ? table_.itemsEnd : items_.front().position;
            if (first != table_.itemsBegin || (!items_.empty() && items_.back().position >= table_.itemsEnd))
                throwCorruptHandles();
        }

        /// What of a mark has a meaning: all of it with hashes, the role alone without.
        [[nodiscard]] std::uint64_t comparedMark(std::uint64_t mark) const noexcept
        {
            return hasHashes_ ? mark : mark & kRoleMask;
        }

        void readItem(std::size_t number)
        {
            Nexil::Internal::throwIfJobCancelled();
            Item& item = items_[number];
            std::uint64_t const end = number + 1 < items_.size() ? items_[number + 1].position : table_.itemsEnd;
            if (!hasHashes_)
                return readValue(item, end, 0);
            EntryRole const role = static_cast<EntryRole>(item.mark & kRoleMask);
            std::uint64_t const seed = hashSeed(entries_.size(), isCompressed_, role);
            auto checkHash = [&](std::uint64_t hash) {
                if (makeMark(hash, role) != item.mark)
                    throw Nexil::String("Checksum mismatch");
            };
            // The hash is taken while the item is read, yet a wrong one is the first thing to be told.
            try {
                readValue(item, end, seed);
            } catch (Nexil::String const&) {
                checkHash(reader_.hashOf(item.position, end, seed));
                throw;
            } catch (msgpack::type_error const&) {
                checkHash(reader_.hashOf(item.position, end, seed));
                throw;
            } catch (msgpack::unpack_error const&) {
                checkHash(reader_.hashOf(item.position, end, seed));
                throw;
            }
            checkHash(hash_);
            item.isRead = true;
        }

        void readValue(Item& item, std::uint64_t end, std::uint64_t seed)
        {
            source_.seek(item.position);
            msgpack::object const& frame = hasHashes_ ? reader_.next(end, seed) : reader_.next(end);
            if (reader_.itemEnd() != end)
                throwCorruptHandles();
            msgpack::object const* payload = nullptr;
            item.code = visitor_.unpackFrame(frame, payload);
            auto const role = static_cast<EntryRole>(item.mark & kRoleMask);
            if (item.code == TypeCode::kUnknown)
                throw Nexil::String("any type not supported");
            if (!TypeCode::isShareable(item.code) || (role != EntryRole::Shared && item.code != TypeCode::kObject))
                throw Nexil::String("not a managed type");
            if (payload->type == msgpack::type::POSITIVE_INTEGER)
                throwCorruptHandles();
            if (payload->type == msgpack::type::NIL && role != EntryRole::TopLevel)
                throw Nexil::String("Setting invalid object in read cache");
            item.value = visitor_.unpackPayload(item.code, *payload);
            hash_ = reader_.finish();
            item.isRead = !hasHashes_;
        }

        [[nodiscard]] Nexil::Any resolve(std::uint64_t number, unsigned int code) override
        {
            if (number >= entries_.size())
                throw Nexil::String("object index out of range");
            Item& item = items_[itemOfEntry_[number]];
            bool const isNullSlot =
                item.code == TypeCode::kObject && item.isRead && !*item.value.get<Nexil::Ptr<Object>>();
            if (!item.isRead || isNullSlot)
                throw Nexil::String("ptr not found in map");
            if (item.code != code)
                throw Nexil::String("target error");
            item.isReferred = true;
            return item.value;
        }

        void checkAddresses(Object const& holder) const
        {
            auto const addresses = getPropertyAs<AddressArray>(holder, kHandleAddresses);
            if (!addresses || addresses->size() != slotCount_)
                throwCorruptHandles();
        }

        ByteSource& source_;
        bool hasHashes_;
        bool isCompressed_;
        bool hasHandles_;
        EntryTable table_;
        std::vector<V5::FileEntry> const& entries_;
        ItemReader reader_;
        V3::UnpackVisitor visitor_;
        std::uint64_t slotCount_ = 0;
        std::vector<Item> items_;              // by position
        std::vector<std::size_t> itemOfEntry_; // by number of the entry
        std::uint64_t hash_ = 0;
    };

} // namespace

Nexil::Array<Nexil::Ptr<Object>> readEntryStream(ByteSource& source, Object const& header, bool hasHashes,
                                                 Geometry::Internal::ProxyRebuilder* proxies)
{
    return EntryReader(source, header, hasHashes, proxies).read();
}

} // namespace Veldrin::IO
