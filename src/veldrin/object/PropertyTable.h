#pragma once

#include <nexil/Any.h>
#include <nexil/Export.h>
#include <nexil/String.h>

#include <cstddef>
#include <cstdint>
#include <string_view>
#include <utility>
#include <vector>

namespace Veldrin::Internal {

/// Named values in the order in which their names first came: the storage of an Object.
///
/// A few names are found by comparing them in turn, many by a hash table under a seeded hash, so that names chosen to
/// collide gain nothing. Erasing leaves a gap that is closed once gaps outnumber properties: erasing all properties one
/// by one is linear.
/// Errors: std::bad_alloc; the table is unchanged then.
class VELDRIN_PLATFORM_API PropertyTable {
public:
    struct Slot {
        Nexil::String name;
        Nexil::Any value;
        bool isGap = false;
    };

    PropertyTable() = default;
    PropertyTable(PropertyTable const&) = default;
    PropertyTable(PropertyTable&& other) noexcept { swap(other); }
    PropertyTable& operator=(PropertyTable other) noexcept
    {
        swap(other);
        return *this;
    }
    ~PropertyTable() = default;

    void swap(PropertyTable& other) noexcept
    {
        slots_.swap(other.slots_);
        cells_.swap(other.cells_);
        std::swap(gapCount_, other.gapCount_);
    }

    /// Number of properties.
    [[nodiscard]] std::size_t size() const noexcept { return slots_.size() - gapCount_; }

    [[nodiscard]] Nexil::Any const* find(std::string_view name) const noexcept
    {
        auto const slot = findSlot(name);
        return slot == kNoSlot ? nullptr : &slots_[slot].value;
    }

    /// Stores the value under its name; one that is replaced keeps its place in the order.
    void set(Nexil::String const& name, Nexil::Any&& value);

    /// Removes the property and moves its value into `value`; false, and `value` untouched, when there is none.
    bool extract(std::string_view name, Nexil::Any& value) noexcept;

    void clear() noexcept;

    /// Calls visit(name, value) in order until it answers false; true when it never did.
    template <class Visit>
    bool visitWhile(Visit&& visit) const
    {
        for (Slot const& slot : slots_)
            if (!slot.isGap && !visit(slot.name, slot.value))
                return false;
        return true;
    }

private:
    /// A cell of the hash table: the upper half of the name's hash, and the slot's number plus one; 0 when free. Cells of
    /// gaps stay until the table is rebuilt, so that searches run past them.
    struct Cell {
        std::uint32_t tag = 0;
        std::uint32_t slotPlusOne = 0;
    };

    static constexpr std::size_t kNoSlot = ~std::size_t(0);

    [[nodiscard]] std::size_t findSlot(std::string_view name) const noexcept;
    void closeGaps() noexcept;
    void indexSlots(std::size_t cellCount);
    static void placeInCells(std::vector<Cell>& cells, std::uint64_t hash, std::size_t slot) noexcept;

    std::vector<Slot> slots_;
    std::vector<Cell> cells_; // empty while names are compared in turn
    std::size_t gapCount_ = 0;
};

} // namespace Veldrin::Internal
