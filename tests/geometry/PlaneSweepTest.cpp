#include <support/Geometry.h>

#include <nexil/JobCancel.h>

#include <gtest/gtest.h>

#include <stdexcept>

namespace {

using namespace Veldrin;
using namespace Veldrin::Geometry;

TEST(PlaneSweep, APlaneHasTheBitsOfTheSerialLoopOnEveryThreadCount)
{
    constexpr unsigned int n = 700; // not a divisor of any grain
    constexpr float size = 3.7f;
    std::vector<Math::float3> points;
    std::vector<unsigned int> corners;
    std::vector<unsigned int> offsets{0};
    float const right = size / n;
    float const back = -size / n;
    for (unsigned int j = 0; j <= n; ++j)
        for (unsigned int i = 0; i <= n; ++i)
            points.push_back({-size / 2 + static_cast<float>(i) * right, 0, size / 2 + static_cast<float>(j) * back});
    for (unsigned int j = 0; j < n; ++j)
        for (unsigned int i = 0; i < n; ++i) {
            unsigned int const a = j * (n + 1) + i;
            for (unsigned int corner : {a, a + 1, a + n + 2, a + n + 1})
                corners.push_back(corner);
            offsets.push_back(offsets.back() + 4);
        }
    support::onThreadCounts([&] {
        auto const plane = createObject();
        ASSERT_TRUE(populatePlaneMesh(size, n, *plane));
        // No number is -0 or NaN, so that equal ones have equal bits.
        EXPECT_TRUE(support::valuesIn<Math::float3>(*plane, sPointPosition) == points);
        EXPECT_TRUE(support::valuesIn<unsigned int>(*plane, sFaceVertex) == corners);
        EXPECT_TRUE(support::valuesIn<unsigned int>(*plane, sFaceOffset) == offsets);
    });
    Nexil::setJobCancelHook([] { return true; });
    auto const untouched = createObject();
    EXPECT_THROW(populatePlaneMesh(1, 500, *untouched), std::runtime_error);
    Nexil::setJobCancelHook(nullptr);
    EXPECT_TRUE(untouched->empty());
}

} // namespace
