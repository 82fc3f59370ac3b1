#include <veldrin/object/Properties.h>

#include <gmock/gmock.h>

#include <algorithm>
#include <random>
#include <string>
#include <vector>

namespace {

using namespace Veldrin;
using Nexil::Any;
using Nexil::Array;
using Nexil::Ptr;
using Nexil::String;

/// The slow and simple twin: names and numbers in a row, -1 for an empty value.
struct Model {
    std::vector<std::pair<std::string, int>> rows;

    auto find(std::string const& name) { return std::ranges::find(rows, name, &std::pair<std::string, int>::first); }
};

int numberIn(Any const& value)
{
    return value.empty() ? -1 : *value.get<int>();
}

void expectEqual(Object const& object, Model& model)
{
    ASSERT_EQ(object.size(), model.rows.size());
    ASSERT_EQ(object.empty(), model.rows.empty());
    auto const keys = object.keys();
    ASSERT_EQ(keys.size(), model.rows.size());
    for (std::size_t i = 0; i < keys.size(); ++i) {
        ASSERT_EQ(keys[i], model.rows[i].first.c_str());
        ASSERT_EQ(numberIn(object.getProperty(keys[i])), model.rows[i].second);
    }
}

TEST(Object, FollowsItsModelThroughThousandsOfChanges)
{
    // Pools of names around the count from which names are hashed, and far above it.
    for (unsigned int const nameCount : {5u, 14u, 26u, 60u, 400u}) {
        SCOPED_TRACE(nameCount);
        std::mt19937 random(nameCount);
        Object object;
        Model model;
        auto writeShare = random() % 10;
        for (int step = 0; step < 6000; ++step) {
            if (step % 500 == 0)
                writeShare = 2 + random() % 7; // grows for a while, shrinks for a while
            std::string const name = "name_" + std::to_string(random() % nameCount);
            String const key(name.c_str());
            auto const place = model.find(name);
            bool const exists = place != model.rows.end();
            ASSERT_EQ(object.hasProperty(key), exists);
            if (random() % 10 < writeShare) {
                int const number = static_cast<int>(random() % 50) - 1;
                ASSERT_TRUE(object.setPropertyAny(key, number == -1 ? Any() : Any(number)));
                if (exists)
                    place->second = number;
                else
                    model.rows.emplace_back(name, number);
            } else if (random() % 2) {
                ASSERT_EQ(object.eraseProperty(key), exists);
                if (exists)
                    model.rows.erase(place);
            } else {
                ASSERT_EQ(numberIn(object.extractProperty(key)), exists ? place->second : -1);
                if (exists)
                    model.rows.erase(place);
            }
            if (step % 97 == 0)
                expectEqual(object, model);
            if (step % 501 == 0) {
                Object copy(object);
                Object target;
                target.setPropertyAny("gone", 1);
                target = object;
                object.eraseAllProperties();
                EXPECT_TRUE(object.empty());
                expectEqual(target, model);
                object = std::move(copy);
                // What was moved from is empty, whatever gaps it had.
                EXPECT_TRUE(copy.size() == 0 && copy.keys().empty());
                expectEqual(object, model);
            }
        }
    }
}

TEST(Object, ErasingAHundredThousandPropertiesOneByOneIsLinear)
{
    constexpr int kCount = 100'000;
    for (int const order : {0, 1, 2}) {
        std::vector<String> names;
        Object object;
        for (int i = 0; i < kCount; ++i) {
            names.emplace_back(std::to_string(i).c_str());
            object.setPropertyAny(names.back(), i);
        }
        if (order == 1)
            std::ranges::reverse(names);
        if (order == 2)
            std::shuffle(names.begin(), names.end(), std::mt19937(8));
        for (std::size_t i = 0; i + 10 < names.size(); ++i)
            ASSERT_TRUE(object.eraseProperty(names[i]));
        // The few that are left are as cheap to change as those of an object that was never large.
        for (int i = 0; i < kCount; ++i) {
            ASSERT_TRUE(object.setPropertyAny(names[0], i));
            ASSERT_TRUE(object.eraseProperty(names[0]));
        }
        EXPECT_EQ(object.size(), 10u);
    }
}

TEST(Object, CopiesShareTheirArraysAndTheDefaultIsOne)
{
    Object original;
    setProperty(original, "array", Nexil::makePtr<Array<int>>(std::initializer_list<int>{1, 2}));
    Object const copy(original);
    auto const array = getPropertyAs<Ptr<Array<int>>>(copy, "array");
    EXPECT_EQ(array, getPropertyAs<Ptr<Array<int>>>(original, "array"));
    EXPECT_EQ(array.useCount(), 3u);

    Ptr<Object> const& missing = Nexil::Internal::getDefaultClass<Object>();
    Nexil::MutablePtr<Object> own{Ptr<Object>(missing)};
    setProperty(*own, "a", 1);
    EXPECT_TRUE(missing->empty());
}

TEST(Object, NamesAreNeverEmptyAndCountWhole)
{
    Object object;
    EXPECT_FALSE(object.setPropertyAny("", 1));
    EXPECT_TRUE(object.empty());
    // Names that differ behind a zero byte are two names.
    object.setPropertyAny(String("a\0b", 3), 1);
    EXPECT_FALSE(object.hasProperty("a"));
}

/// Overrides nothing but the ten operations.
struct Computed : Object {
    Array<String> keys() const override { return {"array", "nothing"}; }
    bool hasProperty(String const& key) const override { return key == "array" || key == "nothing"; }
    Any getProperty(String const& key) const override
    {
        return key == "array" ? Any(Nexil::makePtr<Array<int>>(std::initializer_list<int>{1, 2, 3})) : Any();
    }
};

TEST(Object, TypeAndSizeAreToldWithoutTheValue)
{
    Object object;
    Computed const computed;
    for (auto const& key : computed.keys())
        object.setPropertyAny(key, computed.getProperty(key));
    for (Object const* const each : std::initializer_list<Object const*>{&object, &computed}) {
        auto const nothing = each->propertyInfo("nothing");
        EXPECT_TRUE(nothing.exists && !nothing.isArray && !nothing.type && nothing.arraySize == 0);
        auto const array = each->propertyInfo("array");
        EXPECT_TRUE(array.exists && array.isArray && array.arraySize == 3);
        EXPECT_TRUE(array.type == Nexil::TypeId::of<Ptr<Array<int>>>());
        EXPECT_FALSE(each->propertyInfo("missing").exists);
    }
}

} // namespace
