#include <support/Geometry.h>

#include <veldrin/algorithms/StrandMeasures.h>

#include <gtest/gtest.h>

#include <cmath>
#include <random>

namespace {

using namespace Veldrin::GeometryAlgorithms;
using Veldrin::Math::float3;
using Floats = Nexil::Array<float>;

struct Measured {
    Nexil::Array<float3> tangents;
    Floats lengths, segments, ratios;

    Measured(std::vector<float3> const& points, std::vector<unsigned int> const& offsets)
    {
        auto const strands = Veldrin::createObject();
        Veldrin::Geometry::populateStrand(support::array(points), support::array(offsets), *strands);
        EXPECT_TRUE(computeStrandTangents(*strands, tangents, nullptr));
        EXPECT_TRUE(computeStrandLength(*strands, lengths, segments, nullptr));
        EXPECT_TRUE(computeStrandRatio(*strands, ratios, nullptr));
    }
    bool operator==(Measured const&) const = default;
};

TEST(StrandMeasures, SmallStrandsGiveTheValuesWrittenOutByHand)
{
    // A bent strand of three, two that coincide, one alone, none, and two apart.
    Measured const found({{0, 0, 0}, {3, 4, 0}, {3, 4, 2}, {1, 1, 1}, {1, 1, 1}, {9, 9, 9}, {0, 0, 0}, {0, 0, -5}},
                         {0, 3, 5, 6, 6, 8});
    float const across = 1 / std::sqrt(9.0f + 16.0f + 4.0f);
    EXPECT_EQ(found.tangents, (Nexil::Array<float3>{{3 * 0.2f, 4 * 0.2f, 0},
                                                    {3 * across, 4 * across, 2 * across},
                                                    {0, 0, 1},
                                                    {0, 0, 0},
                                                    {0, 0, 0},
                                                    {0, 1, 0},
                                                    {0, 0, -1},
                                                    {0, 0, -1}}));
    EXPECT_EQ(found.lengths, (Floats{7, 0, 0, 0, 5}));
    EXPECT_EQ(found.segments, (Floats{5, 2, 0, 0, 0, 0, 5, 0}));
    EXPECT_EQ(found.ratios, (Floats{0, 0.5f, 1, 0, 1, 0, 0, 1}));

    // Offsets that fall: strands neither overlap nor leave the arrays.
    Measured const fallen({{0, 0, 0}, {1, 0, 0}, {2, 0, 0}, {3, 0, 0}}, {0, 3, 1, 4000000000u, 2});
    EXPECT_EQ(fallen.lengths, (Floats{2, 0, 0, 0}));
    EXPECT_EQ(fallen.segments, (Floats{1, 1, 0, 0}));
    EXPECT_EQ(fallen.tangents[3], (float3{0, 1, 0}));
}

TEST(StrandMeasures, ManyStrandsAgreeWithSumsInDoubleAndAreTheSameBitsOnAllThreads)
{
    std::mt19937 random(3);
    std::vector<float3> points;
    std::vector<unsigned int> offsets{0};
    for (int s = 0; s < 5000; ++s) {
        for (auto k = random() % 9; k > 0; --k)
            points.push_back({float(random() % 1000) / 7, float(random() % 1000) / 7, float(random() % 1000) / 7});
        offsets.push_back(static_cast<unsigned int>(points.size()));
    }
    Measured const expected(points, offsets);
    support::onThreadCounts([&] { EXPECT_TRUE(Measured(points, offsets) == expected); });
    for (std::size_t s = 0; s + 1 < offsets.size(); ++s) {
        double total = 0;
        std::size_t const last = offsets[s + 1] - 1;
        for (std::size_t i = offsets[s]; i < offsets[s + 1]; ++i) {
            auto const distance = [&](std::size_t a, std::size_t b) {
                return std::hypot(double(points[b].x) - double(points[a].x), double(points[b].y) - double(points[a].y),
                                  double(points[b].z) - double(points[a].z));
            };
            total += i < last ? distance(i, i + 1) : 0;
            if (offsets[s] == last)
                continue;
            EXPECT_FLOAT_EQ(expected.ratios[i], float(double(i - offsets[s]) / double(last - offsets[s])));
            auto const from = i == offsets[s] ? i : i - 1;
            auto const to = i == last ? i : i + 1;
            EXPECT_NEAR(dot(expected.tangents[i], points[to] - points[from]), distance(from, to), 1e-3);
        }
        EXPECT_NEAR(expected.lengths[s], total, 1e-5 * (1 + total));
    }
}

} // namespace
