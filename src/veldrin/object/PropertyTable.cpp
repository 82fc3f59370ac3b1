#include <veldrin/object/PropertyTable.h>

#include <nexil/SeededHash.h>

#include <algorithm>
#include <bit>
#include <limits>
#include <stdexcept>

namespace Veldrin::Internal {

namespace {

    // Up to here comparing names in turn is quicker than hashing one.
    constexpr std::size_t kMostUnhashedSlots = 12;

    std::size_t cellCountFor(std::size_t slotCount) noexcept
    {
        return std::bit_ceil(slotCount * 2);
    }

    constexpr std::uint32_t tagOf(std::uint64_t hash) noexcept
    {
        return static_cast<std::uint32_t>(hash >> 32);
    }

} // namespace

std::size_t PropertyTable::findSlot(std::string_view name) const noexcept
{
    if (cells_.empty()) {
        for (std::size_t i = 0; i < slots_.size(); ++i)
            if (slots_[i].name.view() == name && !slots_[i].isGap)
                return i;
        return kNoSlot;
    }
    std::uint64_t const hash = Nexil::Internal::seededHash(name);
    std::size_t const mask = cells_.size() - 1;
    for (std::size_t cell = hash & mask;; cell = (cell + 1) & mask) {
        if (cells_[cell].slotPlusOne == 0)
            return kNoSlot;
        if (cells_[cell].tag != tagOf(hash))
            continue;
        std::size_t const slot = cells_[cell].slotPlusOne - 1;
        if (slots_[slot].name.view() == name && !slots_[slot].isGap)
            return slot;
    }
}

void PropertyTable::set(Nexil::String const& name, Nexil::Any&& value)
{
    if (auto const slot = findSlot(name.view()); slot != kNoSlot) {
        slots_[slot].value = std::move(value);
        return;
    }
    if (slots_.size() >= std::numeric_limits<std::uint32_t>::max() - 1)
        throw std::length_error("too many properties");
    // Everything that can fail comes before the first change.
    Slot slot{name, {}, false};
    if (slots_.size() == slots_.capacity())
        slots_.reserve(std::max<std::size_t>(4, slots_.capacity() * 2));
    std::size_t const slotCount = slots_.size() + 1;
    if (slotCount > kMostUnhashedSlots && slotCount * 2 > cells_.size())
        indexSlots(cellCountFor(slotCount));
    slot.value = std::move(value);
    slots_.push_back(std::move(slot));
    if (!cells_.empty())
        placeInCells(cells_, Nexil::Internal::seededHash(name.view()), slots_.size() - 1);
}

bool PropertyTable::extract(std::string_view name, Nexil::Any& value) noexcept
{
    auto const found = findSlot(name);
    if (found == kNoSlot)
        return false;
    Slot& slot = slots_[found];
    value = std::move(slot.value);
    // The name stays until the gap closes: its cell must go on leading searches past it.
    slot.isGap = true;
    ++gapCount_;
    if (gapCount_ > kMostUnhashedSlots && gapCount_ > size())
        closeGaps();
    else if (size() == 0)
        clear();
    return true;
}

void PropertyTable::clear() noexcept
{
    // Values may hold the last reference to what refers to this table again while it is destroyed.
    auto const doomed = std::move(slots_);
    slots_.clear();
    cells_.clear();
    gapCount_ = 0;
}

void PropertyTable::closeGaps() noexcept
{
    std::erase_if(slots_, [](Slot const& slot) { return slot.isGap; });
    gapCount_ = 0;
    if (slots_.size() <= kMostUnhashedSlots) {
        cells_.clear();
        return;
    }
    // As few cells as the slots need, so that closing the next gaps costs no more than opening them did. There were at
    // least as many already, and giving some up needs no memory.
    cells_.resize(std::min(cells_.size(), cellCountFor(slots_.size())));
    std::fill(cells_.begin(), cells_.end(), Cell());
    for (std::size_t slot = 0; slot < slots_.size(); ++slot)
        placeInCells(cells_, Nexil::Internal::seededHash(slots_[slot].name.view()), slot);
}

void PropertyTable::indexSlots(std::size_t cellCount)
{
    std::vector<Cell> cells(cellCount);
    for (std::size_t slot = 0; slot < slots_.size(); ++slot)
        placeInCells(cells, Nexil::Internal::seededHash(slots_[slot].name.view()), slot);
    cells_ = std::move(cells);
}

void PropertyTable::placeInCells(std::vector<Cell>& cells, std::uint64_t hash, std::size_t slot) noexcept
{
    std::size_t const mask = cells.size() - 1;
    std::size_t cell = hash & mask;
    while (cells[cell].slotPlusOne != 0)
        cell = (cell + 1) & mask;
    cells[cell] = {tagOf(hash), static_cast<std::uint32_t>(slot + 1)};
}

} // namespace Veldrin::Internal
