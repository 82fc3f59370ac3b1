#include <vld/PointTopology.h>

#include <nexil/parallel/Parallel.h>
#include <vld/internal/VoxelOfPoint.h>

#include <atomic>
#include <cmath>

namespace VLD::TileTree3D {

namespace {

    namespace grain {
        constexpr std::size_t kPoints = 8192;
    } // namespace grain

    struct PlacedPoint {
        Coordinate tile;
        unsigned int index;
    };

    template <class Traits>
    bool areConsistent(Nexil::Array<Coordinate> const& origins, Nexil::Array<unsigned int> const& offsets)
    {
        if (offsets.size() != origins.size() + 1 || offsets[0] != 0)
            return false;
        for (std::uint64_t tile = 0; tile < origins.size(); ++tile) {
            if (!isWithinLimits(origins[tile]) || tileOrigin<Traits::kDataWidth>(origins[tile]) != origins[tile] ||
                (tile > 0 && !isBefore(origins[tile - 1], origins[tile])) || offsets[tile] > offsets[tile + 1])
                return false;
        }
        return true;
    }

} // namespace

template <class Traits>
PointTopology<Traits>::PointTopology(Nexil::String name, Nexil::Array<Coordinate> leafOrigins,
                                     Nexil::Array<unsigned int> offsets)
    : PointTopology(std::move(name), Nexil::makePtr<Nexil::Array<Coordinate>>(std::move(leafOrigins)),
                    Nexil::makePtr<Nexil::Array<unsigned int>>(std::move(offsets)))
{
}

template <class Traits>
PointTopology<Traits>::PointTopology(Nexil::String name, Nexil::Ptr<Nexil::Array<Coordinate>> leafOrigins,
                                     Nexil::Ptr<Nexil::Array<unsigned int>> offsets)
    : Component(std::move(name)), leafOrigins_(std::move(leafOrigins)), offsets_(std::move(offsets))
{
}

template <class Traits>
PointTopology<Traits>::PointTopology(Nexil::String name, PointTopology const& points)
    : PointTopology(std::move(name), points.leafOrigins_, points.offsets_)
{
}

template <class Traits>
PointTopology<Traits>::~PointTopology() = default;

template <class Traits>
PointTopology<Traits>::PointTopology(PointTopology const&) = default;

template <class Traits>
bool PointTopology<Traits>::isConsistent() const
{
    return areConsistent<Traits>(*leafOrigins_, *offsets_);
}

template <class Traits>
Nexil::Ptr<PointTopology<Traits>> PointTopology<Traits>::create(Nexil::String name,
                                                                Nexil::Array<Coordinate> leafOrigins,
                                                                Nexil::Array<unsigned int> offsets)
{
    return create(std::move(name), Nexil::makePtr<Nexil::Array<Coordinate>>(std::move(leafOrigins)),
                  Nexil::makePtr<Nexil::Array<unsigned int>>(std::move(offsets)));
}

template <class Traits>
Nexil::Ptr<PointTopology<Traits>> PointTopology<Traits>::create(Nexil::String name,
                                                                Nexil::Ptr<Nexil::Array<Coordinate>> leafOrigins,
                                                                Nexil::Ptr<Nexil::Array<unsigned int>> offsets)
{
    if (name.empty() || !leafOrigins || !offsets || !areConsistent<Traits>(*leafOrigins, *offsets))
        return nullptr;
    return Nexil::makePtr<PointTopology>(std::move(name), std::move(leafOrigins), std::move(offsets));
}

template <class Traits>
Nexil::Ptr<PointTopology<Traits>> PointTopology<Traits>::build(Nexil::String name,
                                                               Nexil::Array<Veldrin::Math::float3> const& positions,
                                                               float voxelSize, Nexil::Array<unsigned int>& order)
{
    std::uint64_t const count = positions.size();
    if (name.empty() || !std::isfinite(voxelSize) || !(voxelSize > 0) || count >= kNoElement)
        return nullptr;
    Nexil::Array<PlacedPoint> placed;
    Nexil::Internal::resizeUninitialized(placed, count);
    std::atomic<bool> isOutside = false;
    Nexil::parallel::forRange(count, grain::kPoints, [&](std::size_t begin, std::size_t end) {
        for (std::size_t i = begin; i < end; ++i) {
            Coordinate voxel{};
            if (!Internal::voxelOfPoint({positions[i].x, positions[i].y, positions[i].z}, voxelSize, voxel))
                isOutside = true;
            placed[i] = {tileOrigin<Traits::kDataWidth>(voxel), static_cast<unsigned int>(i)};
        }
    });
    if (isOutside)
        return nullptr;
    Nexil::parallel::sort(placed.begin(), placed.end(), [](PlacedPoint const& a, PlacedPoint const& b) {
        return a.tile == b.tile ? a.index < b.index : isBefore(a.tile, b.tile);
    });
    Nexil::Array<Coordinate> origins;
    Nexil::Array<unsigned int> offsets;
    Nexil::Array<unsigned int> sorted;
    Nexil::Internal::resizeUninitialized(sorted, count);
    for (std::uint64_t i = 0; i < count; ++i) {
        if (i == 0 || placed[i].tile != placed[i - 1].tile) {
            origins.push_back(placed[i].tile);
            offsets.push_back(static_cast<unsigned int>(i));
        }
        sorted[i] = placed[i].index;
    }
    offsets.push_back(static_cast<unsigned int>(count));
    auto made = Nexil::makePtr<PointTopology>(std::move(name), std::move(origins), std::move(offsets));
    order = std::move(sorted);
    return made;
}

template class PointTopology<SmallTiles>;
template class PointTopology<WideTiles>;

} // namespace VLD::TileTree3D
