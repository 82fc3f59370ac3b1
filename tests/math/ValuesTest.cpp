#include <veldrin/geometry/internal/ValueTypes.h>

#include <gmock/gmock.h>

#include <cstring>
#include <limits>
#include <map>
#include <string>

namespace {

using namespace Veldrin::Math;

constexpr float kNaN = std::numeric_limits<float>::quiet_NaN();
constexpr float kInfinity = std::numeric_limits<float>::infinity();

/// The bytes and the alignment that the name of a math type promises: "float4x2" is eight floats.
std::pair<std::size_t, std::size_t> layoutOfName(std::string const& name)
{
    static std::map<std::string, std::size_t> const kScalarBytes = {
        {"uchar", 1}, {"ushort", 2}, {"uint", 4},  {"ulong", 8},  {"char", 1}, {"short", 2},
        {"int", 4},   {"long", 8},   {"float", 4}, {"double", 8}, {"bool", 1},
    };
    if (name == "quatf" || name == "quatd")
        return {name == "quatf" ? 16 : 32, name == "quatf" ? 4 : 8};
    auto const digit = name.find_first_of("0123456789");
    std::size_t const scalar = kScalarBytes.at(name.substr(0, digit));
    std::size_t count = 1;
    for (std::size_t i = digit; i < name.size(); i += 2)
        count *= static_cast<std::size_t>(name[i] - '0');
    return {scalar * count, scalar};
}

TEST(MathValues, AreTheirComponentsWithoutPadding)
{
    std::size_t mathTypeCount = 0;
    Veldrin::Geometry::Internal::forEachValueType([&]<class T>(unsigned int, std::string name) {
        if (!name.starts_with("Math::") || name.find('<') != std::string::npos)
            return;
        ++mathTypeCount;
        EXPECT_EQ(std::make_pair(sizeof(T), alignof(T)), layoutOfName(name.substr(6))) << name;
        EXPECT_TRUE(std::is_trivially_copyable_v<T> && std::is_standard_layout_v<T>) << name;
    });
    EXPECT_EQ(mathTypeCount, 107u);
    EXPECT_EQ(sizeof(bbox<float3, float>), 24u);
    EXPECT_EQ(sizeof(bool3), 3u);
}

TEST(MathValues, MatricesLieColumnByColumn)
{
    float4x2 matrix;
    EXPECT_TRUE(matrix == float4x2{});
    for (int column = 0; column < 2; ++column)
        for (int row = 0; row < 4; ++row)
            matrix[column][row] = static_cast<float>(10 * column + row);
    float numbers[8];
    std::memcpy(numbers, &matrix, sizeof numbers);
    EXPECT_THAT(numbers, testing::ElementsAre(0, 1, 2, 3, 10, 11, 12, 13));
    EXPECT_EQ(matrix.columns[1].w, 13);
    EXPECT_TRUE((float2x3::identity() == float2x3{{{1, 0}, {0, 1}, {0, 0}}}));
    EXPECT_TRUE((float3x2::identity() == float3x2{{{1, 0, 0}, {0, 1, 0}}}));

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
    EXPECT_TRUE((bbox<int3, int>()).isEmpty());
}

} // namespace
