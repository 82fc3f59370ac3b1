#include "Operations.h"
#include <support/FailingMemory.h>

#include <gtest/gtest.h>
#include <tbb/global_control.h>

#include <new>

namespace {

using support::Operation;
using support::Sample;

class AllocationFailure : public ::testing::TestWithParam<std::size_t> {};

TEST_P(AllocationFailure, AtAnyMomentLeavesEverythingAsItWas)
{
    // One thread, so that the numbers of allocations are the same at each run.
    tbb::global_control const limit(tbb::global_control::max_allowed_parallelism, 1);
    Operation const& operation = support::operations()[GetParam()];
    Sample const sample;
    auto const before = sample.description();
    // Also makes what is made once.
    ASSERT_TRUE(operation.run(sample)) << operation.name;

    std::uint64_t number = 0;
    for (bool isOver = false; !isOver;) {
        ++number;
        bool isDone = false;
        std::string fault;
        {
            support::FailingAllocation const failing(number);
            try {
                isDone = operation.run(sample);
            } catch (std::bad_alloc const&) {
                // as it should
            } catch (std::exception const& other) {
                fault = other.what();
            }
            isOver = !failing.hasFailed();
        }
        EXPECT_TRUE(isDone || !isOver) << operation.name;
        EXPECT_EQ(fault, "") << operation.name << ", allocation " << number;
        ASSERT_FALSE(::testing::Test::HasFailure());
    }
    EXPECT_GT(number, 1u) << operation.name << ": nothing was allocated";
    EXPECT_EQ(sample.description(), before) << operation.name;
}

INSTANTIATE_TEST_SUITE_P(All, AllocationFailure, ::testing::Range<std::size_t>(0, support::operations().size()),
                         [](auto const& parameter) {
                             std::string name = support::operations()[parameter.param].name;
                             std::erase(name, ' ');
                             return name;
                         });

} // namespace
