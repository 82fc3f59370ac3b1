#pragma once

#include <nexil/Array.h>
#include <nexil/Export.h>
#include <vld/Coordinates.h>

#include <cstdint>

namespace VLD::TileTree3D {

/// Scatters origins of tiles over 64 bits, under a seed drawn once per process: whoever writes a file cannot choose origins
/// that collide.
class VELDRIN_PLATFORM_API OriginHash {
public:
    OriginHash();

    /// The upper bits depend on all others.
    [[nodiscard]] std::uint64_t operator()(Coordinate const& origin) const noexcept
    {
        // A product of two secret-keyed 64-bit words, both halves folded, then multiplied once more.
        std::uint64_t const xy = static_cast<std::uint32_t>(origin.x) |
                                 static_cast<std::uint64_t>(static_cast<std::uint32_t>(origin.y)) << 32;
        Product const product = static_cast<Product>(xy ^ seed_[0]) * (static_cast<std::uint32_t>(origin.z) ^ seed_[1]);
        auto const folded = static_cast<std::uint64_t>(product) ^ static_cast<std::uint64_t>(product >> 64);
        return (folded ^ seed_[2]) * 0x9E3779B97F4A7C15u;
    }

    /// The same as a place among `count`.
    [[nodiscard]] std::uint64_t place(Coordinate const& origin, std::uint64_t count) const noexcept
    {
        return static_cast<std::uint64_t>(static_cast<Product>((*this)(origin)) * count >> 64);
    }

private:
    __extension__ typedef unsigned __int128 Product;

    std::uint64_t seed_[3];
};

/// Finds a tile by its origin.
///
/// Open addressing at most two thirds full. Where an origin comes twice, one of its tiles is found.
class VELDRIN_PLATFORM_API TileHash {
public:
    TileHash() = default;
    explicit TileHash(Nexil::Array<Coordinate> const& origins);

    /// The tile's place in the array of origins, or `kNoTile`.
    [[nodiscard]] unsigned int find(Coordinate const& origin) const noexcept
    {
        if (slots_.empty())
            return kNoTile;
        for (std::uint64_t i = hash_.place(origin, slots_.size());; i = behind(i)) {
            Slot const& slot = slots_[i];
            if (slot.tile == kNoTile || slot.origin == origin)
                return slot.tile;
        }
    }

    [[nodiscard]] std::uint64_t byteSize() const noexcept { return slots_.size() * sizeof(Slot); }

private:
    struct Slot {
        Coordinate origin;
        unsigned int tile = kNoTile;
    };

    [[nodiscard]] std::uint64_t behind(std::uint64_t slot) const noexcept
    {
        return slot + 1 == slots_.size() ? 0 : slot + 1;
    }

    Nexil::Array<Slot> slots_;
    OriginHash hash_;
};

} // namespace VLD::TileTree3D
