#include <algorithms/EdgeOracle.h>
#include <support/Geometry.h>

#include <veldrin/algorithms/StrandMeasures.h>

#include <gtest/gtest.h>

#include <cmath>
#include <cstring>
#include <numeric>
#include <random>

namespace {

using namespace Veldrin::GeometryAlgorithms;
using Veldrin::Math::float3;
using Floats = std::vector<float>;

Nexil::MutablePtr<Veldrin::Object> strands(std::vector<float3> const& points, std::vector<unsigned int> const& offsets)
{
    auto made = Veldrin::createObject();
    Veldrin::Geometry::populateStrand(support::array(points), support::array(offsets), *made);
    return made;
}

template <class T>
std::vector<T> values(Nexil::Array<T> const& array)
{
    return {array.begin(), array.end()};
}

TEST(StrandMeasures, SmallStrandsGiveTheValuesWrittenOutByHand)
{
    // A bent strand of three, two that coincide, one alone, none, and two apart.
    auto const object = strands(
        {{0, 0, 0}, {3, 4, 0}, {3, 4, 2}, {1, 1, 1}, {1, 1, 1}, {9, 9, 9}, {0, 0, 0}, {0, 0, -5}}, {0, 3, 5, 6, 6, 8});
    Nexil::Array<float3> tangents;
    Nexil::Array<float> lengths;
    Nexil::Array<float> segments;
    Nexil::Array<float> ratios;
    ASSERT_TRUE(computeStrandTangents(*object, tangents, nullptr));
    ASSERT_TRUE(computeStrandLength(*object, lengths, segments, nullptr));
    ASSERT_TRUE(computeStrandRatio(*object, ratios, nullptr));
    float const across = 1 / std::sqrt(9.0f + 16.0f + 4.0f);
    EXPECT_EQ(values(tangents), (std::vector<float3>{{3 * 0.2f, 4 * 0.2f, 0},
                                                     {3 * across, 4 * across, 2 * across},
                                                     {0, 0, 1},
                                                     {0, 0, 0},
                                                     {0, 0, 0},
                                                     {0, 1, 0},
                                                     {0, 0, -1},
                                                     {0, 0, -1}}));
    EXPECT_EQ(values(lengths), (Floats{7, 0, 0, 0, 5}));
    EXPECT_EQ(values(segments), (Floats{5, 2, 0, 0, 0, 0, 5, 0}));
    EXPECT_EQ(values(ratios), (Floats{0, 0.5f, 1, 0, 1, 0, 0, 1}));
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
    auto const object = strands(points, offsets);
    std::string expected;
    for (int const threads : {1, 2, 3}) {
        tbb::global_control const limit(tbb::global_control::max_allowed_parallelism,
                                        static_cast<std::size_t>(threads));
        Nexil::Array<float3> tangents;
        Nexil::Array<float> lengths;
        Nexil::Array<float> segments;
        Nexil::Array<float> ratios;
        ASSERT_TRUE(computeStrandTangents(*object, tangents, nullptr));
        ASSERT_TRUE(computeStrandLength(*object, lengths, segments, nullptr));
        ASSERT_TRUE(computeStrandRatio(*object, ratios, nullptr));
        std::string bytes(reinterpret_cast<char const*>(tangents.data()), tangents.size() * sizeof(float3));
        for (auto const* array : {&lengths, &segments, &ratios})
            bytes.append(reinterpret_cast<char const*>(array->data()), array->size() * sizeof(float));
        expected = expected.empty() ? bytes : expected;
        EXPECT_TRUE(bytes == expected) << threads << " threads";
        for (std::size_t s = 0; s + 1 < offsets.size(); ++s) {
            double total = 0;
            for (std::size_t i = offsets[s]; i + 1 < offsets[s + 1]; ++i) {
                double const x = double(points[i + 1].x) - double(points[i].x);
                double const y = double(points[i + 1].y) - double(points[i].y);
                double const z = double(points[i + 1].z) - double(points[i].z);
                total += std::sqrt(x * x + y * y + z * z);
                EXPECT_FLOAT_EQ(ratios[i], float(double(i - offsets[s]) / double(offsets[s + 1] - offsets[s] - 1)));
            }
            EXPECT_NEAR(lengths[s], total, 1e-5 * (1 + total));
        }
    }
}

TEST(StrandMeasures, RefusesShortArraysAndLeavesTheOutputsAlone)
{
    auto object = strands({{}, {}, {}}, {0, 3});
    Nexil::Array<float3> tangents{{7, 7, 7}};
    Nexil::Array<float> lengths{7};
    Nexil::Array<float> segments{7};
    auto expectRefused = [&](char const* what) {
        EXPECT_FALSE(computeStrandTangents(*object, tangents, nullptr)) << what;
        EXPECT_FALSE(computeStrandLength(*object, lengths, segments, nullptr)) << what;
        EXPECT_EQ(tangents.size() + lengths.size() + segments.size(), 3u) << what;
    };
    Veldrin::Geometry::setElementCount(Veldrin::Geometry::sStrandComp, 2, *object);
    expectRefused("one offset for each strand");
    Veldrin::Geometry::setElementCount(Veldrin::Geometry::sStrandComp, 1, *object);
    Veldrin::Geometry::setElementCount(Veldrin::Geometry::sPointComp, 4, *object);
    expectRefused("fewer positions than points");
    object->eraseProperty(Veldrin::Geometry::sStrandOffset);
    expectRefused("no offsets");
    EXPECT_FALSE(computeStrandRatio(*object, lengths, nullptr));
    EXPECT_EQ(lengths.size(), 1u);
}

TEST(StrandMeasures, FallingOffsetsNeitherOverlapNorLeaveTheArrays)
{
    auto const object = strands({{0, 0, 0}, {1, 0, 0}, {2, 0, 0}, {3, 0, 0}}, {0, 3, 1, 4000000000u, 2});
    Nexil::Array<float> lengths;
    Nexil::Array<float> segments;
    ASSERT_TRUE(computeStrandLength(*object, lengths, segments, nullptr));
    EXPECT_EQ(values(lengths), (Floats{2, 0, 0, 0}));
    EXPECT_EQ(values(segments), (Floats{1, 1, 0, 0}));
    Nexil::Array<float3> tangents;
    ASSERT_TRUE(computeStrandTangents(*object, tangents, nullptr));
    EXPECT_EQ(tangents[3], (float3{0, 1, 0}));
}

TEST(StrandMeasures, OneGiantStrandAndAMillionOfOnePointAreNoHarderThanOthers)
{
    Nexil::Array<float> lengths;
    Nexil::Array<float> segments;
    Nexil::Array<float> ratios;
    Nexil::Array<float3> tangents;
    unsigned int const many = support::kGiant;
    std::vector<float3> points(many);
    for (unsigned int i = 0; i < many; ++i)
        points[i] = {static_cast<float>(i % 2), 0, 0};
    auto const giant = strands(points, {0, many});
    ASSERT_TRUE(computeStrandLength(*giant, lengths, segments, nullptr));
    EXPECT_EQ(lengths[0], static_cast<float>(many - 1));
    ASSERT_TRUE(computeStrandRatio(*giant, ratios, nullptr));
    EXPECT_EQ(ratios[many - 1], 1);
    ASSERT_TRUE(computeStrandTangents(*giant, tangents, nullptr));
    EXPECT_EQ(tangents[many - 1], (float3{1, 0, 0}));

    points.resize(1000000);
    std::vector<unsigned int> offsets(points.size() + 1);
    std::iota(offsets.begin(), offsets.end(), 0u);
    auto const dots = strands(points, offsets);
    ASSERT_TRUE(computeStrandLength(*dots, lengths, segments, nullptr));
    EXPECT_EQ(lengths[999999], 0);
    ASSERT_TRUE(computeStrandTangents(*dots, tangents, nullptr));
    EXPECT_EQ(tangents[999999], (float3{0, 1, 0}));
}

} // namespace
