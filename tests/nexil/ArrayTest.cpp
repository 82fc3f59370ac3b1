#include <nexil/Array.h>
#include <nexil/String.h>

#include <gmock/gmock.h>

#include <limits>
#include <numeric>
#include <vector>

#if defined(__SANITIZE_ADDRESS__)
// Counts that no machine can serve are answered as without the sanitizer.
extern "C" __attribute__((visibility("default"))) char const* __asan_default_options()
{
    return "allocator_may_return_null=1";
}
#endif

namespace {

using Nexil::Array;
using testing::ElementsAre;

bool isAligned(void const* storage, std::uintptr_t alignment)
{
    return reinterpret_cast<std::uintptr_t>(storage) % alignment == 0;
}

TEST(Array, AppendingDoublesAndResizingTakesExactlyWhatIsAsked)
{
    Array<int> array;
    std::vector<std::uint64_t> capacities;
    for (int i = 0; i < 9; ++i) {
        array.push_back(i);
        capacities.push_back(array.capacity());
    }
    EXPECT_THAT(capacities, ElementsAre(1, 2, 4, 4, 8, 8, 8, 8, 16));
    EXPECT_THAT(array, ElementsAre(0, 1, 2, 3, 4, 5, 6, 7, 8));

    array.resize(21);
    EXPECT_EQ(array.capacity(), 21u);
    array.push_back(5);
    EXPECT_EQ(array.capacity(), 42u);
    array.resize(3);
    // Storage that was used before is zero again.
    array.resize(6);
    EXPECT_THAT(array, ElementsAre(0, 1, 2, 0, 0, 0));
    EXPECT_EQ(array.capacity(), 42u);
}

TEST(Array, AnElementOfItsOwnCanBeAppended)
{
    Nexil::String const text("longer than what a string holds without the heap");
    Array<Nexil::String> array{text};
    for (int i = 0; i < 40; ++i)
        array.push_back(array[0]);
    EXPECT_THAT(array, testing::AllOf(testing::SizeIs(41), testing::Each(text)));
}

TEST(Array, ElementsOfWideAlignmentAndBoolsLieAsBytesOneAfterTheOther)
{
    struct alignas(256) Wide {
        char bytes[300];
    };
    Array<Wide> wide;
    for (int i = 0; i < 5; ++i) {
        wide.push_back({});
        EXPECT_TRUE(isAligned(wide.data(), 256));
    }
    Array<bool> const flags{true, false, true};
    EXPECT_EQ(std::string(reinterpret_cast<char const*>(flags.data()), 3), std::string("\1\0\1", 3));
    EXPECT_FALSE(Array<int>({1, 2}) == Array<int>({1, 2, 0}));
}

TEST(Array, CountsThatNoMachineCanServeAreRefused)
{
    constexpr auto most = std::numeric_limits<std::uint64_t>::max();
    Array<double> array{1, 2};
    // The first two overflow when they become bytes, and would look small then.
    for (std::uint64_t const count : {most / 8 + 2, most / 8 + (1u << 22), most, most / 2, most / 16, most >> 10}) {
        EXPECT_THROW(array.resize(count), std::bad_alloc) << count;
        EXPECT_THROW(Nexil::Internal::resizeUninitialized(array, count), std::bad_alloc) << count;
    }
    EXPECT_THAT(array, ElementsAre(1, 2));
    EXPECT_EQ(array.capacity(), 2u);
}

TEST(Array, LargeBlocksStartOnAHugePageAndHoldWhatIsWritten)
{
    constexpr std::uint64_t count = (std::uint64_t(17) << 20) / 8 + 1;
    Array<std::uint64_t> array;
    array.resize(count);
    EXPECT_TRUE(isAligned(array.data(), std::uintptr_t(2) << 20));
    EXPECT_EQ(std::ranges::count(array, 0u), static_cast<std::ptrdiff_t>(count));
    std::iota(array.begin(), array.end(), 0u);
    array.push_back(count);
    for (std::uint64_t i = 0; i <= count; ++i)
        ASSERT_EQ(array[i], i);
}

} // namespace
