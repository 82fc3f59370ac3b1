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

template <class Result, class... Arguments>
Result callSlot(Object* object, std::size_t slot, Arguments... arguments)
{
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
    EXPECT_EQ(callSlot<std::uint64_t>(object, 2), 11u);
    EXPECT_EQ(lastCall, "size");
    EXPECT_TRUE(callSlot<bool>(object, 3));
    EXPECT_EQ(lastCall, "empty");
    EXPECT_TRUE(callSlot<bool>(object, 4, &key));
    EXPECT_EQ(lastCall, "hasProperty");
    EXPECT_EQ(*callSlot<Any>(object, 5, &key).get<String>(), "key");
    EXPECT_EQ(lastCall, "getProperty");
    EXPECT_EQ(*callSlot<Any>(object, 6, &key).get<String>(), "key");
    EXPECT_EQ(lastCall, "extractProperty");
    EXPECT_TRUE(callSlot<bool>(object, 7, &key));
    EXPECT_EQ(lastCall, "eraseProperty");
    callSlot<void>(object, 8);
    EXPECT_EQ(lastCall, "eraseAllProperties");
    EXPECT_EQ(callSlot<Array<String>>(object, 9)[0], "key");
    EXPECT_EQ(lastCall, "keys");
    EXPECT_TRUE(callSlot<bool>(object, 10, &key, &number));
    EXPECT_EQ(lastCall, "setPropertyAny");
    callSlot<void>(object, 0);
    EXPECT_EQ(lastCall, "destructor");
}

} // namespace

#endif
