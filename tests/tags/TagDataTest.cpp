#include "TagSample.h"

#include <veldrin/geometry/Prototypes.h>
#include <veldrin/tags/TagData.h>
#include <veldrin/tags/TagSetOperations.h>

#include <nexil/JobCancel.h>

#include <gtest/gtest.h>

namespace {

using namespace Veldrin;
using namespace Veldrin::Geometry;
using Mask = Nexil::Array<bool>;

TEST(TagData, NamesOfTags)
{
    struct Row {
        char const* component;
        char const* tag;
        char const* name;
    };
    for (auto const& [component, tag, name] : {Row{"point_component", "sel", "point_sel_tag"},
                                               {"point_component", "point_sel", "point_sel_tag"},
                                               {"point_component", "point_sel_tag", "point_sel_tag"},
                                               {"point_component", "pointy", "pointy_tag"},
                                               {"point_component", "point", "point_point_tag"},
                                               {"point_component", "_tag", "point__tag"},
                                               {"face_component", "face_sel", "face_sel_tag"},
                                               {"face_component", "sel_tag", "face_sel_tag"},
                                               {"face_component", "face_vertex", "face_vertex_tag"},
                                               {"face_vertex_component", "sel", "face_vertex_sel_tag"},
                                               {"own", "sel", "own_sel_tag"},
                                               {"_component", "sel", "_component_sel_tag"},
                                               {"", "sel", "sel_tag"},
                                               {"", "sel_tag", "sel_tag"},
                                               {"", "_tag", "_tag_tag"},
                                               {"", "", "_tag"},
                                               {"point_component", "", "point__tag"}})
        EXPECT_EQ(createTagName(component, tag), name) << component << " " << tag;
}

TEST(TagData, ATagIsADataGeoPropertyThatSharesItsMask)
{
    auto const mask = maskOf("101");
    auto tag = createObject();
    populateTag(sPointComp, mask, *tag);
    EXPECT_TRUE(Object::isA(*tag, *getDataGeoPropPrototype(sGenericDataGeoProp)));
    EXPECT_EQ(getPropertyAs<Common::DataInterpolationMode>(*tag, sInterp), Common::DataInterpolationMode::Linear);
    auto geometry = createObject();
    setProperty(*geometry, "point_a_tag", std::move(tag));
    MaskPtr data;
    Nexil::String component;
    EXPECT_TRUE(getTagData(*geometry, "point_a_tag", data, component));
    EXPECT_EQ(data, mask);
    EXPECT_EQ(component, "point_component");

    auto const byRange = support::filled([](Object& range) { populateRangeGeoProperty({}, "face_component", range); });
    setProperty(*geometry, "shared_index", Nexil::makePtr<Object>(*byRange));
    auto const add = [&](char const* name, auto const& value) {
        setProperty(*geometry, name, support::filled([&](Object& part) {
            setProperty(part, "data", value);
            setProperty(part, "target", "shared_index");
        }));
    };
    add("bare", mask);
    add("floats", support::array<float>({1}));
    add("null", MaskPtr());
    setProperty(*geometry, "number", 1u);
    setProperty(*geometry, "empty", createObject());
    setProperty(*geometry, "null_object", Nexil::Ptr<Object>());
    EXPECT_TRUE(getTagData(*geometry, "bare", data, component));
    EXPECT_EQ(component, "face_component");
    for (char const* name : {"floats", "null", "number", "empty", "null_object", "missing", "a", ""}) {
        EXPECT_FALSE(getTagData(*geometry, name, data, component)) << name;
        EXPECT_EQ(data, mask);
        EXPECT_EQ(component, "face_component");
    }
}

TEST(TagData, SetOperationsGoOverTheShorterMaskAndEndWhateverTheJob)
{
    Nexil::setJobCancelHook([] { return true; });
    struct Row {
        char const* a;
        char const* b;
        char const* unite;
        char const* intersect;
        char const* subtract;
    };
    for (auto const& row : {Row{"0011", "0101", "0111", "0001", "0010"},
                            {"11", "01101", "11101", "01101", "10101"},
                            {"00111", "10", "10", "00", "00"},
                            {"", "101", "101", "101", "101"},
                            {"101", "", "", "", ""}}) {
        auto const result = [&](auto operation) {
            auto b = *maskOf(row.b);
            operation(*maskOf(row.a), b);
            return flagsOf(Nexil::makePtr<Mask>(std::move(b)));
        };
        EXPECT_EQ(result(unionTagData), row.unite);
        EXPECT_EQ(result(intersectTagData), row.intersect);
        EXPECT_EQ(result(subtractTagData), row.subtract);
    }
    // Large enough for many tasks.
    std::string flags;
    for (unsigned int i = 0; i < 1'000'000; ++i)
        flags += (i * i / 7) % 3 == 0 ? '1' : '0';
    auto mask = *maskOf(flags);
    negateTagData(mask);
    for (auto& flag : flags)
        flag = flag == '1' ? '0' : '1';
    EXPECT_EQ(flagsOf(Nexil::makePtr<Mask>(mask)), flags);
    subtractTagData(mask, mask);
    EXPECT_EQ(flagsOf(Nexil::makePtr<Mask>(mask)), std::string(flags.size(), '0'));
    Nexil::setJobCancelHook(nullptr);
}

TEST(TagData, ConversionTellsWhetherThereIsOne)
{
    auto const mesh = support::mesh({{}, {}, {}}, {{0, 1}, {1, 2}});
    auto const all = TagConversionStyle::AllElements;
    bool ok = false;
    auto const points = maskOf("110");
    EXPECT_EQ(flagsOf(convertTagData(*mesh, points, sPointComp, sFaceComp, all, &ok)), "10");
    EXPECT_TRUE(ok);
    EXPECT_EQ(flagsOf(convertTagData(*mesh, points, sPointComp, sFaceComp, TagConversionStyle::AnyElement, &ok)), "11");
    EXPECT_EQ(convertTagData(*mesh, points, "own", "own", all, &ok), points);
    EXPECT_TRUE(ok);
    EXPECT_EQ(flagsOf(convertTagData(*mesh, nullptr, sFaceComp, sPointComp, all, &ok)), "000");
    EXPECT_TRUE(ok);
    EXPECT_TRUE(convertTagData(*mesh, nullptr, sFaceComp, sFaceComp, all, nullptr)->empty());
    EXPECT_EQ(flagsOf(convertTagData(*mesh, points, sPointComp, sStrandComp, all, &ok)), "");
    EXPECT_FALSE(ok);
    struct Pair {
        char const* from;
        char const* to;
    };
    for (auto const& [from, to] : {Pair{"", ""},
                                   {"face_component", "strand_component"},
                                   {"strand_component", "face_vertex_component"},
                                   {"point_component", "own"},
                                   {"", "point_component"}}) {
        ok = true;
        EXPECT_TRUE(convertTagData(*mesh, points, from, to, all, &ok)->empty());
        EXPECT_FALSE(ok) << from << " " << to;
    }
}

} // namespace
