#pragma once

#include <nexil/Any.h>
#include <nexil/Array.h>
#include <nexil/Ptr.h>
#include <veldrin/io/internal/StreamTypes.h>
#include <veldrin/object/Object.h>

#include <cstdint>
#include <unordered_map>
#include <vector>

namespace Veldrin::IO {

/// Which values of the objects to be written become entries of their own, and in which order they are written.
///
/// Entries are the top-level objects, whatever is held more than once, and what lies deeper than kMaxInlineLevels below
/// an entry. Everything else is written where it is held. Entries are ordered so that each comes behind those that it
/// refers to.
/// An object of a class of its own is asked for its properties once, as it may make them up anew each time; a proxy of a
/// volume is written as its description.
/// Cost: linear in the pointers held. Needs no stack for deep chains.
class ObjectGraph {
public:
    static constexpr unsigned int kMaxInlineLevels = 32;

    struct Entry {
        Nexil::Any pointer;       // empty for a slot that repeats an earlier one
        std::uint64_t sameAs = 0; // the entry itself, or the slot that it repeats
    };

    /// Throws `Nexil::String` "Bad parent" when a value holds itself.
    explicit ObjectGraph(Nexil::Array<Nexil::Ptr<Object>> const& slots);

    /// All entries by number: top-level slots first, then shared values as they were found.
    [[nodiscard]] std::vector<Entry> const& entries() const noexcept { return entries_; }
    /// Numbers of the entries that have bytes of their own, in the order in which they are written.
    [[nodiscard]] std::vector<std::uint64_t> const& writeOrder() const noexcept { return writeOrder_; }

    /// True, and its number in `entry`, when the value at the address is an entry.
    [[nodiscard]] bool findEntry(void const* address, std::uint64_t& entry) const;

    /// What is written for an object: the object itself, or what its own class answered.
    [[nodiscard]] Object const& contentOf(Object const& object) const;

private:
    static constexpr std::uint64_t kNoEntry = ~std::uint64_t(0);

    struct Node {
        Nexil::Any pointer; // keeps the address from being used again
        bool isHeldTwice = false;
        std::uint64_t entry = kNoEntry;
    };

    /// Calls visit(pointer, type, tellsHolders) for every shareable pointer, null ones left out, that the value behind
    /// `pointer` holds directly. tellsHolders: the pointer's use count tells how often the value is really held.
    template <class Visit>
    void visitHeld(Nexil::Any const& pointer, StreamType const& type, Visit const& visit);
    Object const& takeContent(Object const& object);
    void countHolders(std::vector<Nexil::Any> pending);
    void orderEntries(std::uint64_t slotCount);
    void collectReferred(Nexil::Any const& pointer, unsigned int level, std::vector<std::uint64_t>& referred);
    std::uint64_t addEntry(Node& node, Nexil::Any const& pointer);

    std::unordered_map<void const*, Node> nodes_;
    std::unordered_map<Object const*, Object> contents_; // of objects of other classes than Object
    std::vector<Entry> entries_;
    std::vector<std::uint64_t> writeOrder_;
};

} // namespace Veldrin::IO
