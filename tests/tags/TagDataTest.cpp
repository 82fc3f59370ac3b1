#include "TagSample.h"

#include <veldrin/geometry/Prototypes.h>
#include <veldrin/tags/TagData.h>
#include <veldrin/tags/TagSetOperations.h>

#include <gtest/gtest.h>

namespace {

using namespace Veldrin;
using namespace Veldrin::Geometry;
using Mask = Nexil::Array<bool>;

TEST(TagData, NamesOfTags)
{
    struct {
        char const *component, *tag, *name;
    } const rows[] = {{"point_component", "sel", "point_sel_tag"},
                      {"point_component", "point_sel", "point_sel_tag"},
                      {"point_component", "point_sel_tag", "point_sel_tag"},
                      {"point_component", "pointy", "pointy_tag"},
                      {"point_component", "point", "point_point_tag"},
                      {"point_component", "_tag", "point__tag"},
                      {"face_component", "face_vertex", "face_vertex_tag"},
                      {"own", "sel", "own_sel_tag"},
                      {"", "_tag", "_tag_tag"}};
    for (auto const& [component, tag, name] : rows)
        EXPECT_EQ(createTagName(component, tag), name);
}

TEST(TagData, ATagIsADataGeoPropertyThatSharesItsMask)
{
    auto const mask = maskOf("101");
    auto tag = createObject();
    populateTag(sPointComp, mask, *tag);
    EXPECT_TRUE(Object::isA(*tag, *getDataGeoPropPrototype(sGenericDataGeoProp)));
    auto geometry = createObject();
    setProperty(*geometry, "point_a_tag", std::move(tag));
    MaskPtr data;
    Nexil::String component;
    EXPECT_TRUE(getTagData(*geometry, "point_a_tag", data, component));
    EXPECT_EQ(data, mask);
    EXPECT_EQ(component, "point_component");

    auto const add = [&](char const* name, auto const& value) {
        setProperty(*geometry, name, support::filled([&](Object& part) {
            setProperty(part, "data", value);
            setProperty(part, "target", "shared_index");
        }));
    };
    setProperty(*geometry, "shared_index",
                support::filled([](Object& range) { populateRangeGeoProperty({}, "face_component", range); }));
    add("bare", mask);
    add("floats", support::array<float>({1}));
    add("null", MaskPtr());
    setProperty(*geometry, "number", 1u);
    setProperty(*geometry, "null_object", Nexil::Ptr<Object>());
    EXPECT_TRUE(getTagData(*geometry, "bare", data, component));
    EXPECT_EQ(component, "face_component");
    for (char const* name : {"floats", "null", "number", "shared_index", "null_object", "missing", ""}) {
        EXPECT_FALSE(getTagData(*geometry, name, data, component)) << name;
        EXPECT_TRUE(data == mask && component == "face_component") << name;
    }
}

TEST(TagData, SetOperationsGoOverTheShorterMask)
{
    struct {
        char const *a, *b, *unite, *intersect, *subtract;
    } const rows[] = {{"0011", "0101", "0111", "0001", "0010"},
                      {"11", "01101", "11101", "01101", "10101"},
                      {"00111", "10", "10", "00", "00"},
                      {"", "101", "101", "101", "101"}};
    for (auto const& row : rows) {
        auto const result = [&](auto operation) {
            auto b = *maskOf(row.b);
            operation(*maskOf(row.a), b);
            return flagsOf(Nexil::makePtr<Mask>(std::move(b)));
        };
        EXPECT_EQ(result(unionTagData), row.unite);
        EXPECT_EQ(result(intersectTagData), row.intersect);
        EXPECT_EQ(result(subtractTagData), row.subtract);
    }
    Mask mask = *maskOf("101");
    negateTagData(mask);
    EXPECT_EQ(mask, *maskOf("010"));
    subtractTagData(mask, mask);
    EXPECT_EQ(mask, *maskOf("000"));
}

TEST(TagData, ConversionTellsWhetherThereIsOne)
{
    auto const mesh = support::mesh({{}, {}, {}}, {{0, 1}, {1, 2}});
    auto const any = TagConversionStyle::AnyElement;
    auto const all = TagConversionStyle::AllElements;
    auto const points = maskOf("110");
    struct {
        MaskPtr mask;
        char const *from, *to;
        TagConversionStyle style;
        bool isFine;
        char const* flags;
    } const rows[] = {{points, sPointComp, sFaceComp, all, true, "10"},
                      {points, sPointComp, sFaceComp, any, true, "11"},
                      {points, "own", "own", all, true, "110"},
                      {nullptr, sFaceComp, sPointComp, all, true, "000"},
                      {nullptr, sFaceComp, sFaceComp, all, true, ""},
                      {points, sPointComp, sStrandComp, all, false, ""},
                      {points, "", "", all, false, ""},
                      {points, sFaceComp, sStrandComp, all, false, ""},
                      {points, sPointComp, "own", all, false, ""}};
    for (auto const& row : rows) {
        bool ok = !row.isFine;
        EXPECT_EQ(flagsOf(convertTagData(*mesh, row.mask, row.from, row.to, row.style, &ok)), row.flags)
            << row.from << ' ' << row.to;
        EXPECT_EQ(ok, row.isFine) << row.from << ' ' << row.to;
    }
    EXPECT_EQ(convertTagData(*mesh, points, "own", "own", all, nullptr), points);
}

} // namespace
