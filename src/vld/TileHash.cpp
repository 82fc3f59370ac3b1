#include <vld/TileHash.h>

#include <nexil/SeededHash.h>

#include <algorithm>
#include <bit>

namespace VLD::TileTree3D {

TileHash::TileHash(Nexil::Array<Coordinate> const& origins)
{
    if (origins.empty())
        return;
    seed_[0] = Nexil::Internal::seededHash("tile x and y");
    seed_[1] = Nexil::Internal::seededHash("tile z");
    seed_[2] = Nexil::Internal::seededHash("tile");
    std::uint64_t const slotCount = std::bit_ceil(std::max<std::uint64_t>(origins.size() * 2, 2));
    mask_ = slotCount - 1;
    shift_ = 64 - static_cast<unsigned int>(std::countr_zero(slotCount));
    Nexil::Internal::resizeUninitialized(slots_, slotCount);
    std::fill(slots_.begin(), slots_.end(), Slot());
    for (std::uint64_t tile = 0; tile < origins.size(); ++tile) {
        std::uint64_t i = slotOf(origins[tile]);
        while (slots_[i].tile != kNoTile && slots_[i].origin != origins[tile])
            i = (i + 1) & mask_;
        if (slots_[i].tile == kNoTile)
            slots_[i] = {origins[tile], static_cast<unsigned int>(tile)};
    }
}

} // namespace VLD::TileTree3D
