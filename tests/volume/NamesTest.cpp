#include <support/Geometry.h>

#include <veldrin/volume/VolumeInterpolation.h>
#include <veldrin/volume/VolumeNames.h>

#include <gtest/gtest.h>

namespace {

using namespace Veldrin;
using Geometry::Common::DataInterpolationMode;
using VLD::TileTree3D::DataElementInitializerType;

TEST(VolumeNames, ExchangeThePrefixOfOneSideForThatOfTheOther)
{
    auto const points = support::filled([](Object& o) { Geometry::populatePointCloud(o); });
    auto const voxels = support::filled([](Object& o) { Geometry::populateVolume(o); });
    struct Case {
        char const* name;
        char const* toVolume[2];   // from points, from voxels
        char const* fromVolume[2]; // to points, to voxels
    };
    std::vector<Case> const cases{
        {"point_fog_density",
         {"voxel_fog_density", "voxel_point_fog_density"},
         {"point_point_fog_density", "voxel_point_fog_density"}},
        {"voxel_fog_density",
         {"voxel_voxel_fog_density", "voxel_fog_density"},
         {"point_fog_density", "voxel_fog_density"}},
        {"", {"voxel_", "voxel_"}, {"point_", "voxel_"}},
    };
    for (Case const& c : cases) {
        EXPECT_EQ(mapGeoPropertyNameToVLDVolume(c.name, *points), c.toVolume[0]) << c.name;
        EXPECT_EQ(mapGeoPropertyNameToVLDVolume(c.name, *voxels), c.toVolume[1]) << c.name;
        EXPECT_EQ(mapGeoPropertyNameFromVLDVolume(c.name, *points), c.fromVolume[0]) << c.name;
        EXPECT_EQ(mapGeoPropertyNameFromVLDVolume(c.name, *voxels), c.fromVolume[1]) << c.name;
        EXPECT_EQ(mapGeoPropertyName(c.name, *points, *voxels), c.toVolume[0]) << c.name;
        EXPECT_EQ(mapGeoPropertyName(c.name, *voxels, *points), c.fromVolume[0]) << c.name;
    }
}

TEST(VolumeInterpolation, MapsModesBothWaysAndTakesAnythingElseForTheDefaultValue)
{
    unsigned int const toVolume[] = {1, 2, 0, 0, 0};
    unsigned int const toObject[] = {2, 0, 1, 2, 2};
    for (unsigned int const i : {0u, 1u, 2u, 3u, 4u}) {
        EXPECT_EQ(Geometry::to_vld_volume_interp(DataInterpolationMode(i)), DataElementInitializerType(toVolume[i]));
        EXPECT_EQ(Geometry::to_object_interp(DataElementInitializerType(i)), DataInterpolationMode(toObject[i]));
    }
}

} // namespace
