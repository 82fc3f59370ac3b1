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

/// Too large to be held inline.
struct Large {
    Tracked tracked;
    char filling[40] = {};
};

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

} // namespace
