#include <veldrin/object/Properties.h>

#include <gmock/gmock.h>

namespace {

using namespace Veldrin;
using Nexil::Any;
using Nexil::Array;
using Nexil::Ptr;
using Nexil::String;

using ObjectPtr = Ptr<Object>;
using Properties = std::initializer_list<std::pair<char const*, Any>>;

ObjectPtr objectOf(Properties properties)
{
    auto object = createObject();
    for (auto const& [name, value] : properties)
        object->setPropertyAny(name, Any(value));
    return object;
}

template <class T>
Any arrayOf(std::initializer_list<T> values)
{
    return Nexil::makePtr<Array<T>>(values);
}

/// Shows the properties of another object as its own and counts how often a value is taken.
struct Computed : Object {
    explicit Computed(ObjectPtr shown) : shown_(std::move(shown)) {}

    std::uint64_t size() const override { return shown_->size(); }
    bool empty() const override { return shown_->empty(); }
    bool hasProperty(String const& key) const override { return shown_->hasProperty(key); }
    Any getProperty(String const& key) const override
    {
        if (!shown_->propertyInfo(key).type || shown_->propertyInfo(key).type == Nexil::TypeId::of<ObjectPtr>()) {
            // Made anew for each question, as by a class that holds no objects at all.
            auto const object = getPropertyAs<ObjectPtr>(*shown_, key);
            return object ? Any(ObjectPtr(Nexil::makePtr<Computed>(object))) : shown_->getProperty(key);
        }
        ++dataReadCount;
        return shown_->getProperty(key);
    }
    Array<String> keys() const override { return shown_->keys(); }
    PropertyInfo propertyInfo(String const& key) const override { return shown_->propertyInfo(key); }

    static inline int dataReadCount = 0;

private:
    ObjectPtr shown_;
};

TEST(IsA, TableOfKinds)
{
    Any const anyValue = Any();
    Any const anyArray = Ptr<Array<Any>>();
    auto const inner = objectOf({{"count", 3u}, {"more", 1}});
    Any const nullObject = ObjectPtr();
    struct {
        char const* what;
        Properties object, prototype;
        bool isA;
    } const cases[] = {
        {"more than asked", {{"a", 1}, {"b", 2.f}}, {{"b", 7.f}}, true},
        {"another type", {{"a", 1}}, {{"a", 1u}}, false},
        {"any value: nothing", {{"a", Any()}}, {{"a", anyValue}}, true},
        {"any value: missing", {{"b", 1}}, {{"a", anyValue}}, false},
        {"any array", {{"a", arrayOf<float>({1})}}, {{"a", anyArray}}, true},
        {"any array: null", {{"a", Ptr<Array<bool>>()}}, {{"a", anyArray}}, true},
        {"any array: filled prototype", {{"a", arrayOf<int>({})}}, {{"a", arrayOf<Any>({1})}}, true},
        {"any array: number", {{"a", 1}}, {{"a", anyArray}}, false},
        {"array of any for another array", {{"a", anyArray}}, {{"a", arrayOf<int>({})}}, false},
        {"nested", {{"a", inner}}, {{"a", objectOf({{"count", 0u}})}}, true},
        {"nested: less", {{"a", inner}}, {{"a", objectOf({{"count", 0u}, {"other", 1}})}}, false},
        {"nested: no object", {{"a", 1}}, {{"a", inner}}, false},
        {"nested: null for an empty one", {{"a", nullObject}}, {{"a", objectOf({})}}, false},
        {"null prototype", {{"a", inner}}, {{"a", nullObject}}, true},
        {"null prototype: no object", {{"a", 1}}, {{"a", nullObject}}, false},
        {"wildcards two levels down",
         {{"a", objectOf({{"b", objectOf({{"c", 1}})}})}},
         {{"a", objectOf({{"b", objectOf({{"c", anyValue}})}})}},
         true},
        {"one of two differs", {{"a", inner}, {"b", inner}}, {{"a", inner}, {"b", objectOf({{"count", 1}})}}, false},
    };
    for (auto const& row : cases) {
        auto const object = objectOf(row.object);
        auto const prototype = objectOf(row.prototype);
        Computed const computedObject(object);
        Computed const computedPrototype(prototype);
        Computed::dataReadCount = 0;
        EXPECT_EQ(Object::isA(*object, *prototype), row.isA) << row.what;
        EXPECT_EQ(Object::isA(computedObject, *prototype), row.isA) << row.what;
        EXPECT_EQ(Object::isA(*object, computedPrototype), row.isA) << row.what;
        EXPECT_EQ(Object::isA(computedObject, computedPrototype), row.isA) << row.what;
        EXPECT_TRUE(Object::isA(computedObject, computedObject)) << row.what;
        EXPECT_EQ(Computed::dataReadCount, 0) << row.what;
    }
}

/// `depth` levels, each referring to the next `width` times; at the bottom one property.
ObjectPtr nest(int depth, int width, Any const& bottom)
{
    ObjectPtr object = objectOf({{"bottom", bottom}});
    for (int level = 0; level < depth; ++level) {
        auto holder = createObject();
        for (int i = 0; i < width; ++i)
            setProperty(*holder, std::to_string(i).c_str(), object);
        object = std::move(holder);
    }
    return object;
}

TEST(IsA, DeepNestingNeedsNoStackAndSharingNoTime)
{
    struct {
        int depth, width;
    } const shapes[] = {{100'000, 1}, {60, 2}, {200, 10}};
    for (auto const& [depth, width] : shapes) {
        auto const object = nest(depth, width, 1);
        auto const equal = nest(depth, width, 2);
        auto const different = nest(depth, width, 3u);
        EXPECT_TRUE(Object::isA(*object, *object));
        EXPECT_TRUE(Object::isA(*object, *equal));
        EXPECT_FALSE(Object::isA(*object, *different));
        EXPECT_TRUE(Object::isA(*object, *nest(depth, width, Any())));
    }
    // One pair that was compared before says nothing about another with one of its two objects.
    auto const holder = createObject();
    auto const wanted = createObject();
    auto const shared = nest(60, 2, 1);
    setProperty(*holder, "first", shared);
    setProperty(*holder, "second", shared);
    setProperty(*wanted, "first", nest(60, 2, 5u));
    setProperty(*wanted, "second", nest(60, 2, 5));
    EXPECT_FALSE(Object::isA(*holder, *wanted));
    std::swap(*holder, *wanted);
    EXPECT_FALSE(Object::isA(*holder, *wanted));
}

} // namespace
