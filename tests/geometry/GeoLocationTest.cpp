#include <support/Geometry.h>
#include <veldrin/geometry/GeoLocation.h>

#include <gtest/gtest.h>

#include <cmath>

namespace {

using Veldrin::Geometry::Common::GeoLocation;

GeoLocation located(std::vector<unsigned int> const& indices, std::vector<float> const& weights)
{
    GeoLocation location;
    location.ids[5] = 7;
    location.params[3] = 2;
    location.indices = support::array(indices);
    location.weights = support::array(weights);
    return location;
}

TEST(GeoLocation, AnyDifferenceInAnyFieldMakesLocationsUnequal)
{
    std::vector<unsigned int> const indices{1, 2, 3};
    std::vector<float> const weights{0.5f, 0.5f};
    GeoLocation const location = located(indices, weights);
    EXPECT_TRUE(located(indices, weights) == location);
    std::vector<GeoLocation> others(12, location);
    others[0].indices = nullptr;
    others[1].weights = nullptr;
    for (std::size_t i = 0; i < 6; ++i)
        others[2 + i].ids[i] ^= 0x80000000u;
    for (std::size_t i = 0; i < 4; ++i)
        others[8 + i].params[i] += 1;
    for (auto const& differing : {std::vector{1u, 2u, 4u}, {1u, 2u}, {1u, 2u, 3u, 4u}})
        others.push_back(located(differing, weights));
    for (auto const& differing : {std::vector{0.5f, 0.25f}, {0.5f}, {0.5f, 0.5f, 0.0f}, {0.5f, NAN}})
        others.push_back(located(indices, differing));
    for (auto const& other : others) {
        EXPECT_TRUE(other != location) << &other - others.data();
        EXPECT_FALSE(location == other) << &other - others.data();
    }
}

TEST(GeoLocation, NaNEqualsNothingExceptWithinOneSharedArray)
{
    GeoLocation location;
    location.weights = support::array<float>({NAN});
    EXPECT_TRUE(GeoLocation(location) == location);
    location.params[1] = NAN;
    EXPECT_FALSE(GeoLocation(location) == location);
    EXPECT_FALSE(location == location);
    GeoLocation negativeZero;
    negativeZero.params[0] = -0.0f;
    EXPECT_TRUE(negativeZero == GeoLocation());
}

TEST(GeoLocation, MovingTakesTheArraysAndLeavesNullOnes)
{
    GeoLocation source;
    ASSERT_TRUE(source.indices && source.weights);
    source.ids[2] = 9;
    auto const* const indices = source.indices.get();

    GeoLocation target(std::move(source));
    EXPECT_EQ(target.indices.get(), indices);
    EXPECT_EQ(target.ids[2], 9u);
    EXPECT_FALSE(source.indices || source.weights);

    GeoLocation assigned;
    assigned = std::move(target);
    EXPECT_EQ(assigned.indices.get(), indices);
    EXPECT_TRUE(source == target); // both moved from: same numbers, null arrays
    EXPECT_TRUE(target != assigned);

    auto& itself = assigned;
    assigned = std::move(itself);
    EXPECT_EQ(assigned.indices.get(), indices);
    EXPECT_TRUE(assigned.weights);
}

} // namespace
