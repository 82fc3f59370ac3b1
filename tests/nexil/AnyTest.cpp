#include "Foreign.h"
#include "Tracked.h"

#include <geometry/AllocationCount.h>
#include <nexil/Any.h>

#include <gmock/gmock.h>

#include <array>
#include <memory>
#include <vector>

namespace {

using Nexil::Any;
using Nexil::Array;
using Nexil::Ptr;
using Nexil::String;
using support::Tracked;

struct Base {
    virtual ~Base() = default;
};
struct Derived : Base {};

/// Too large to be held inline.
struct Large {
    Tracked tracked;
    char filling[40] = {};
};

/// Small, but its move may throw.
struct Moody {
    Tracked tracked;
    Moody(int value) : tracked(value) {}
    Moody(Moody const&) = default;
    Moody(Moody&& other) noexcept(false) : tracked(std::move(other.tracked)) { throw std::runtime_error("moved"); }
};

template <class... Types>
int typesFoundIn(Any const& any)
{
    return (0 + ... + (any.get<Types>() != nullptr));
}

TEST(Any, OnlyTheExactTypeIsFound)
{
    std::pair<Any, Nexil::TypeId> const cases[] = {
        {3, Nexil::TypeId::of<int>()},
        {3u, Nexil::TypeId::of<unsigned int>()},
        {3ll, Nexil::TypeId::of<long long>()},
        {static_cast<signed char>(3), Nexil::TypeId::of<signed char>()},
        {true, Nexil::TypeId::of<bool>()},
        {String("3"), Nexil::TypeId::of<String>()},
        {Ptr<Base>(Nexil::makePtr<Derived>()), Nexil::TypeId::of<Ptr<Base>>()},
        {Nexil::makePtr<Derived>(), Nexil::TypeId::of<Ptr<Derived>>()},
    };
    for (auto const& [value, type] : cases) {
        EXPECT_TRUE(value.type() == type) << Nexil::anyToTypeString(value);
        int const foundCount =
            typesFoundIn<int, unsigned int, long, long long, char, signed char, unsigned char, bool, float, double,
                         String, Ptr<Base>, Ptr<Derived>, Nexil::MutablePtr<Base>, Nexil::MutablePtr<Derived>, Any>(
                value);
        EXPECT_EQ(foundCount, 1) << Nexil::anyToTypeString(value);
    }
    EXPECT_EQ((typesFoundIn<int, String, Ptr<Base>>(Any())), 0);
    EXPECT_FALSE(Any().type());
    EXPECT_EQ(Nexil::anyToTypeString(Any()), "");
    EXPECT_EQ(Nexil::anyToTypeString(3u), "unsigned int");
    EXPECT_EQ(Nexil::anyToTypeString(String()), "Nexil::String");
}

template <class T>
std::uint64_t allocationsOfMakingCopyingAndMoving(T value)
{
    auto const before = support::allocationCount();
    Any made(std::move(value));
    Any copy(made);
    Any moved(std::move(made));
    made = std::move(copy);
    copy = std::move(moved);
    EXPECT_TRUE(moved.empty());
    EXPECT_TRUE(made.holds<T>() && copy.holds<T>());
    return support::allocationCount() - before;
}

TEST(Any, SmallValuesNeedNoHeapAndLargeOnesOneBlockForEachCopy)
{
    EXPECT_EQ(allocationsOfMakingCopyingAndMoving(Nexil::makePtr<Array<int>>()), 0u);
    EXPECT_EQ(allocationsOfMakingCopyingAndMoving(Ptr<Derived>()), 0u);
    EXPECT_EQ(allocationsOfMakingCopyingAndMoving(String("up to 15 bytes.")), 0u);
    EXPECT_EQ(allocationsOfMakingCopyingAndMoving(std::array<double, 4>()), 0u);
    EXPECT_EQ(allocationsOfMakingCopyingAndMoving(std::array<char, 32>()), 0u);
    EXPECT_EQ(allocationsOfMakingCopyingAndMoving(std::array<char, 33>()), 2u);
    EXPECT_EQ(allocationsOfMakingCopyingAndMoving(Large()), 2u);
    struct alignas(64) Aligned {
        char byte;
    };
    Any const any = Aligned{1};
    EXPECT_EQ(reinterpret_cast<std::uintptr_t>(any.get<Aligned>()) % 64, 0u);
}

template <class T>
void copyMoveAndFail()
{
    SCOPED_TRACE(Nexil::Internal::DebugTypeId::getTypeNameForDebugOnly(Nexil::TypeId::of<T>()));
    int const before = Tracked::alive;
    {
        T const value{5};
        Any any(value);
        EXPECT_EQ(Tracked::alive, before + 2);
        Any copy(any);
        EXPECT_EQ(Tracked::alive, before + 3);
        EXPECT_NE(any.get<T>(), copy.get<T>());
        auto& self = any;
        any = self;
        any = std::move(self);
        ASSERT_TRUE(any.get<T>());
        EXPECT_EQ(any.get<T>()->tracked.value, 5);
        Any moved(std::move(any));
        EXPECT_TRUE(any.empty());
        any = std::move(moved);
        EXPECT_EQ(Tracked::alive, before + 3);
        EXPECT_EQ(any.get<T>()->tracked.value, 5);

        Any target(std::vector<int>{1, 2});
        support::FailingCopies const fail(0);
        EXPECT_THROW(target = any, std::runtime_error);
        EXPECT_THAT(*target.get<std::vector<int>>(), testing::ElementsAre(1, 2));
        EXPECT_THROW(Any{value}, std::runtime_error);
        EXPECT_EQ(Tracked::alive, before + 3);
        any = std::move(target);
        EXPECT_EQ(Tracked::alive, before + 2);
        copy.reset();
    }
    EXPECT_EQ(Tracked::alive, before);
}

TEST(Any, ValuesAreDestroyedOnceAndAFailedCopyLeavesTheTarget)
{
    struct Small {
        Tracked tracked;
    };
    copyMoveAndFail<Small>();
    copyMoveAndFail<Large>();
    copyMoveAndFail<Moody>();
}

TEST(Any, CanBecomeAPartOfItsOwnValue)
{
    using List = std::vector<Any>;
    Any inner = List{String("another text that needs a block of its own")};
    inner = (*inner.get<List>())[0];
    EXPECT_EQ(*inner.get<String>(), "another text that needs a block of its own");

    Any moved = List{List{String("and yet another text with a block of its own")}};
    for (int level = 0; level < 2; ++level)
        moved = std::move((*moved.get<List>())[0]);
    EXPECT_EQ(*moved.get<String>(), "and yet another text with a block of its own");
}

TEST(Any, ArraysOfEveryElementAnswerForTheirSize)
{
    using Nested = Array<Ptr<Array<int>>>;
    struct {
        Any value;
        bool isArray;
        std::uint64_t size;
    } const cases[] = {
        {Nexil::makePtr<Array<float>>(std::initializer_list<float>{1, 2, 3}), true, 3},
        {Nexil::makePtr<Nested>(std::initializer_list<Ptr<Array<int>>>{nullptr, nullptr}), true, 2},
        {Ptr<Array<String>>(), true, 0},
        {foreign::make(foreign::PointerToArray), true, 2},
        {Array<float>{1, 2}, false, 0},
        {Nexil::makePtr<int>(3), false, 0},
        {Any(), false, 0},
    };
    for (auto const& row : cases) {
        EXPECT_EQ(Nexil::AnyArray::is_any_array(row.value), row.isArray) << Nexil::anyToTypeString(row.value);
        EXPECT_EQ(Nexil::AnyArray::get_any_array_size(row.value), row.size) << Nexil::anyToTypeString(row.value);
    }
}

struct Local {
    int value;
};

TEST(Any, ValuesOfAnotherLibraryAreFoundByTheirType)
{
    using PairArray = Ptr<Array<foreign::Pair<int>>>;
    Any const small = foreign::make(foreign::Small);
    Any const heap = foreign::make(foreign::Heap);
    Any array = foreign::make(foreign::PointerToArray);
    ASSERT_TRUE(small.get<foreign::Pair<int>>());
    EXPECT_EQ(small.get<foreign::Pair<int>>()->second, 2);
    EXPECT_FALSE(small.get<foreign::Pair<unsigned int>>());
    ASSERT_TRUE(heap.get<foreign::Large<double>>());
    EXPECT_EQ(heap.get<foreign::Large<double>>()->values[2], 3);
    ASSERT_TRUE(array.get<PairArray>());
    Any const shared = array;
    Nexil::MutablePtr<Array<foreign::Pair<int>>> own(std::move(*array.get<PairArray>()));
    (*own)[0].first = 9;
    EXPECT_EQ((**shared.get<PairArray>())[0].first, 3);

    EXPECT_TRUE(foreign::finds(foreign::Small, foreign::Pair<int>{}));
    EXPECT_TRUE(foreign::finds(foreign::Heap, foreign::Large<double>{}));
    EXPECT_TRUE(foreign::finds(foreign::PointerToArray, PairArray()));
    EXPECT_FALSE(foreign::finds(foreign::Small, foreign::Pair<long>{}));
    auto const type = Nexil::TypeId::of<foreign::Pair<int>>();
    EXPECT_TRUE(small.type() == type);
    EXPECT_EQ(std::hash<Nexil::TypeId>()(small.type()), std::hash<Nexil::TypeId>()(type));

    // Two types that only share a name are two types.
    Any const local = foreign::make(foreign::Hidden);
    EXPECT_TRUE(foreign::finds(foreign::Hidden, local));
    EXPECT_FALSE(local.holds<Local>());
    EXPECT_FALSE(foreign::finds(foreign::Hidden, Local{7}));
}

} // namespace
