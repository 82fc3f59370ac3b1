#include <support/Geometry.h>
#include <veldrin/geometry/GeoLocation.h>

#include <gtest/gtest.h>

#include <cmath>

namespace {

using Veldrin::Geometry::Common::GeoLocation;

TEST(GeoLocation, AnyDifferenceInAnyFieldMakesLocationsUnequal)
{
    auto const with = [](std::vector<unsigned int> const& indices, std::vector<float> const& weights) {
        GeoLocation location;
        location.indices = support::array(indices);
        location.weights = support::array(weights);
        return location;
    };
    GeoLocation const location = with({1, 2, 3}, {0.5f, 0.5f});
    EXPECT_TRUE(with({1, 2, 3}, {0.5f, 0.5f}) == location);
    std::vector<GeoLocation> others(12, location);
    others[0].indices = nullptr;
    others[1].weights = nullptr;
    for (std::size_t i = 0; i < 6; ++i)
        others[2 + i].ids[i] ^= 0x80000000u;
    for (std::size_t i = 0; i < 4; ++i)
        others[8 + i].params[i] += 1;
    for (auto const& indices : {std::vector{1u, 2u, 4u}, {1u, 2u}, {1u, 2u, 3u, 4u}})
        others.push_back(with(indices, {0.5f, 0.5f}));
    for (auto const& weights : {std::vector{0.5f, 0.25f}, {0.5f}, {0.5f, 0.5f, 0.0f}, {0.5f, NAN}})
        others.push_back(with({1, 2, 3}, weights));
    for (auto const& other : others)
        EXPECT_TRUE(other != location && !(location == other)) << &other - others.data();
}

TEST(GeoLocation, MovingTakesTheArraysAndLeavesNullOnes)
{
    GeoLocation source;
    source.ids[2] = 9;
    auto const* const indices = source.indices.get();
    GeoLocation target;
    target = GeoLocation(std::move(source));
    EXPECT_FALSE(source.indices || source.weights);
    EXPECT_TRUE(target.indices.get() == indices && target.weights && target.ids[2] == 9);
}

} // namespace
