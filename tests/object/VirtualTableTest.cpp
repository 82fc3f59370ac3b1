#include <veldrin/object/Object.h>

#include <gtest/gtest.h>

#include <cstddef>
#include <cstring>

// Programs are compiled against the places of these operations in the virtual table, so they never change. How a pointer to
// a virtual function tells its place is the business of the Itanium C++ ABI, which this test relies on.
#if defined(__GXX_ABI_VERSION) && defined(__x86_64__)

namespace {

using Veldrin::Object;

template <class Member>
std::size_t placeOf(Member member)
{
    static_assert(sizeof member == 2 * sizeof(std::size_t));
    std::size_t offsetPlusOne = 0;
    std::memcpy(&offsetPlusOne, &member, sizeof offsetPlusOne);
    return (offsetPlusOne - 1) / sizeof(void*);
}

TEST(VirtualTable, TheTenOperationsStandInTheirPlaces)
{
    // The first operation, the destructor, takes two places: one destroys, the other also frees.
    EXPECT_EQ(placeOf(&Object::size), 2u);
    EXPECT_EQ(placeOf(&Object::empty), 3u);
    EXPECT_EQ(placeOf(&Object::hasProperty), 4u);
    EXPECT_EQ(placeOf(&Object::getProperty), 5u);
    EXPECT_EQ(placeOf(&Object::extractProperty), 6u);
    EXPECT_EQ(placeOf(&Object::eraseProperty), 7u);
    EXPECT_EQ(placeOf(&Object::eraseAllProperties), 8u);
    EXPECT_EQ(placeOf(&Object::keys), 9u);
    EXPECT_EQ(placeOf(&Object::setPropertyAny), 10u);
}

} // namespace

#endif
