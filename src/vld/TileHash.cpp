#include <vld/TileHash.h>

#include <nexil/SeededHash.h>

#include <algorithm>

namespace VLD::TileTree3D {

namespace {

    constexpr std::uint64_t kAhead = 16;

} // namespace

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
    // The table is soon larger than the caches: the slots of the tiles to come are asked for before they are needed.
    std::uint64_t places[kAhead];
    auto const lookAhead = [&](std::uint64_t tile) {
        std::uint64_t const place = hash_.place(origins[tile], slots_.size());
        places[tile % kAhead] = place;
        __builtin_prefetch(&slots_[place], 1);
    };
    for (std::uint64_t tile = 0; tile < std::min(kAhead, origins.size()); ++tile)
        lookAhead(tile);
    for (std::uint64_t tile = 0; tile < origins.size(); ++tile) {
        std::uint64_t i = places[tile % kAhead];
        while (slots_[i].tile != kNoTile && slots_[i].origin != origins[tile])
            i = behind(i);
        if (slots_[i].tile == kNoTile)
            slots_[i] = {origins[tile], static_cast<unsigned int>(tile)};
        if (tile + kAhead < origins.size())
            lookAhead(tile + kAhead);
    }
}

} // namespace VLD::TileTree3D
