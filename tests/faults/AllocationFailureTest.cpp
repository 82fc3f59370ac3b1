#include "Operations.h"
#include <support/FailingMemory.h>

#include <gtest/gtest.h>
#include <tbb/global_control.h>

#include <new>

namespace {

TEST(AllocationFailure, AtAnyMomentLeavesEverythingAsItWas)
{
    // One thread, so that the numbers of allocations are the same at each run.
    tbb::global_control const limit(tbb::global_control::max_allowed_parallelism, 1);
    support::Sample const sample;
    auto const before = sample.description();
    for (support::Operation const& operation : support::operations()) {
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
            ASSERT_TRUE(isDone || !isOver) << operation.name;
            ASSERT_EQ(fault, "") << operation.name << ", allocation " << number;
        }
        EXPECT_GT(number, 1u) << operation.name << ": nothing was allocated";
        EXPECT_EQ(sample.description(), before) << operation.name;
    }
}

} // namespace
