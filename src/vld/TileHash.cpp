#include <vld/TileHash.h>

#include <nexil/SeededHash.h>

#include <algorithm>

namespace VLD::TileTree3D {

OriginHash::OriginHash()
    : seed_{Nexil::Internal::seededHash("tile x and y"), Nexil::Internal::seededHash("tile z"),
            Nexil::Internal::seededHash("tile")}
{
}

TileHash::TileHash(Nexil::Array<Coordinate> const& origins)
{
    if (origins.empty())
        return;
    Nexil::Internal::resizeUninitialized(slots_, origins.size() + origins.size() / 2 + 1);
    std::fill(slots_.begin(), slots_.end(), Slot());
    for (std::uint64_t tile = 0; tile < origins.size(); ++tile) {
        std::uint64_t i = hash_.place(origins[tile], slots_.size());
        while (slots_[i].tile != kNoTile && slots_[i].origin != origins[tile])
            i = behind(i);
        if (slots_[i].tile == kNoTile)
            slots_[i] = {origins[tile], static_cast<unsigned int>(tile)};
    }
}

} // namespace VLD::TileTree3D
