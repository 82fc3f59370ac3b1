#include <support/Geometry.h>

#include <veldrin/algorithms/StrandMeasures.h>

#include <gtest/gtest.h>

#include <cmath>
#include <random>

namespace {

using namespace Veldrin::GeometryAlgorithms;
using Veldrin::Math::float3;

struct Measured {
    Nexil::Array<float3> tangents;
    Nexil::Array<float> lengths, segments, ratios;

    Measured(std::vector<float3> const& points, std::vector<unsigned int> const& offsets)
    {
        auto const strands = support::strands(points, offsets);
        EXPECT_TRUE(computeStrandTangents(*strands, tangents, nullptr));
        EXPECT_TRUE(computeStrandLength(*strands, lengths, segments, nullptr));
        EXPECT_TRUE(computeStrandRatio(*strands, ratios, nullptr));
    }
    bool operator==(Measured const&) const = default;
};

/// The same one point after the other. Tangents lead from the point before to the one behind.
void expectDefinition(Measured const& found, std::vector<float3> const& points, std::size_t strand, std::size_t first,
                      std::size_t end)
{
    float total = 0;
    for (std::size_t i = first; i < end; ++i) {
        float const segment = i + 1 < end ? length(points[i + 1] - points[i]) : 0;
        total += segment;
        EXPECT_FLOAT_EQ(found.segments[i], segment);
        EXPECT_FLOAT_EQ(found.ratios[i], end - first == 1 ? 0 : float(i - first) / float(end - first - 1));
        auto const along = points[i + 1 < end ? i + 1 : i] - points[i > first ? i - 1 : i];
        auto const tangent = end - first == 1    ? float3{0, 1, 0}
                             : length(along) > 0 ? along * (1 / length(along))
                                                 : float3{};
        EXPECT_LT(length(found.tangents[i] - tangent), 1e-6f);
    }
    EXPECT_FLOAT_EQ(found.lengths[strand], total);
}

TEST(StrandMeasures, FollowTheDefinitionWithTheSameBitsOnAllThreads)
{
    // Of no to eight points, of which many coincide.
    std::mt19937 random(3);
    std::vector<float3> points;
    std::vector<unsigned int> offsets{0};
    for (int s = 0; s < 5000; ++s) {
        for (auto k = random() % 9; k > 0; --k)
            points.push_back({float(random() % 2) / 7, float(random() % 2) / 3, 0});
        offsets.push_back(static_cast<unsigned int>(points.size()));
    }
    Measured const expected(points, offsets);
    support::onThreadCounts([&] { EXPECT_TRUE(Measured(points, offsets) == expected); });
    for (std::size_t s = 0; s + 1 < offsets.size(); ++s)
        expectDefinition(expected, points, s, offsets[s], offsets[s + 1]);
}

TEST(StrandMeasures, OffsetsThatFallNeitherOverlapNorLeaveTheArrays)
{
    Measured const fallen({{0, 0, 0}, {1, 0, 0}, {2, 0, 0}, {3, 0, 0}}, {0, 3, 1, 4000000000u, 2});
    EXPECT_EQ(fallen.lengths, (Nexil::Array<float>{2, 0, 0, 0}));
    EXPECT_EQ(fallen.segments, (Nexil::Array<float>{1, 1, 0, 0}));
    EXPECT_EQ(fallen.tangents[3], (float3{0, 1, 0}));
}

} // namespace
