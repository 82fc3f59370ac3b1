#pragma once

#include <nexil/Array.h>
#include <nexil/Export.h>
#include <vld/Coordinates.h>

#include <cstdint>

namespace VLD::TileTree3D {

/// Finds a tile by its origin.
///
/// Open addressing at most two thirds full, under a seed drawn once per process: whoever writes a file cannot choose
/// origins that collide. Where an origin comes twice, one of its tiles is found.
class VELDRIN_PLATFORM_API TileHash {
public:
    TileHash() = default;
    explicit TileHash(Nexil::Array<Coordinate> const& origins);

    /// The tile's place in the array of origins, or `kNoTile`.
    [[nodiscard]] unsigned int find(Coordinate const& origin) const noexcept
    {
        if (slots_.empty())
            return kNoTile;
        for (std::uint64_t i = slotOf(origin);; i = behind(i)) {
            Slot const& slot = slots_[i];
            if (slot.tile == kNoTile || slot.origin == origin)
                return slot.tile;
        }
    }

    [[nodiscard]] std::uint64_t byteSize() const noexcept { return slots_.size() * sizeof(Slot); }

private:
    __extension__ typedef unsigned __int128 Product;

    struct Slot {
        Coordinate origin;
        unsigned int tile = kNoTile;
    };

    // A product of two secret-keyed 64-bit words, both halves folded, then multiplied once more so that the upper bits
    // that pick the slot depend on all others.
    [[nodiscard]] std::uint64_t slotOf(Coordinate const& origin) const noexcept
    {
        std::uint64_t const xy = static_cast<std::uint32_t>(origin.x) |
                                 static_cast<std::uint64_t>(static_cast<std::uint32_t>(origin.y)) << 32;
        Product const product = static_cast<Product>(xy ^ seed_[0]) * (static_cast<std::uint32_t>(origin.z) ^ seed_[1]);
        auto const folded = static_cast<std::uint64_t>(product) ^ static_cast<std::uint64_t>(product >> 64);
        auto const hash = (folded ^ seed_[2]) * 0x9E3779B97F4A7C15u;
        return static_cast<std::uint64_t>(static_cast<Product>(hash) * slots_.size() >> 64);
    }

    [[nodiscard]] std::uint64_t behind(std::uint64_t slot) const noexcept
    {
        return slot + 1 == slots_.size() ? 0 : slot + 1;
    }

    Nexil::Array<Slot> slots_;
    std::uint64_t seed_[3]{};
};

} // namespace VLD::TileTree3D
