#pragma once

#include <nexil/Array.h>
#include <vld/Coordinates.h>
#include <vld/TileHash.h>

#include <algorithm>
#include <cstdint>

namespace VLD::TileTree3D::Internal {

/// Numbers tiles in the order in which they are first asked for.
class TileNumbering {
public:
    /// Below 2^32 - 1 tiles.
    [[nodiscard]] unsigned int numberOf(Coordinate const& origin)
    {
        if (origins_.size() * 2 >= slots_.size())
            grow();
        std::uint64_t slot = firstSlot(origin);
        for (; slots_[slot] != kNoTile; slot = (slot + 1) & (slots_.size() - 1))
            if (origins_[slots_[slot]] == origin)
                return slots_[slot];
        slots_[slot] = static_cast<unsigned int>(origins_.size());
        origins_.push_back(origin);
        return slots_[slot];
    }

    /// Of all tiles, by number.
    [[nodiscard]] Nexil::Array<Coordinate> const& origins() const noexcept { return origins_; }

private:
    static constexpr std::uint64_t kFirstSlots = 64;

    [[nodiscard]] std::uint64_t firstSlot(Coordinate const& origin) const noexcept
    {
        return hash_.place(origin, slots_.size());
    }

    void grow()
    {
        Nexil::Array<unsigned int> slots;
        Nexil::Internal::resizeUninitialized(slots, std::max(kFirstSlots, slots_.size() * 4));
        std::fill(slots.begin(), slots.end(), kNoTile);
        slots_.swap(slots);
        for (std::uint64_t tile = 0; tile < origins_.size(); ++tile) {
            std::uint64_t slot = firstSlot(origins_[tile]);
            while (slots_[slot] != kNoTile)
                slot = (slot + 1) & (slots_.size() - 1);
            slots_[slot] = static_cast<unsigned int>(tile);
        }
    }

    OriginHash hash_;
    Nexil::Array<Coordinate> origins_;
    // Numbers by the hash of their origin; at most half full, a power of two long.
    Nexil::Array<unsigned int> slots_;
};

} // namespace VLD::TileTree3D::Internal
