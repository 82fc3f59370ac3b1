#include <veldrin/object/Object.h>

#include <gmock/gmock.h>

#include <new>

// Programs are compiled against the places of these operations in the virtual table, so they never change. Where a
// table lies and how a slot is called is the business of the Itanium C++ ABI, which this test relies on.
#if defined(__GXX_ABI_VERSION)

namespace {

using Nexil::Any;
using Nexil::Array;
using Nexil::String;
using Veldrin::Object;

std::string lastCall;

struct Recorder : Object {
    ~Recorder() override { lastCall = "destructor"; }
    std::uint64_t size() const override { return lastCall = "size", 11; }
    bool empty() const override { return lastCall = "empty", true; }
    bool hasProperty(String const& key) const override { return lastCall = "hasProperty", key == "key"; }
    Any getProperty(String const& key) const override { return lastCall = "getProperty", key; }
    Any extractProperty(String const& key) override { return lastCall = "extractProperty", key; }
    bool eraseProperty(String const& key) override { return lastCall = "eraseProperty", key == "key"; }
    void eraseAllProperties() override { lastCall = "eraseAllProperties"; }
    Array<String> keys() const override { return lastCall = "keys", Array<String>{"key"}; }
    bool setPropertyAny(String const& key, Any&& value) override
    {
        return lastCall = "setPropertyAny", key == "key" && value.holds<int>();
    }
};

/// Calls what stands in a place of the virtual table, which must be the operation of this name.
template <class Result, class... Arguments>
Result call(char const* name, Object* object, std::size_t slot, Arguments... arguments)
{
    struct Check {
        char const* name;
        ~Check() { EXPECT_EQ(lastCall, name); }
    } const check{name};
    void* const* const table = *reinterpret_cast<void* const**>(object);
    return reinterpret_cast<Result (*)(Object*, Arguments...)>(table[slot])(object, arguments...);
}

TEST(VirtualTable, TheTenOperationsStandInTheirPlaces)
{
    alignas(Recorder) std::byte storage[sizeof(Recorder)];
    Object* const object = new (storage) Recorder;
    String const key("key");
    Any number(3);
    // The first operation, the destructor, takes two places: one destroys, the other also frees.
    EXPECT_EQ(call<std::uint64_t>("size", object, 2), 11u);
    EXPECT_TRUE(call<bool>("empty", object, 3));
    EXPECT_TRUE(call<bool>("hasProperty", object, 4, &key));
    EXPECT_EQ(*call<Any>("getProperty", object, 5, &key).get<String>(), "key");
    EXPECT_EQ(*call<Any>("extractProperty", object, 6, &key).get<String>(), "key");
    EXPECT_TRUE(call<bool>("eraseProperty", object, 7, &key));
    call<void>("eraseAllProperties", object, 8);
    EXPECT_EQ(call<Array<String>>("keys", object, 9)[0], "key");
    EXPECT_TRUE(call<bool>("setPropertyAny", object, 10, &key, &number));
    call<void>("destructor", object, 0);
}

} // namespace

#endif
