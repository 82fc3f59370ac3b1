#include <veldrin/math/FCurve.h>

#include <gmock/gmock.h>

#include <algorithm>
#include <cmath>
#include <limits>
#include <map>
#include <random>

namespace {

using Nexil::CompositeSerializationData;
using Nexil::SequenceSerializationData;
using Nexil::SerializationData;
using Veldrin::Math::FCurve;
using Extrapolation = FCurve::Extrapolation;
using Interpolation = FCurve::Interpolation;
using Key = FCurve::Key;

constexpr double kInfinity = std::numeric_limits<double>::infinity();
constexpr double kNaN = std::numeric_limits<double>::quiet_NaN();

FCurve curveOf(std::initializer_list<Key> keys)
{
    FCurve curve;
    for (Key const& key : keys)
        EXPECT_TRUE(curve.setKey(key));
    return curve;
}

struct Point {
    double time, value;
};

/// De Casteljau's construction, point by point along the segment.
Point pointOnBezier(Point a, Point b, Point c, Point d, double u)
{
    auto const between = [u](Point p, Point q) {
        return Point{p.time + (q.time - p.time) * u, p.value + (q.value - p.value) * u};
    };
    Point const ab = between(a, b);
    Point const bc = between(b, c);
    Point const cd = between(c, d);
    return between(between(ab, bc), between(bc, cd));
}

TEST(FCurve, BezierSegmentsRunThroughPointsOfTheirConstruction)
{
    std::mt19937 random(5);
    auto const number = [&](double low, double high) { return std::uniform_real_distribution(low, high)(random); };
    for (int round = 0; round < 40; ++round) {
        double const begin = number(-10, 10);
        double const span = number(0.1, 5);
        // Every fourth tangent reaches beyond its segment, every fourth has no length in time.
        auto const reach = [&] { return random() % 4 == 0 ? 0 : random() % 4 == 0 ? 3 * span : number(0, span); };
        Key const from{begin, number(-1, 1), {}, {reach(), number(-2, 2)}, Interpolation::Bezier};
        Key const to{begin + span, number(-1, 1), {-reach(), number(-2, 2)}, {}};
        FCurve const curve = curveOf({from, to});
        Point const b{std::min(begin + from.out.time, to.time), from.value + from.out.value};
        Point const c{std::max(to.time + to.in.time, begin), to.value + to.in.value};
        for (int i = 0; i <= 200; ++i) {
            Point const point = pointOnBezier({begin, from.value}, b, c, {to.time, to.value}, i / 200.0);
            // Where the curve is steep a rounded time moves the value: the curve has to pass the point, within a window.
            double const step = 1e-9 * span;
            double const before = curve.evaluate(std::max(point.time - step, begin));
            double const after = curve.evaluate(std::min(point.time + step, to.time));
            double const slack = 1e-6 + std::abs(after - before);
            ASSERT_NEAR(curve.evaluate(point.time), point.value, slack) << round << ' ' << i;
        }
    }
}

TEST(FCurve, KeysKeepTheirValuesAndSegmentsTheirShape)
{
    FCurve const curve = curveOf({{1, 10, {}, {}, Interpolation::Constant},
                                  {2, 20, {}, {}, Interpolation::Linear},
                                  {4, 60, {}, {0.5, 100}, Interpolation::Bezier},
                                  {5, kInfinity, {}, {}, Interpolation::Linear},
                                  {6, 7, {}, {}, Interpolation::Linear}});
    struct {
        double time, value;
    } const cases[] = {{1, 10}, {1.999, 10}, {2, 20}, {2.5, 30}, {3, 40}, {4, 60}, {6, 7}, {7, 7}, {0, 10}, {kNaN, 10}};
    for (auto const& row : cases)
        EXPECT_DOUBLE_EQ(curve.evaluate(row.time), row.value) << row.time;
    EXPECT_EQ(curveOf({{1, -kInfinity}, {2, 5}}).evaluate(2), 5);
    EXPECT_EQ(curveOf({{1, 5}, {2, kInfinity}}).evaluate(1), 5);

    FCurve single;
    EXPECT_EQ(single.evaluate(3), 0);
    single.setKey({1, 4});
    single.setPreExtrapolation(Extrapolation::Linear);
    single.setPostExtrapolation(Extrapolation::Cycle);
    for (double const time : {-kInfinity, 0.0, 1.0, 2.0, kNaN})
        EXPECT_EQ(single.evaluate(time), 4);
}

TEST(FCurve, RoundsRepeatOnBothSides)
{
    FCurve curve =
        curveOf({{-1, 2, {}, {0.5, 3}, Interpolation::Bezier}, {1, 7, {-1, 0}, {}, Interpolation::Linear}, {3, 4}});
    FCurve const inside = curve;
    constexpr double span = 4;
    for (auto const mode :
         {Extrapolation::Constant, Extrapolation::Cycle, Extrapolation::CycleOffset, Extrapolation::Oscillate}) {
        for (int round = -7; round <= 7; ++round) {
            if (round == 0)
                continue;
            // The mode of the other side must not matter.
            curve.setPreExtrapolation(round < 0 ? mode : Extrapolation::Linear);
            curve.setPostExtrapolation(round < 0 ? Extrapolation::Linear : mode);
            for (double offset = 0.125; offset < span; offset += 0.125) {
                double const forward = inside.evaluate(-1 + offset);
                double const expected = mode == Extrapolation::Constant      ? (round < 0 ? 2 : 4)
                                        : mode == Extrapolation::Cycle       ? forward
                                        : mode == Extrapolation::CycleOffset ? forward + 2 * round
                                        : round % 2 == 0                     ? forward
                                                                             : inside.evaluate(3 - offset);
                ASSERT_DOUBLE_EQ(curve.evaluate(-1 + round * span + offset), expected)
                    << static_cast<int>(mode) << ' ' << round << ' ' << offset;
            }
        }
        curve.setPreExtrapolation(mode);
        curve.setPostExtrapolation(mode);
        for (double const time : {-kInfinity, -1e300, 1e300, kInfinity})
            EXPECT_TRUE(std::isfinite(curve.evaluate(time))) << static_cast<int>(mode) << ' ' << time;
    }
}

TEST(FCurve, LinearExtrapolationGoesOnWithTheSlopeAtTheEnd)
{
    struct {
        Key from, to;
    } const cases[] = {
        {{0, 1, {}, {}, Interpolation::Linear}, {2, 5}},
        {{0, 1, {}, {}, Interpolation::Constant}, {2, 1}},
        {{0, 1, {}, {0.5, 3}, Interpolation::Bezier}, {2, 5, {-1, 2}, {}}},
        {{0, 1, {}, {8, 3}, Interpolation::Bezier}, {2, 5, {-5, 2}, {}}},   // both reach beyond the segment
        {{0, 1, {}, {0, 0}, Interpolation::Bezier}, {2, 5, {-0.5, 2}, {}}}, // only the other end's tangent counts
        {{0, 1, {}, {1.5, 3}, Interpolation::Bezier}, {2, 5, {0, 0}, {}}},
    };
    for (auto const& row : cases) {
        FCurve curve = curveOf({row.from, row.to});
        curve.setPreExtrapolation(Extrapolation::Linear);
        curve.setPostExtrapolation(Extrapolation::Linear);
        constexpr double step = 1e-6;
        double const slopeBefore = (curve.evaluate(step) - row.from.value) / step;
        double const slopeBehind = (row.to.value - curve.evaluate(2 - step)) / step;
        auto const index = &row - cases;
        EXPECT_NEAR(curve.evaluate(-3), row.from.value - 3 * slopeBefore, 0.02) << index;
        EXPECT_NEAR(curve.evaluate(6), row.to.value + 4 * slopeBehind, 0.02) << index;
    }
    FCurve flat = curveOf({{0, 1}, {2, 1}});
    flat.setPostExtrapolation(Extrapolation::Linear);
    EXPECT_EQ(flat.evaluate(kInfinity), 1);
}

TEST(FCurve, KeysStandInTimeOrderAndReplaceEqualTimes)
{
    std::mt19937 random(6);
    FCurve curve;
    std::map<double, double> model;
    for (int i = 0; i < 2000; ++i) {
        double const time = static_cast<int>(random() % 200) - 100;
        if (auto const index = random() % 200; index < model.size()) {
            EXPECT_TRUE(curve.eraseKey(index));
            model.erase(std::next(model.begin(), static_cast<std::ptrdiff_t>(index)));
        }
        EXPECT_TRUE(curve.setKey({time, static_cast<double>(i)}));
        model[time] = i;
    }
    for (double const time : {kNaN, kInfinity, -kInfinity})
        EXPECT_FALSE(curve.setKey({time, 1}));
    EXPECT_FALSE(curve.eraseKey(curve.keys().size()));
    EXPECT_TRUE(std::ranges::equal(curve.keys(), model, [](Key const& key, auto const& expected) {
        return key.time == expected.first && key.value == expected.second;
    }));
}

FCurve randomCurve(std::mt19937& random)
{
    auto const number = [&] {
        double const special[] = {0, -0.0, kInfinity, -kInfinity, 5e-324, 1.7e308};
        return random() % 4 ? static_cast<double>(random()) / 3 - 7e8 : special[random() % 6];
    };
    FCurve curve;
    for (auto count = random() % 20; count > 0; --count)
        curve.setKey(
            {number(), number(), {number(), number()}, {number(), number()}, static_cast<Interpolation>(random() % 3)});
    curve.setPreExtrapolation(static_cast<Extrapolation>(random() % 5));
    curve.setPostExtrapolation(static_cast<Extrapolation>(random() % 5));
    return curve;
}

TEST(FCurve, ComesBackEqualFromItsTree)
{
    std::mt19937 random(7);
    for (int round = 0; round < 200; ++round) {
        FCurve const curve = randomCurve(random);
        SerializationData tree;
        Nexil::serializeFCurve(curve, tree);
        FCurve back = curveOf({{1, 2}});
        ASSERT_TRUE(Nexil::deserializeFCurve(tree, back));
        EXPECT_TRUE(back == curve);
    }
}

SerializationData changed(SerializationData const& tree, char const* name, SerializationData const& replacement)
{
    CompositeSerializationData result = *tree.asComposite();
    result[name] = replacement;
    return result;
}

SerializationData listOf(std::vector<SerializationData> const& children)
{
    SequenceSerializationData list;
    for (auto const& child : children)
        list.push_back(child);
    return list;
}

TEST(FCurve, BrokenTreesAreRefusedAndChangeNothing)
{
    FCurve const curve = curveOf({{1, 2, {-1, 0}, {1, 0}, Interpolation::Bezier}, {3, 4}});
    SerializationData tree;
    Nexil::serializeFCurve(curve, tree);
    auto const* keys = tree.asComposite()->find("keys")->asSequence()->begin();
    SerializationData const nothing;
    CompositeSerializationData const empty;
    CompositeSerializationData timeAndValue;
    timeAndValue["time"] = 0.0;
    timeAndValue["value"] = 0.0;
    std::vector<SerializationData> broken{nothing, empty, changed(tree, "keys", nothing)};
    for (char const* name : {"pre_extrapolation", "post_extrapolation"})
        for (auto const& wrong : {nothing, SerializationData(5u), SerializationData(0.5)})
            broken.push_back(changed(tree, name, wrong));
    std::vector<SerializationData> const noTangents{nothing, listOf({0.0}), listOf({0.0, 0.0, 0.0}),
                                                    listOf({nothing, 0.0}), listOf({0.0, nothing})};
    std::pair<char const*, std::vector<SerializationData>> const rows[] = {
        {"time", {nothing, listOf({0.0, 0.0}), kNaN, kInfinity, 3.0}}, // the last is the next key's
        {"value", {nothing, listOf({0.0, 0.0})}},
        {"in_tangent", noTangents},
        {"out_tangent", noTangents},
        {"interpolation", {nothing, 3u, 0.5}},
    };
    std::vector<SerializationData> brokenKeys{1.0, empty, timeAndValue};
    for (auto const& [name, wrongValues] : rows)
        for (auto const& wrong : wrongValues)
            brokenKeys.push_back(changed(keys[0], name, wrong));
    for (auto const& key : brokenKeys)
        broken.push_back(changed(tree, "keys", listOf({key, keys[1]})));
    for (auto const& data : broken) {
        FCurve back = curve;
        EXPECT_FALSE(Nexil::deserializeFCurve(data, back)) << &data - broken.data();
        EXPECT_TRUE(back == curve) << &data - broken.data();
    }
}

} // namespace
