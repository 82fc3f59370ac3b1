#include <veldrin/geometry/internal/ValueTypes.h>

#include <gmock/gmock.h>

#include <cstring>
#include <limits>

namespace {

using namespace Veldrin::Math;

constexpr float kNaN = std::numeric_limits<float>::quiet_NaN();
constexpr float kInfinity = std::numeric_limits<float>::infinity();

TEST(MathValues, MatricesLieColumnByColumn)
{
    float4x2 matrix;
    for (int column = 0; column < 2; ++column)
        for (int row = 0; row < 4; ++row)
            matrix[column][row] = static_cast<float>(10 * column + row);
    float numbers[8];
    std::memcpy(numbers, &matrix, sizeof numbers);
    EXPECT_THAT(numbers, testing::ElementsAre(0, 1, 2, 3, 10, 11, 12, 13));
    EXPECT_TRUE((float2x3::identity() == float2x3{{{1, 0}, {0, 1}, {0, 0}}}));

    quatd const quaternion;
    double parts[4];
    std::memcpy(parts, &quaternion, sizeof parts);
    EXPECT_THAT(parts, testing::ElementsAre(0, 0, 0, 1));
}

TEST(MathValues, BoxesGrowByNumbersOnly)
{
    using Box = bbox<float3, float>;
    Box box;
    EXPECT_TRUE(box.isEmpty());
    box.extend({kNaN, kNaN, kNaN});
    EXPECT_TRUE(box == Box());
    box.extend({1, -2, kNaN});
    EXPECT_TRUE(box.isEmpty()); // nothing is known of z yet
    box.extend({kNaN, 5, 3});
    EXPECT_FALSE(box.isEmpty());
    EXPECT_TRUE(box.min == (float3{1, -2, 3}) && box.max == (float3{1, 5, 3}));
    box.extend({-kInfinity, kInfinity, 3});
    EXPECT_TRUE(box.min == (float3{-kInfinity, -2, 3}) && box.max == (float3{1, kInfinity, 3}));
    box.max.y = kNaN;
    EXPECT_TRUE(box.isEmpty());
}

} // namespace
