#pragma once

#include <support/Volumes.h>

#include <nexil/Ptr.h>
#include <vld/BuildLevelSet.h>
#include <vld/Object.h>
#include <vld/PointTopology.h>

namespace support {

/// A level set of a sphere around a voxel.
template <class Traits>
VLD::TileTree3D::Grid<Traits> sphere(VLD::TileTree3D::GridDescription const& description, int radius = 12,
                                     Coordinate const& centre = {})
{
    auto const distance = [&](Veldrin::Math::double3 const& p) {
        double const s = description.voxelSize;
        return length(p - Veldrin::Math::double3{centre.x * s, centre.y * s, centre.z * s}) - radius * s;
    };
    int const reach = radius + 4;
    return VLD::TileTree3D::buildLevelSet<Traits>(
        description, {centre - Coordinate{reach, reach, reach}, {2 * reach, 2 * reach, 2 * reach}},
        2 * description.voxelSize, distance);
}

/// A volume of that under the names of a level set.
template <class Traits>
Nexil::MutablePtr<VLD::Object> sphereVolume(int radius = 12)
{
    auto volume = VLD::createObject();
    sphere<Traits>({.channelName = "voxel_signed_distance", .voxelSize = 0.5f}, radius).addTo(*volume);
    return volume;
}

/// Three points in two tiles, named "points".
template <class Traits>
auto points()
{
    Nexil::Array<unsigned int> order;
    return VLD::TileTree3D::PointTopology<Traits>::build("points", {{0, 0, 0}, {40, 0, 0}, {0, 0, 1}}, 1, order);
}

/// The same with a channel over them.
template <class Traits>
void addPoints(VLD::Object& volume)
{
    volume.addComponent(points<Traits>());
    volume.addComponent(Nexil::makePtr<VLD::TileTree3D::Channel<Traits>>(
        "sizes", "points", Nexil::makePtr<Nexil::Array<float>>(Nexil::Array<float>{1, 2, 3}), 0.0f));
}

} // namespace support
