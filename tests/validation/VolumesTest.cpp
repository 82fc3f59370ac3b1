#include "../volume/Samples.h"
#include "Edits.h"

#include <support/FailingMemory.h>

#include <veldrin/validation/VolumeValidator.h>
#include <veldrin/volume/VolumeConversion.h>
#include <vld/Container.h>

#include <gtest/gtest.h>

namespace {

using namespace Veldrin;
using VLD::TileTree3D::Container;
using VLD::TileTree3D::TileLevels;
using VLD::TileTree3D::VoxelTopology;

template <class Traits>
class VolumeVerdicts : public ::testing::Test {};
TYPED_TEST_SUITE(VolumeVerdicts, support::BothConfigurations);

template <class Traits>
std::string verdictOf(TileLevels levels, float voxelSize)
{
    auto const topology = Nexil::makePtr<VoxelTopology<Traits>>("voxel_component", std::move(levels));
    auto volume = VLD::createObject();
    volume->addComponent(topology);
    volume->addComponent(Nexil::makePtr<Container<Traits>>("voxel_tile_tree", topology, voxelSize));
    auto const geometry = Geometry::move_vld_volume_to_object(*volume);
    return support::verdict(Geometry::VolumeValidator(), *geometry);
}

TYPED_TEST(VolumeVerdicts, ConvertedVolumesAreValid)
{
    auto const geometry = Geometry::move_vld_volume_to_object(*support::sphereVolume<TypeParam>());
    support::onThreadCounts([&] {
        EXPECT_EQ(support::verdict(Geometry::VolumeValidator(), *geometry), "");
        // And as geo properties, with the identity of a container as the range.
        EXPECT_EQ(support::verdict(Geometry::GeoValidator(), *geometry), "");
    });
    EXPECT_TRUE(Geometry::VolumeValidator().findFailures(*geometry).empty());
}

TYPED_TEST(VolumeVerdicts, DataOverAContainerAreJudgedWithoutItsIndices)
{
    auto const verdict = [](Object const& object) { return support::verdict(Geometry::GeoValidator(), object); };
    auto const volume = support::sphereVolume<TypeParam>();
    auto const count = volume->template component<VoxelTopology<TypeParam>>("voxel_component")->elementCount();
    auto const geometry = Geometry::move_vld_volume_to_object(*volume);
    support::addData(*geometry, "heat", "voxel_tile_tree", std::vector<float>(count));
    EXPECT_EQ(verdict(*geometry), "");
    support::addData(*geometry, "heat", "voxel_tile_tree", std::vector<float>(count - 1));
    EXPECT_EQ(verdict(*geometry), "voxel_tile_tree contains an invalid index into heat");

    // Indices that were made for the first verdict on a volume would not be allocated for the second.
    auto const fresh = Geometry::move_vld_volume_to_object(*support::sphereVolume<TypeParam>());
    auto const allocations = [&] {
        std::uint64_t const before = support::allocationCount();
        EXPECT_EQ(verdict(*fresh), "");
        return support::allocationCount() - before;
    };
    std::uint64_t const first = allocations();
    EXPECT_EQ(first, allocations());
}

TYPED_TEST(VolumeVerdicts, InconsistentOnesAreNot)
{
    auto const grid = support::sphere<TypeParam>({.channelName = "voxel_signed_distance"});
    TileLevels const good = support::tilesOf(*grid.topology);
    char const invalid[] = "Object is not a valid volume";
    EXPECT_EQ(verdictOf<TypeParam>(good, 1), "");
    EXPECT_EQ(verdictOf<TypeParam>(good, 0), invalid);
    TileLevels broken = good;
    broken.leafOrigins[1].x += 1;
    EXPECT_EQ(verdictOf<TypeParam>(std::move(broken), 1), invalid);
    // One whose container is attached to nothing does not convert.
    auto const geometry = Geometry::move_vld_volume_to_object(*support::sphereVolume<TypeParam>());
    setProperty(*geometry, "lost", support::part(*geometry, "voxel_tile_tree"));
    EXPECT_EQ(support::verdict(Geometry::VolumeValidator(), *geometry), invalid);
}

} // namespace
