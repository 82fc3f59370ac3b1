#include <support/Geometry.h>
#include <veldrin/geometry/GeoLocation.h>

#include <gtest/gtest.h>

#include <cmath>
#include <functional>
#include <utility>

namespace {

using Veldrin::Geometry::Common::GeoLocation;

TEST(GeoLocation, AnyDifferenceInAnyFieldMakesLocationsUnequal)
{
    struct Case {
        char const* what;
        std::function<void(GeoLocation&)> change;
    };
    std::vector<Case> cases{
        {"an index",
         [](GeoLocation& l) {
             l.indices = support::array<unsigned int>({1, 2, 4});
         }},
        {"fewer indices",
         [](GeoLocation& l) {
             l.indices = support::array<unsigned int>({1, 2});
         }},
        {"no indices", [](GeoLocation& l) { l.indices = nullptr; }},
        {"a weight",
         [](GeoLocation& l) {
             l.weights = support::array<float>({0.5f, 0.25f});
         }},
        {"more weights",
         [](GeoLocation& l) {
             l.weights = support::array<float>({0.5f, 0.5f, 0});
         }},
        {"no weights", [](GeoLocation& l) { l.weights = nullptr; }},
        {"a weight that is no number",
         [](GeoLocation& l) {
             l.weights = support::array<float>({0.5f, NAN});
         }},
    };
    for (int i = 0; i < 6; ++i)
        cases.push_back({"an id", [i](GeoLocation& l) { l.ids[i] ^= 0x80000000u; }});
    for (int i = 0; i < 4; ++i)
        cases.push_back({"a parameter", [i](GeoLocation& l) { l.params[i] += 1; }});

    auto const make = [] {
        GeoLocation location;
        location.ids[5] = 7;
        location.params[3] = 2;
        location.indices = support::array<unsigned int>({1, 2, 3});
        location.weights = support::array<float>({0.5f, 0.5f});
        return location;
    };
    EXPECT_TRUE(make() == make());
    for (Case const& c : cases) {
        auto changed = make();
        c.change(changed);
        EXPECT_TRUE(changed != make()) << c.what;
        EXPECT_FALSE(make() == changed) << c.what;
    }
}

TEST(GeoLocation, NaNEqualsNothingExceptWithinOneSharedArray)
{
    GeoLocation location;
    location.weights = support::array<float>({NAN});
    GeoLocation const sharing = location;
    EXPECT_TRUE(sharing == location);
    EXPECT_EQ(sharing.weights, location.weights);

    location.params[1] = NAN;
    GeoLocation const copy = location;
    EXPECT_FALSE(copy == location);
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
