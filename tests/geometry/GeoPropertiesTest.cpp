#include <support/Geometry.h>
#include <veldrin/geometry/Prototypes.h>

#include <gmock/gmock.h>

#include <regex>

namespace {

using namespace Veldrin;
using namespace Veldrin::Geometry;
using testing::ElementsAre;
using testing::IsEmpty;
using ObjectPtr = Nexil::Ptr<Object>;
using IndicesPtr = Nexil::Ptr<Nexil::Array<unsigned int>>;

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
    setProperty(*obj, "empty", createObject());
    auto const signedCount = createObject();
    setProperty(*signedCount, sCount, 5);
    setProperty(*signedCount, sTarget, 5);
    setProperty(*signedCount, sIndices, support::array<int>({1}));
    EXPECT_EQ(getElementCount(*signedCount), 0u);
    EXPECT_FALSE(getRangeGeoPropIndices(*signedCount));
    EXPECT_EQ(getGeoPropTargetName(*signedCount), "");
    EXPECT_FALSE(getGeoPropTarget(*obj, *signedCount));
    setProperty(*obj, "signed", Nexil::makePtr<Object>(*signedCount));
    auto const before = support::dump(*obj);
    for (char const* name : {"", "missing", "number", "null", "empty", "signed"}) {
        EXPECT_EQ(getElementCount(*obj, name), 0u) << name;
        EXPECT_FALSE(getDataGeoProperty(*obj, name)) << name;
        EXPECT_FALSE(getRangeGeoProperty(*obj, name)) << name;
        EXPECT_FALSE(getRangeGeoPropIndices(*obj, name)) << name;
        EXPECT_EQ(getGeoPropTargetName(*obj, name), "") << name;
    }
    for (char const* name : {"", "missing", "number", "null"}) {
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

/// Whether the write is made in place or on a copy, the key stays where it was, and the other holder sees nothing.
TEST(GeoProperties, SettersCopyOnlyWhatIsShared)
{
    struct {
        char const* name;
        bool (*set)(Object&);
        char const* lines;
    } const cases[] = {
        {sFaceComp, [](Object& obj) { return setElementCount(sFaceComp, 77, obj); }, "count: 77 "},
        {"face_vertex_normal_index",
         [](Object& obj) {
             return setRangeGeoPropIndices("face_vertex_normal_index", support::array<unsigned int>({4, 2}), obj);
         },
         "indices: [ 4, 2 ] 2 "},
        {"face_vertex_normal_index",
         [](Object& obj) { return setRangeGeoPropIndices("face_vertex_normal_index", nullptr, obj); },
         "indices: [  ] 0 "},
    };
    for (auto const& c : cases)
        for (bool const isShared : {false, true}) {
            auto const obj = cube();
            auto const order = support::names(obj->keys());
            auto const* const address = support::part(*obj, c.name).get();
            auto const holder = isShared ? support::part(*obj, c.name) : ObjectPtr();
            auto const held = holder ? support::dump(*holder) : "";
            ASSERT_TRUE(c.set(*obj));
            auto const now = support::part(*obj, c.name);
            EXPECT_EQ(now.get() == address, !isShared) << c.name;
            EXPECT_NE(support::dump(*now).find(c.lines), std::string::npos) << support::dump(*now);
            EXPECT_EQ(support::names(obj->keys()), order);
            EXPECT_EQ(holder ? support::dump(*holder) : "", held);
        }
}

/// An object that never takes a property, or fails while it does.
struct Stubborn : Object {
    explicit Stubborn(bool fails) : isOutOfMemory(fails) {}
    bool setPropertyAny(Nexil::String const&, Nexil::Any&&) override
    {
        return isOutOfMemory ? throw std::bad_alloc() : false;
    }
    bool isOutOfMemory;
};

TEST(GeoProperties, ARefusedWritePutsTheOriginalBack)
{
    for (bool const isOutOfMemory : {false, true})
        for (bool const isShared : {false, true}) {
            ObjectPtr shared = Nexil::makePtr<Stubborn>(isOutOfMemory);
            auto const* const address = shared.get();
            auto const obj = createObject();
            setProperty(*obj, "part", shared);
            setProperty(*obj, "last", 1);
            if (!isShared)
                shared.reset();
            if (isOutOfMemory)
                EXPECT_THROW(setElementCount("part", 1, *obj), std::bad_alloc);
            else
                EXPECT_FALSE(setElementCount("part", 1, *obj));
            EXPECT_EQ(support::part(*obj, "part").get(), address);
            EXPECT_THAT(support::names(obj->keys()), ElementsAre("part", "last"));
        }
}

TEST(GeoProperties, ListingsKeepTheOrderOfTheKeys)
{
    auto const obj = cube();
    setProperty(*obj, "plain", 3);
    setProperty(*obj, "null", ObjectPtr());
    setProperty(*obj, "misfit", targeting("point_component"));
    auto const byPrototype = [&](ObjectPtr const& prototype) {
        auto const names = getGeoPropNamesByPrototype(*obj, *prototype);
        auto const parts = getGeoPropsByPrototype(*obj, *prototype);
        EXPECT_EQ(parts.size(), names.size());
        for (std::uint64_t i = 0; i < parts.size(); ++i)
            EXPECT_EQ(parts[i], support::part(*obj, names[i].c_str()));
        return support::names(names);
    };
    EXPECT_THAT(byPrototype(getComponentGeoPropPrototype()),
                ElementsAre("point_component", "face_vertex_component", "face_component"));
    EXPECT_THAT(byPrototype(getRangeGeoPropPrototype()), ElementsAre("face_vertex_normal_index"));
    EXPECT_THAT(byPrototype(getDataGeoPropPrototype("")),
                ElementsAre("point_position", "face_vertex", "face_offset", "face_vertex_normal"));

    EXPECT_EQ(support::names(getGeoPropNamesByTarget(*obj, sPointComp)),
              (std::vector<std::string>{"point_position", "misfit"}));
    EXPECT_THAT(support::names(getGeoPropNamesByTarget(*obj, "")), IsEmpty());
    EXPECT_EQ(getGeoPropsByTarget(*obj, sFaceVertexComp)[1], support::part(*obj, "face_vertex_normal_index"));

    auto const byName = [&](char const* pattern) { return support::names(getGeoPropsByName(*obj, pattern)); };
    EXPECT_THAT(byName("face*"), ElementsAre("face_vertex", "face_offset", "face_vertex_normal"));
    EXPECT_THAT(byName("face_vertex"), ElementsAre("face_vertex"));
    EXPECT_THAT(byName("*"), ElementsAre("point_position", "face_vertex", "face_offset", "face_vertex_normal"));
    EXPECT_THAT(byName("misfit"), IsEmpty());
    EXPECT_THAT(byName(""), IsEmpty());
}

/// Counts how often data is asked for rather than its type.
struct Costly : Object {
    PropertyInfo propertyInfo(Nexil::String const& key) const override
    {
        return key == sData ? PropertyInfo{true, true, Nexil::TypeId::of<Nexil::Ptr<Nexil::Array<float>>>(), 1000}
                            : Object::propertyInfo(key);
    }
    Nexil::Any getProperty(Nexil::String const& key) const override
    {
        EXPECT_NE(key, sData) << "built data that nobody asked for";
        return Object::getProperty(key);
    }
};

TEST(GeoProperties, QuestionsNeverBuildData)
{
    auto costly = Nexil::makeMutable<Costly>();
    createDataGeoProperty(0.0f, sPointComp, nullptr, *costly);
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

TEST(GeoProperties, ChainsEndAtComponentsCyclesAndDanglingTargets)
{
    auto const obj = createObject();
    std::pair<char const*, char const*> const targets[] = {{"a", "b"},    {"b", "c"},          {"loop", "loop"},
                                                           {"x", "y"},    {"y", "z"},          {"z", "y"},
                                                           {"fresh", ""}, {"lost", "nowhere"}, {"typed", "number"}};
    for (auto const& [name, target] : targets)
        setProperty(*obj, name, targeting(target));
    setProperty(*obj, "c", createObject());
    setProperty(*obj, "number", 1);
    auto const wrong = createObject();
    setProperty(*wrong, sTarget, 1);
    setProperty(*obj, "wrong", Nexil::makePtr<Object>(*wrong));

    for (auto const& expected : std::vector<std::vector<std::string>>{{"a", "b", "c"},
                                                                      {"c"},
                                                                      {"wrong"},
                                                                      {"loop"},
                                                                      {"x", "y", "z"},
                                                                      {"lost", "nowhere"},
                                                                      {"typed", "number"},
                                                                      {"fresh", ""}})
        EXPECT_EQ(chain(*obj, expected[0].c_str()), expected);
    EXPECT_EQ(getTargetComponent(*obj, "a"), "c");
    EXPECT_EQ(getTargetComponent(*obj, "fresh"), "");

    EXPECT_EQ(getGeoPropTarget(*obj, *support::part(*obj, "b")), support::part(*obj, "c"));
    for (char const* name : {"lost", "fresh", "typed", "wrong", "c"})
        EXPECT_FALSE(getGeoPropTarget(*obj, *support::part(*obj, name))) << name;

    constexpr int length = 20000;
    for (int i = 0; i < length; ++i)
        setProperty(*obj, std::to_string(i).c_str(), targeting(std::to_string((i + 1) % length).c_str()));
    EXPECT_EQ(getTargetChain(*obj, "5").size(), static_cast<std::uint64_t>(length));
    EXPECT_EQ(getTargetComponent(*obj, "5"), "4");
}

TEST(GeoProperties, UniqueNamesStripTheDigitsThatTheRegularExpressionStrips)
{
    std::regex const trailingDigits("(\\d)+$");
    std::vector<std::string> names{""};
    std::string const letters = "a19\n";
    for (std::size_t first = 0; names.size() < 5000; ++first)
        for (char letter : letters)
            names.push_back(names[first] + letter);
    names.push_back("point_color\xd9\xa3"); // a digit, though not a decimal one in this grammar
    for (std::string const& name : names) {
        auto const obj = createObject();
        EXPECT_EQ(getUniqueGeoPropName(name.c_str(), *obj), name.c_str());
        if (!setProperty(*obj, name.c_str(), 1))
            continue;
        auto const base = std::regex_replace(name, trailingDigits, "");
        auto const expected = base + (name == base + "1" ? "2" : "1");
        ASSERT_EQ(getUniqueGeoPropName(name.c_str(), *obj), expected.c_str()) << testing::PrintToString(name);
    }
}

TEST(GeoProperties, UniqueNamesTakeTheFirstFreeNumber)
{
    auto const obj = createObject();
    for (char const* name : {"point_color", "point_color1", "point_color7", "7"})
        setProperty(*obj, name, 1);
    EXPECT_EQ(getUniqueGeoPropName("point_color", *obj), "point_color2");
    EXPECT_EQ(getUniqueGeoPropName("point_color7", *obj), "point_color2");
    EXPECT_EQ(getUniqueGeoPropName("point_color8", *obj), "point_color8");
    EXPECT_EQ(getUniqueGeoPropName("7", *obj), "1");
    for (int i = 2; i < 1200; ++i)
        setProperty(*obj, ("point_color" + std::to_string(i)).c_str(), 1);
    EXPECT_EQ(getUniqueGeoPropName("point_color0", *obj), "point_color0");
    EXPECT_EQ(getUniqueGeoPropName("point_color11", *obj), "point_color1200");

    std::string const digits(100000, '3');
    setProperty(*obj, ("a" + digits).c_str(), 1);
    EXPECT_EQ(getUniqueGeoPropName(("a" + digits).c_str(), *obj), "a1");
    EXPECT_EQ(getGeoPropRangeName("face_vertex_normal"), "face_vertex_normal_index");
}

} // namespace
