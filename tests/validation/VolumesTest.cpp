#include "../volume/Samples.h"
#include <support/FailingMemory.h>

#include <support/Geometry.h>

#include <veldrin/validation/VolumeValidator.h>
#include <veldrin/volume/VolumeConversion.h>
#include <vld/Container.h>

#include <gtest/gtest.h>

#include <cmath>

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
    return Geometry::VolumeValidator().validate(*geometry).message.c_str();
}

TYPED_TEST(VolumeVerdicts, ConvertedVolumesAreValid)
{
    auto const geometry = Geometry::move_vld_volume_to_object(*support::sphereVolume<TypeParam>());
    support::onThreadCounts([&] {
        EXPECT_EQ(Geometry::VolumeValidator().validate(*geometry).message.view(), "");
        // And as geo properties, with the identity of a container as the range.
        EXPECT_EQ(Geometry::GeoValidator().validate(*geometry).message.view(), "");
    });
    EXPECT_TRUE(Geometry::VolumeValidator().findFailures(*geometry).empty());
}

TYPED_TEST(VolumeVerdicts, DataOverAContainerAreJudgedWithoutItsIndices)
{
    auto const volume = support::sphereVolume<TypeParam>();
    auto const count = volume->template component<VoxelTopology<TypeParam>>("voxel_component")->elementCount();
    auto const geometry = Geometry::move_vld_volume_to_object(*volume);
    auto const put = [&](std::uint64_t valueCount) {
        Nexil::Array<float> values;
        values.resize(valueCount);
        auto data = createObject();
        Geometry::createDataGeoProperty<float>(0, "voxel_tile_tree",
                                               Nexil::makePtr<Nexil::Array<float>>(std::move(values)), *data);
        setProperty(*geometry, "heat", std::move(data));
    };
    auto const message = [](Object const& object) {
        return std::string(Geometry::GeoValidator().validate(object).message.view());
    };
    put(count);
    EXPECT_EQ(message(*geometry), "");
    put(count - 1);
    EXPECT_EQ(message(*geometry), "voxel_tile_tree contains an invalid index into heat");

    // Indices that were made for the first verdict on a volume would not be allocated for the second.
    auto const fresh = Geometry::move_vld_volume_to_object(*support::sphereVolume<TypeParam>());
    auto const allocations = [&] {
        std::uint64_t const before = support::allocationCount();
        EXPECT_EQ(message(*fresh), "");
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
    for (float const size : {0.0f, -1.0f, std::nanf(""), HUGE_VALF})
        EXPECT_EQ(verdictOf<TypeParam>(good, size), invalid) << size;
    auto const broken = [&](auto const& change) {
        TileLevels levels = good;
        change(levels);
        return verdictOf<TypeParam>(std::move(levels), 1);
    };
    EXPECT_EQ(broken([](TileLevels& l) { l.leafOrigins[1].x += 1; }), invalid);
    EXPECT_EQ(broken([](TileLevels& l) { l.leafOrigins[1] = l.leafOrigins[0]; }), invalid);
    EXPECT_EQ(broken([](TileLevels& l) { l.leafParents[0] = 0xFFFFFFF0u; }), invalid);
    EXPECT_EQ(broken([](TileLevels& l) { l.innerChildren.resize(l.innerChildren.size() - 1); }), invalid);
}

TYPED_TEST(VolumeVerdicts, WhatDoesNotConvertIsNone)
{
    auto const geometry = Geometry::move_vld_volume_to_object(*support::sphereVolume<TypeParam>());
    // The container is attached to nothing any more.
    auto const tileTree = support::part(*geometry, "voxel_tile_tree");
    setProperty(*geometry, "lost", tileTree);
    EXPECT_EQ(Geometry::VolumeValidator().validate(*geometry).message.view(), "Object is not a valid volume");
}

} // namespace
