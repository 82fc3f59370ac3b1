#include <veldrin/object/Object.h>

#include <gmock/gmock.h>

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
    std::size_t const places[] = {placeOf(&Object::size),
                                  placeOf(&Object::empty),
                                  placeOf(&Object::hasProperty),
                                  placeOf(&Object::getProperty),
                                  placeOf(&Object::extractProperty),
                                  placeOf(&Object::eraseProperty),
                                  placeOf(&Object::eraseAllProperties),
                                  placeOf(&Object::keys),
                                  placeOf(&Object::setPropertyAny)};
    EXPECT_THAT(places, testing::ElementsAre(2, 3, 4, 5, 6, 7, 8, 9, 10));
}

} // namespace

#endif
