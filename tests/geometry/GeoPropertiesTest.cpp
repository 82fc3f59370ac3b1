#include <support/Costly.h>
#include <support/Geometry.h>
#include <veldrin/geometry/Prototypes.h>

#include <gmock/gmock.h>

namespace {

using namespace Veldrin;
using namespace Veldrin::Geometry;
using testing::IsEmpty;
using ObjectPtr = Nexil::Ptr<Object>;

ObjectPtr targeting(char const* target)
{
    auto object = createObject();
    setProperty(*object, sTarget, target);
    return object;
}

Nexil::MutablePtr<Object> cube()
{
    return support::filled([](Object& object) { populateCubeMesh(2, object); });
}

std::vector<std::string> chain(Object const& obj, char const* name)
{
    return support::names(getTargetChain(obj, name));
}

TEST(GeoProperties, MalformedPropertiesReadAsMissing)
{
    auto const obj = createObject();
    setProperty(*obj, "number", 5u);
    setProperty(*obj, "null", ObjectPtr());
    auto signedOnes = createObject();
    setProperty(*signedOnes, sCount, 5);
    setProperty(*signedOnes, sTarget, 5);
    setProperty(*signedOnes, sIndices, support::array<int>({1}));
    setProperty(*obj, "signed", std::move(signedOnes));
    auto const before = support::dump(*obj);
    for (char const* name : {"", "missing", "number", "null", "signed"}) {
        EXPECT_EQ(getElementCount(*obj, name), 0u) << name;
        EXPECT_FALSE(getDataGeoProperty(*obj, name)) << name;
        EXPECT_FALSE(getRangeGeoProperty(*obj, name)) << name;
        EXPECT_FALSE(getRangeGeoPropIndices(*obj, name)) << name;
        EXPECT_EQ(getGeoPropTargetName(*obj, name), "") << name;
        if (support::part(*obj, name))
            continue;
        EXPECT_FALSE(setElementCount(name, 5, *obj)) << name;
        EXPECT_FALSE(setRangeGeoPropIndices(name, support::array<unsigned int>({1}), *obj)) << name;
        EXPECT_THAT(chain(*obj, name), IsEmpty()) << name;
        EXPECT_EQ(getTargetComponent(*obj, name), "") << name;
    }
    EXPECT_EQ(support::dump(*obj), before);
}

TEST(GeoProperties, DataIsOfItsNamesTypeAndOfAnyTypeUnderOtherNames)
{
    auto const obj = createObject();
    auto const wide = support::filled([](Object& object) { createDataGeoProperty(Math::float4{}, object); });
    auto const shared = Nexil::makePtr<Object>(*wide);
    setProperty(*obj, sPointPosition, shared);
    setProperty(*obj, "point_weight", shared);
    EXPECT_FALSE(getDataGeoProperty(*obj, sPointPosition));
    EXPECT_EQ(getDataGeoProperty(*obj, "point_weight"), shared);
    EXPECT_FALSE(getRangeGeoProperty(*obj, "point_weight"));
    EXPECT_EQ(support::names(getGeoPropNamesByPrototype(*obj, *getDataGeoPropPrototype(""))),
              (std::vector<std::string>{"point_position", "point_weight"}));
}

TEST(GeoProperties, SettersCopyOnlyWhatIsShared)
{
    constexpr char kRange[] = "face_vertex_normal_index";
    for (bool const isShared : {false, true}) {
        auto const obj = cube();
        auto const order = support::names(obj->keys());
        for (char const* name : {sFaceComp, kRange}) {
            auto const* const address = support::part(*obj, name).get();
            auto const holder = isShared ? support::part(*obj, name) : ObjectPtr();
            auto const held = holder ? support::dump(*holder) : "";
            EXPECT_TRUE(name == sFaceComp ? setElementCount(name, 77, *obj)
                                          : setRangeGeoPropIndices(name, support::array<unsigned int>({4, 2}), *obj));
            EXPECT_EQ(support::part(*obj, name).get() == address, !isShared) << name;
            EXPECT_EQ(holder ? support::dump(*holder) : "", held);
        }
        EXPECT_EQ(support::names(obj->keys()), order);
        EXPECT_EQ(getElementCount(*obj, sFaceComp), 77u);
        EXPECT_EQ(*getRangeGeoPropIndices(*obj, kRange), (Nexil::Array<unsigned int>{4, 2}));
        EXPECT_TRUE(setRangeGeoPropIndices(kRange, nullptr, *obj));
        EXPECT_TRUE(getRangeGeoPropIndices(*obj, kRange)->empty());
    }
}

TEST(GeoProperties, ListingsKeepTheOrderOfTheKeys)
{
    auto const obj = cube();
    setProperty(*obj, "plain", 3);
    setProperty(*obj, "null", ObjectPtr());
    setProperty(*obj, "misfit", targeting("point_component"));
    using Names = std::vector<std::string>;
    Names const all{"point_position", "face_vertex", "face_offset", "face_vertex_normal"};
    std::pair<ObjectPtr, Names> const byPrototype[] = {
        {getComponentGeoPropPrototype(), {"point_component", "face_vertex_component", "face_component"}},
        {getRangeGeoPropPrototype(), {"face_vertex_normal_index"}},
        {getDataGeoPropPrototype(""), all}};
    for (auto const& [prototype, expected] : byPrototype) {
        EXPECT_EQ(support::names(getGeoPropNamesByPrototype(*obj, *prototype)), expected);
        auto const parts = getGeoPropsByPrototype(*obj, *prototype);
        ASSERT_EQ(parts.size(), expected.size());
        EXPECT_EQ(parts[0], support::part(*obj, expected[0].c_str()));
    }
    EXPECT_EQ(support::names(getGeoPropNamesByTarget(*obj, sPointComp)), (Names{"point_position", "misfit"}));
    EXPECT_THAT(support::names(getGeoPropNamesByTarget(*obj, "")), IsEmpty());
    EXPECT_EQ(getGeoPropsByTarget(*obj, sFaceVertexComp)[1], support::part(*obj, "face_vertex_normal_index"));
    std::pair<char const*, Names> const byName[] = {{"face*", {"face_vertex", "face_offset", "face_vertex_normal"}},
                                                    {"face_vertex", {"face_vertex"}},
                                                    {"*", all},
                                                    {"misfit", {}},
                                                    {"", {}}};
    for (auto const& [pattern, expected] : byName)
        EXPECT_EQ(support::names(getGeoPropsByName(*obj, pattern)), expected);
}

TEST(GeoProperties, ChainsEndAtComponentsCyclesAndDanglingTargets)
{
    auto const obj = createObject();
    std::pair<char const*, char const*> const targets[] = {{"a", "b"},          {"b", "c"},          {"loop", "loop"},
                                                           {"x", "y"},          {"y", "z"},          {"z", "y"},
                                                           {"lost", "nowhere"}, {"typed", "number"}, {"fresh", ""}};
    for (auto const& [name, target] : targets)
        setProperty(*obj, name, targeting(target));
    setProperty(*obj, "c", createObject());
    setProperty(*obj, "number", 1);
    for (auto const& expected : std::vector<std::vector<std::string>>{{"a", "b", "c"},
                                                                      {"c"},
                                                                      {"loop"},
                                                                      {"x", "y", "z"},
                                                                      {"lost", "nowhere"},
                                                                      {"typed", "number"},
                                                                      {"fresh", ""}})
        EXPECT_EQ(chain(*obj, expected[0].c_str()), expected);
    EXPECT_EQ(getTargetComponent(*obj, "a"), "c");
    EXPECT_EQ(getGeoPropTarget(*obj, *support::part(*obj, "b")), support::part(*obj, "c"));
    for (char const* name : {"lost", "fresh", "typed", "c"})
        EXPECT_FALSE(getGeoPropTarget(*obj, *support::part(*obj, name))) << name;

    // Many times as long as a quadratic search could bear.
    constexpr int length = 20000;
    for (int i = 0; i < length; ++i)
        setProperty(*obj, std::to_string(i).c_str(), targeting(std::to_string((i + 1) % length).c_str()));
    EXPECT_EQ(getTargetChain(*obj, "5").size(), static_cast<std::uint64_t>(length));
    EXPECT_EQ(getTargetComponent(*obj, "5"), "4");
}

TEST(GeoProperties, UniqueNamesTakeTheFirstFreeNumber)
{
    auto const obj = createObject();
    std::string const digits(100000, '3');
    for (std::string const& name : {std::string("color"), std::string("color1"), std::string("color7"),
                                    std::string("7"), std::string("a1b"), std::string("line9\n"), "a" + digits})
        setProperty(*obj, name.c_str(), 1);
    std::pair<std::string, char const*> const cases[] = {
        {"color", "color2"}, {"color7", "color2"},    {"color8", "color8"}, {"7", "1"},
        {"a1b", "a1b1"},     {"line9\n", "line9\n1"}, {"a" + digits, "a1"}, {"", ""}};
    for (auto const& [asked, unique] : cases)
        EXPECT_EQ(getUniqueGeoPropName(asked.c_str(), *obj), unique);
    for (int i = 2; i < 1200; ++i)
        setProperty(*obj, ("color" + std::to_string(i)).c_str(), 1);
    EXPECT_EQ(getUniqueGeoPropName("color11", *obj), "color1200");
    EXPECT_EQ(getGeoPropRangeName("face_vertex_normal"), "face_vertex_normal_index");
}

TEST(GeoProperties, QuestionsNeverBuildData)
{
    auto costly = Nexil::makeMutable<support::Costly>();
    createDataGeoProperty(0.0f, sPointComp, support::array<float>({1}), *costly);
    auto const obj = createObject();
    setProperty(*obj, "point_heat", std::move(costly));
    EXPECT_TRUE(getDataGeoProperty(*obj, "point_heat"));
    EXPECT_FALSE(getRangeGeoProperty(*obj, "point_heat"));
    EXPECT_EQ(getGeoPropsByName(*obj, "point_*").size(), 1u);
    EXPECT_EQ(getGeoPropsByTarget(*obj, sPointComp).size(), 1u);
    EXPECT_EQ(getTargetComponent(*obj, "point_heat"), "point_component");
    auto const part = support::part(*obj, "point_heat");
    EXPECT_THAT(support::names(getGeoPropNamesByPrototype(*part, *getComponentGeoPropPrototype())), IsEmpty());
}

} // namespace
