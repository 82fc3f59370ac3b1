#include <veldrin/io/internal/ObjectGraph.h>

#include <nexil/JobCancel.h>
#include <nexil/String.h>
#include <veldrin/geometry/GeoLocation.h>
#include <veldrin/volume/VldProxyDescription.h>

#include <typeinfo>

namespace Veldrin::IO {

namespace {

    using Geometry::Common::GeoLocation;
    using ObjectPtr = Nexil::Ptr<Object>;
    template <class T>
    using ArrayPtr = Nexil::Ptr<Nexil::Array<T>>;

    // Holders of a value that only one place of the graph holds, seen by us: that place, and our copy of the pointer.
    constexpr std::uint64_t kHoldersOfUnshared = 2;

    bool isNullPointer(Nexil::Any const& pointer, StreamType const& type)
    {
        std::uint64_t useCount = 0;
        return type.address(pointer, useCount) == nullptr;
    }

    bool isPlain(Object const& object)
    {
        return typeid(object) == typeid(Object);
    }

} // namespace

template <class Visit>
void ObjectGraph::visitHeld(Nexil::Any const& pointer, StreamType const& type, Visit const& visit)
{
    bool tellsHolders = true;
    auto visitPointer = [&](Nexil::Any const& held, StreamType const& heldType) {
        if (!isNullPointer(held, heldType))
            visit(held, heldType, tellsHolders);
    };
    auto visitLocation = [&](GeoLocation const& location) {
        Nexil::Any const indices = location.indices;
        Nexil::Any const weights = location.weights;
        visitPointer(indices, streamTypeOf(indices));
        visitPointer(weights, streamTypeOf(weights));
    };
    auto visitValue = [&](Nexil::Any const& value) {
        StreamType const& valueType = streamTypeOf(value);
        if (valueType.address)
            visitPointer(value, valueType);
        else if (valueType.code == TypeCode::kGeoLocation)
            visitLocation(*value.get<GeoLocation>());
    };

    if (type.code == TypeCode::kObject) {
        Object const& object = **pointer.get<ObjectPtr>();
        // A class of its own may hand out one pointer at several places.
        tellsHolders = isPlain(object);
        Object const& content = takeContent(object);
        for (Nexil::String const& key : content.keys())
            visitValue(content.getProperty(key));
    } else if (type.code == TypeCode::kObjectArray) {
        for (ObjectPtr const& element : **pointer.get<ArrayPtr<ObjectPtr>>()) {
            Nexil::Any const held = element;
            visitPointer(held, streamTypeOf(held));
        }
    } else if (type.nestedCount) {
        std::uint64_t const count = type.nestedCount(pointer);
        for (std::uint64_t i = 0; i < count; ++i) {
            Nexil::Any const held = type.nestedElement(pointer, i);
            visitPointer(held, streamTypeOf(held));
        }
    } else if (type.code == TypeCode::kGeoLocationArray) {
        for (GeoLocation const& location : **pointer.get<ArrayPtr<GeoLocation>>())
            visitLocation(location);
    } else if (type.code == TypeCode::kAnyArray) {
        tellsHolders = false; // values are looked at in place, without a copy of ours
        for (Nexil::Any const& value : **pointer.get<ArrayPtr<Nexil::Any>>())
            visitValue(value);
    }
}

ObjectGraph::ObjectGraph(Nexil::Array<ObjectPtr> const& slots)
{
    std::vector<Nexil::Any> pending;
    for (ObjectPtr const& slot : slots) {
        std::uint64_t const number = entries_.size();
        entries_.push_back({slot, number});
        if (!slot)
            continue;
        std::uint64_t useCount = 0;
        Nexil::Any const& pointer = entries_.back().pointer;
        auto const [place, isNew] = nodes_.try_emplace(streamTypeOf(pointer).address(pointer, useCount));
        if (isNew) {
            place->second.pointer = pointer;
            place->second.entry = number;
            pending.push_back(pointer);
        } else {
            entries_.back() = {Nexil::Any(), place->second.entry};
        }
    }
    countHolders(std::move(pending));
    orderEntries(entries_.size());
}

bool ObjectGraph::findEntry(void const* address, std::uint64_t& entry) const
{
    auto const place = nodes_.find(address);
    if (place == nodes_.end() || place->second.entry == kNoEntry)
        return false;
    entry = place->second.entry;
    return true;
}

Object const& ObjectGraph::contentOf(Object const& object) const
{
    if (isPlain(object))
        return object;
    auto const place = contents_.find(&object);
    return place == contents_.end() ? object : place->second;
}

Object const& ObjectGraph::takeContent(Object const& object)
{
    if (isPlain(object))
        return object;
    auto const [place, isNew] = contents_.try_emplace(&object);
    if (isNew && !Geometry::describeVldProxy(object, place->second))
        for (Nexil::String const& key : object.keys())
            place->second.setPropertyAny(key, object.getProperty(key));
    return place->second;
}

void ObjectGraph::countHolders(std::vector<Nexil::Any> pending)
{
    while (!pending.empty()) {
        Nexil::Any const pointer = std::move(pending.back());
        pending.pop_back();
        Nexil::Internal::throwIfJobCancelled();
        visitHeld(pointer, streamTypeOf(pointer),
                  [&](Nexil::Any const& held, StreamType const& type, bool tellsHolders) {
                      std::uint64_t useCount = 0;
                      void const* const address = type.address(held, useCount);
                      if (tellsHolders && useCount <= kHoldersOfUnshared) {
                          pending.push_back(held);
                          return;
                      }
                      auto const [place, isNew] = nodes_.try_emplace(address);
                      if (isNew) {
                          place->second.pointer = held;
                          pending.push_back(held);
                      } else {
                          place->second.isHeldTwice = true;
                      }
                  });
    }
}

std::uint64_t ObjectGraph::addEntry(Node& node, Nexil::Any const& pointer)
{
    node.pointer = pointer;
    node.entry = entries_.size();
    entries_.push_back({pointer, node.entry});
    return node.entry;
}

void ObjectGraph::collectReferred(Nexil::Any const& pointer, unsigned int level, std::vector<std::uint64_t>& referred)
{
    // Recursion ends with kMaxInlineLevels.
    visitHeld(pointer, streamTypeOf(pointer), [&](Nexil::Any const& held, StreamType const& type, bool tellsHolders) {
        std::uint64_t useCount = 0;
        void const* const address = type.address(held, useCount);
        bool const isTooDeep = level > kMaxInlineLevels;
        if (tellsHolders && useCount <= kHoldersOfUnshared && !isTooDeep)
            return collectReferred(held, level + 1, referred);
        if (isTooDeep) {
            Node& node = nodes_[address];
            referred.push_back(node.entry == kNoEntry ? addEntry(node, held) : node.entry);
            return;
        }
        auto const place = nodes_.find(address);
        if (place != nodes_.end() && place->second.entry != kNoEntry)
            referred.push_back(place->second.entry);
        else if (place != nodes_.end() && place->second.isHeldTwice)
            referred.push_back(addEntry(place->second, held));
        else
            collectReferred(held, level + 1, referred);
    });
}

void ObjectGraph::orderEntries(std::uint64_t slotCount)
{
    enum class Progress : unsigned char { New, Open, Done };
    struct Visit {
        std::uint64_t entry;
        std::vector<std::uint64_t> referred;
        std::size_t next;
    };
    std::vector<Progress> progress(entries_.size(), Progress::New);
    std::vector<Visit> path;
    auto enter = [&](std::uint64_t entry) {
        Nexil::Internal::throwIfJobCancelled();
        Nexil::Any const pointer = entries_[entry].pointer;
        std::vector<std::uint64_t> referred;
        if (!isNullPointer(pointer, streamTypeOf(pointer)))
            collectReferred(pointer, 1, referred);
        progress.resize(entries_.size(), Progress::New);
        progress[entry] = Progress::Open;
        path.push_back({entry, std::move(referred), 0});
    };

    for (std::uint64_t slot = 0; slot < slotCount; ++slot) {
        if (entries_[slot].sameAs != slot || progress[slot] == Progress::Done)
            continue;
        enter(slot);
        while (!path.empty()) {
            Visit& visit = path.back();
            if (visit.next == visit.referred.size()) {
                progress[visit.entry] = Progress::Done;
                writeOrder_.push_back(visit.entry);
                path.pop_back();
                continue;
            }
            std::uint64_t const referred = visit.referred[visit.next++];
            if (progress[referred] == Progress::Open)
                throw Nexil::String("Bad parent");
            if (progress[referred] == Progress::New)
                enter(referred);
        }
    }
}

} // namespace Veldrin::IO
