#include <support/Geometry.h>
#include <veldrin/geometry/GeoLocation.h>
#include <veldrin/geometry/internal/ValueTypes.h>

#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <locale>

namespace {

using namespace Veldrin;
using ObjectPtr = Nexil::Ptr<Object>;

ObjectPtr holding(Nexil::Any value)
{
    auto object = createObject();
    object->setPropertyAny("v", std::move(value));
    return object;
}

/// How one value is written, type name included.
std::string written(Nexil::Any value, unsigned long long maxElements = 3)
{
    auto const text = support::dump(*holding(std::move(value)), maxElements);
    EXPECT_TRUE(text.starts_with("{\n    v: ") && text.ends_with("\n}")) << text;
    return text.substr(9, text.size() - 11);
}

TEST(DebugDump, ValuesReadAsWritten)
{
    using namespace Math;
    using Geometry::Common::DataInterpolationMode;
    std::pair<Nexil::Any, char const*> const cases[] = {
        {static_cast<signed char>(-65), "-65 (signed char)"},
        {0xFFFFFFFFu, "4294967295 (unsigned int)"},
        {0xFFFFFFFFFFFFFFFFull, "18446744073709551615 (unsigned long long)"},
        {false, "0 (bool)"},
        {0.1f, "0.1 (float)"},
        {1.0 / 3, "0.333333 (double)"},
        {Nexil::String("a, \"b\"\n"), "a, \"b\"\n (string)"},
        {float2{1, 2}, "{1f, 2f} (Math::float2)"},
        {float3x2{{{1, 2, 3}, {4, 5, 6}}}, "{{1f, 2f, 3f}, {4f, 5f, 6f}} (Math::float3x2)"},
        {quatf{1, 2, 3, 4}, "{1f, 2f, 3f, 4f} (Math::quatf)"},
        {bbox<float3, float>{{1, 2, 3}, {4, 5, 6}}, "{{1f, 2f, 3f}, {4f, 5f, 6f}} (Math::bbox<Math::float3, float>)"},
        {DataInterpolationMode::Linear, "Linear (Geometry::Common::DataInterpolationMode)"},
        {Nexil::Any(), "(unknown data type)"},
        {ObjectPtr(), "(unknown data type) (Nexil::Ptr<Veldrin::Object>)"},
        {Geometry::Common::GeoLocation(), "(unknown data type) (Veldrin::Geometry::Common::GeoLocation)"},
        {Nexil::Ptr<Nexil::Array<int>>(), "[  ] 0 elements (array<int>)"},
        {support::array<float>({1, 2, 3, 4, 5}), "[ 1, 2, 3, ... ] 5 elements (array<float>)"},
        {support::array<Nexil::String>({"a", "", "b", "c"}), "[ a, , b, ... ] 4 elements (array<string>)"},
        {support::array<Nexil::Any>({1, 2}),
         "[ ... ] 2 elements (array<unknown data type>) (Nexil::Ptr<Nexil::Array<Nexil::Any> >)"},
        {Nexil::Ptr<Nexil::Array<ObjectPtr>>(),
         "[] 0 elements (array<unknown data type>) (Nexil::Ptr<Nexil::Array<Nexil::Ptr<Veldrin::Object> > >)"},
    };
    for (auto const& [value, text] : cases)
        EXPECT_EQ(written(value), text);
    EXPECT_EQ(written(support::array<int>({1, 2, 3, 4, 5}), 0), "[ ... ] 5 elements (array<int>)");
}

TEST(DebugDump, EveryValueTypeAndItsArrayIsKnownByItsName)
{
    unsigned int typeCount = 0;
    Geometry::Internal::forEachValueType([&]<class T>(unsigned int code, char const* name) {
        EXPECT_EQ(code, typeCount++);
        auto const single = written(T());
        EXPECT_TRUE(single.ends_with(std::string(" (") + name + ")")) << single;
        auto const value = single.substr(0, single.rfind(" (" + std::string(name)));
        EXPECT_EQ(written(support::array<T>({T(), T()})),
                  "[ " + value + ", " + value + " ] 2 elements (array<" + name + ">)");
    });
    EXPECT_EQ(typeCount, Geometry::Internal::kValueTypeCount);
}

TEST(DebugDump, ObjectsAndListsNestByFourBlanks)
{
    EXPECT_EQ(support::dump(*createObject()), "{\n}");
    auto const inner = holding(1);
    auto const outer = createObject();
    setProperty(*outer, "one", holding(Nexil::Any(inner)));
    setProperty(*outer, "none", support::array<ObjectPtr>({}));
    setProperty(*outer, "list", support::array<ObjectPtr>({inner, nullptr, inner}));
    EXPECT_EQ(support::dump(*outer), "{\n"
                                     "    one: \n"
                                     "    {\n"
                                     "        v: \n"
                                     "        {\n"
                                     "            v: 1 (int)\n"
                                     "        }\n"
                                     "    }\n"
                                     "    none:     [\n"
                                     "    ]\n"
                                     "    list:     [\n"
                                     "        {\n"
                                     "            v: 1 (int)\n"
                                     "        },\n"
                                     "        (unknown data type),\n"
                                     "        {\n"
                                     "            v: 1 (int)\n"
                                     "        }    ]\n"
                                     "}");
}

TEST(DebugDump, DeepAndMultiplyingObjectsAreCut)
{
    auto deep = holding(1);
    for (int level = 0; level < 5000; ++level)
        deep = holding(Nexil::Any(std::move(deep)));
    auto const text = support::dump(*deep);
    EXPECT_EQ(std::count(text.begin(), text.end(), '{'), 1001);
    EXPECT_NE(text.find("\n" + std::string(4 * 1001, ' ') + "...\n"), std::string::npos);

    // Two to the power of sixty objects, were each written wherever it is met.
    auto doubled = holding(1);
    for (int level = 0; level < 60; ++level)
        doubled = holding(support::array<ObjectPtr>({doubled, doubled}));
    auto const bounded = support::dump(*doubled);
    EXPECT_NE(bounded.find("..."), std::string::npos);
    EXPECT_LT(std::count(bounded.begin(), bounded.end(), '{'), 11000);
}

TEST(DebugDump, TheGlobalLocaleChangesNothing)
{
    struct Grouping : std::numpunct<char> {
        char do_decimal_point() const override { return ','; }
        char do_thousands_sep() const override { return '.'; }
        std::string do_grouping() const override { return "\3"; }
    };
    auto const former = std::locale::global(std::locale(std::locale::classic(), new Grouping));
    auto const text = written(support::array<double>({1234567.5, 1e4}));
    std::locale::global(former);
    EXPECT_EQ(text, "[ 1.23457e+06, 10000 ] 2 elements (array<double>)");
}

} // namespace
