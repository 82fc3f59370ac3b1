#include <vld/TileHash.h>

#include <nexil/SeededHash.h>

#include <algorithm>

namespace VLD::TileTree3D {

TileHash::TileHash(Nexil::Array<Coordinate> const& origins)
{
    if (origins.empty())
        return;
    seed_[0] = Nexil::Internal::seededHash("tile x and y");
    seed_[1] = Nexil::Internal::seededHash("tile z");
    seed_[2] = Nexil::Internal::seededHash("tile");
    Nexil::Internal::resizeUninitialized(slots_, origins.size() + origins.size() / 2 + 1);
    std::fill(slots_.begin(), slots_.end(), Slot());
    for (std::uint64_t tile = 0; tile < origins.size(); ++tile) {
        std::uint64_t i = slotOf(origins[tile]);
        while (slots_[i].tile != kNoTile && slots_[i].origin != origins[tile])
            i = behind(i);
        if (slots_[i].tile == kNoTile)
            slots_[i] = {origins[tile], static_cast<unsigned int>(tile)};
    }
}

} // namespace VLD::TileTree3D
