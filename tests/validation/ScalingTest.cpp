#include "Edits.h"

#include <support/Costly.h>

#include <veldrin/validation/GeoValidator.h>

#include <gtest/gtest.h>

namespace {

using namespace Veldrin;
using namespace support;

TEST(Validation, NeverFetchesWhatATypeOrASizeTells)
{
    auto const object = Nexil::makeMutable<Costly>();
    // Not a geo property, but no cheaper to look at.
    setProperty(*object, Geometry::sData, array<float>({1}));
    addComponent(*object, "c", 3);
    auto data = Nexil::makeMutable<Costly>();
    Geometry::createDataGeoProperty(0.0f, "c", array<float>({1, 2, 3}), *data);
    setProperty(*object, "d", std::move(data));
    auto range = Nexil::makeMutable<Costly>();
    Geometry::populateRangeGeoProperty(array<unsigned int>({0, 1, 2}), "c", *range);
    setProperty(*object, "r", std::move(range));
    EXPECT_EQ(verdict(Geometry::GeoValidator(), *object), "");
}

TEST(Validation, ReadsAnArrayOnceHoweverManyPropertiesShareIt)
{
    // Read once for each property, these would be 10^12 indices.
    auto const object = createObject();
    auto const indices = array(Indices(10'000'000));
    addComponent(*object, "c", 1);
    for (int i = 0; i < 50'000; ++i) {
        auto const number = std::to_string(i);
        auto range = createObject();
        Geometry::populateRangeGeoProperty(indices, "c", *range);
        setProperty(*object, ("r" + number).c_str(), std::move(range));
        addData(*object, ("d" + number).c_str(), ("r" + number).c_str(), {1});
        addData(*object, ("e" + number).c_str(), ("r" + number).c_str(), {1});
    }
    EXPECT_EQ(verdict(Geometry::GeoValidator(), *object), "");
}

} // namespace
