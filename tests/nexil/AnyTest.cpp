#include "Foreign.h"
#include "Tracked.h"

#include <nexil/Any.h>
#include <support/FailingMemory.h>

#include <gmock/gmock.h>

#include <array>
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
    struct {
        Any value;
        Nexil::TypeId type;
        char const* text;
    } const cases[] = {
        {3u, Nexil::TypeId::of<unsigned int>(), "unsigned int"},
        {3ll, Nexil::TypeId::of<long long>(), "long long"},
        {String("3"), Nexil::TypeId::of<String>(), "Nexil::String"},
        {Ptr<Base>(Nexil::makePtr<Derived>()), Nexil::TypeId::of<Ptr<Base>>(), nullptr},
        {Nexil::makePtr<Derived>(), Nexil::TypeId::of<Ptr<Derived>>(), nullptr},
    };
    for (auto const& [value, type, text] : cases) {
        EXPECT_TRUE(value.type() == type) << Nexil::anyToTypeString(value);
        int const foundCount = typesFoundIn<int, unsigned int, long, long long, String, Ptr<Base>, Ptr<Derived>,
                                            Nexil::MutablePtr<Base>, Nexil::MutablePtr<Derived>, Any>(value);
        EXPECT_EQ(foundCount, 1) << Nexil::anyToTypeString(value);
        EXPECT_TRUE(!text || Nexil::anyToTypeString(value) == text) << Nexil::anyToTypeString(value);
    }
    EXPECT_EQ((typesFoundIn<int, String, Ptr<Base>>(Any())), 0);
    EXPECT_FALSE(Any().type());
    EXPECT_EQ(Nexil::anyToTypeString(Any()), "");
}

template <class T>
std::uint64_t allocationsOfMakingCopyingAndMoving(T value)
{
    auto const before = support::allocationCount();
    Any made(std::move(value));
    Any copy(made);
    Any moved(std::move(made));
    made = std::move(copy);
    EXPECT_TRUE(made.holds<T>() && copy.empty() && moved.holds<T>());
    return support::allocationCount() - before;
}

TEST(Any, SmallValuesNeedNoHeapAndLargeOnesOneBlockForEachCopy)
{
    EXPECT_EQ(allocationsOfMakingCopyingAndMoving(Nexil::makePtr<Array<int>>()), 0u);
    EXPECT_EQ(allocationsOfMakingCopyingAndMoving(String("up to 15 bytes.")), 0u);
    EXPECT_EQ(allocationsOfMakingCopyingAndMoving(std::array<double, 4>()), 0u);
    EXPECT_EQ(allocationsOfMakingCopyingAndMoving(std::array<char, 33>()), 2u);
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
    {
        T const value{5};
        Any any(value);
        Any copy(any);
        EXPECT_EQ(Tracked::alive, 3);
        EXPECT_NE(any.get<T>(), copy.get<T>());
        auto& self = any;
        any = self;
        any = std::move(self);
        Any moved(std::move(any));
        EXPECT_TRUE(any.empty());
        any = std::move(moved);
        ASSERT_TRUE(any.get<T>());
        EXPECT_EQ(any.get<T>()->tracked.value, 5);

        Any target(std::vector<int>{1, 2});
        support::FailingCopies const fail(0);
        EXPECT_THROW(target = any, std::runtime_error);
        EXPECT_THAT(*target.get<std::vector<int>>(), testing::ElementsAre(1, 2));
        EXPECT_EQ(Tracked::alive, 3);
        any = std::move(target);
        EXPECT_EQ(Tracked::alive, 2);
    }
    EXPECT_EQ(Tracked::alive, 0);
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
    String const text("a text that needs a block of its own");
    Any inner = List{text};
    inner = (*inner.get<List>())[0];
    EXPECT_EQ(*inner.get<String>(), text);
    Any moved = List{List{text}};
    for (int level = 0; level < 2; ++level)
        moved = std::move((*moved.get<List>())[0]);
    EXPECT_EQ(*moved.get<String>(), text);
}

TEST(Any, ArraysOfEveryElementAnswerForTheirSize)
{
    struct {
        Any value;
        bool isArray;
        std::uint64_t size;
    } const cases[] = {
        {Nexil::makePtr<Array<float>>(std::initializer_list<float>{1, 2, 3}), true, 3},
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
    Any const pair = foreign::make(foreign::APair);
    ASSERT_TRUE(pair.get<foreign::Pair<int>>());
    EXPECT_EQ(pair.get<foreign::Pair<int>>()->second, 2);
    EXPECT_FALSE(pair.get<foreign::Pair<unsigned int>>());
    auto const type = Nexil::TypeId::of<foreign::Pair<int>>();
    EXPECT_TRUE(pair.type() == type);
    EXPECT_EQ(std::hash<Nexil::TypeId>()(pair.type()), std::hash<Nexil::TypeId>()(type));
    EXPECT_TRUE(foreign::finds(foreign::APair, foreign::Pair<int>{}));
    EXPECT_FALSE(foreign::finds(foreign::APair, foreign::Pair<long>{}));

    Any array = foreign::make(foreign::PointerToArray);
    ASSERT_TRUE(array.get<PairArray>());
    EXPECT_TRUE(foreign::finds(foreign::PointerToArray, PairArray()));
    Any const shared = array;
    Nexil::MutablePtr<Array<foreign::Pair<int>>> own(std::move(*array.get<PairArray>()));
    (*own)[0].first = 9;
    EXPECT_EQ((**shared.get<PairArray>())[0].first, 3);

    // Two types that only share a name are two types.
    Any const local = foreign::make(foreign::Hidden);
    EXPECT_TRUE(foreign::finds(foreign::Hidden, local));
    EXPECT_FALSE(local.holds<Local>());
    EXPECT_FALSE(foreign::finds(foreign::Hidden, Local{7}));
}

} // namespace
