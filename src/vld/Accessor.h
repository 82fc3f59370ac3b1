#pragma once

#include <vld/Channel.h>
#include <vld/Coordinates.h>
#include <vld/VoxelTopology.h>

namespace VLD::TileTree3D {

/// Reads voxels of one channel, and remembers the leaf tile of the last one.
///
///     Accessor<SmallTiles, float> density(*container->topology(), *channel);
///     float const value = density(Coordinate{3, -7, 12});
///
/// A voxel outside all tiles has the channel's default. Where the channel has another element type, another
/// configuration, or not one value per element, `isValid` is false and every voxel reads as `E()`.
/// Holds the values; the topology must outlive it. Threads: each has an accessor of its own.
template <class Traits, class E>
class Accessor {
public:
    Accessor(VoxelTopology<Traits> const& topology, ChannelBase const& channel) : topology_(&topology)
    {
        auto values = channel.values<E>();
        auto const* const defaultValue = channel.defaultValue().get<E>();
        if (!values || !defaultValue || channel.tileParameters() != Traits::parameters() ||
            values->size() != topology.elementCount())
            return;
        values_ = std::move(values);
        default_ = *defaultValue;
    }

    [[nodiscard]] bool isValid() const noexcept { return static_cast<bool>(values_); }

    [[nodiscard]] E const& operator()(Coordinate const& voxel) noexcept
    {
        if (!values_)
            return default_;
        auto const x = static_cast<unsigned int>(voxel.x) - static_cast<unsigned int>(leafOrigin_.x);
        auto const y = static_cast<unsigned int>(voxel.y) - static_cast<unsigned int>(leafOrigin_.y);
        auto const z = static_cast<unsigned int>(voxel.z) - static_cast<unsigned int>(leafOrigin_.z);
        constexpr unsigned int w = Traits::kDataWidth;
        if (leaf_ && x < w && y < w && z < w)
            return leaf_[(x * w + y) * w + z];
        return find(voxel);
    }

private:
    E const& find(Coordinate const& voxel) noexcept
    {
        unsigned int const element = topology_->findElement(voxel);
        if (element == kNoElement)
            return default_;
        E const* const values = values_->data();
        if (element < topology_->voxelCount()) {
            leafOrigin_ = tileOrigin<Traits::kDataWidth>(voxel);
            leaf_ = values + element / Traits::kLeafVoxels * Traits::kLeafVoxels;
        }
        return values[element];
    }

    VoxelTopology<Traits> const* topology_;
    Nexil::Ptr<Nexil::Array<E>> values_;
    E default_{};
    Coordinate leafOrigin_{};
    E const* leaf_ = nullptr;
};

} // namespace VLD::TileTree3D
