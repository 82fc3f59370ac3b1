#include <support/Geometry.h>

#include <gtest/gtest.h>

namespace {

using namespace Veldrin;
using namespace Veldrin::Geometry;

TEST(PlaneSweep, APlaneHasTheSameBitsOnEveryThreadCount)
{
    constexpr unsigned int n = 700; // not a divisor of any grain
    support::onThreadCounts([&] {
        auto const plane = createObject();
        ASSERT_TRUE(populatePlaneMesh(3.7f, n, *plane));
        auto const points = support::valuesIn<Math::float3>(*plane, sPointPosition);
        auto const faces = support::facesOf(*plane);
        ASSERT_EQ(points.size(), (n + 1) * (n + 1));
        ASSERT_EQ(faces.size(), n * n);
        float const step = 3.7f / n;
        for (unsigned int i = 0; i < points.size(); ++i)
            ASSERT_EQ(points[i], (Math::float3{-1.85f + static_cast<float>(i % (n + 1)) * step, 0,
                                               1.85f + static_cast<float>(i / (n + 1)) * -step}));
        for (unsigned int i = 0; i < faces.size(); ++i) {
            unsigned int const a = i / n * (n + 1) + i % n;
            ASSERT_EQ(faces[i], (std::vector<unsigned int>{a, a + 1, a + n + 2, a + n + 1}));
        }
    });
}

} // namespace
