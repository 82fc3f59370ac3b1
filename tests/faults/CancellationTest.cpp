#include "../algorithms/EdgeOracle.h"
#include "Operations.h"

#include <support/Cancellation.h>

#include <gtest/gtest.h>

#include <optional>
#include <stdexcept>

// What a cancelled function leaves to its caller: all outputs as they were, which each operation sees to.

namespace {

using support::CancelAfter;
using support::Operation;
using support::Sample;

/// Whether the operation succeeded; nothing when it left because the job was cancelled.
std::optional<bool> run(Operation const& operation, Sample const& sample)
{
    try {
        return operation.run(sample);
    } catch (std::runtime_error const& cancellation) {
        EXPECT_STREQ(cancellation.what(), "Job cancelled") << operation.name;
        return {};
    }
}

TEST(Cancellation, AtAnyQuestionLeavesEverythingAsItWas)
{
    tbb::global_control const limit(tbb::global_control::max_allowed_parallelism, 1);
    Sample const sample;
    auto const before = sample.description();
    std::string neverAsking;
    for (Operation const& operation : support::operations())
        for (int count = 0;; ++count) {
            CancelAfter const cancel(count);
            auto const isDone = run(operation, sample);
            bool const isCancelled = CancelAfter::questionCount > count;
            EXPECT_EQ(isDone == true, !isCancelled) << operation.name << ", question " << count;
            if (isCancelled)
                continue;
            if (count == 0)
                neverAsking += std::string(operation.name) + ", ";
            break;
        }
    EXPECT_EQ(neverAsking, "proxies, accessors, dumps, ");
    EXPECT_EQ(sample.description(), before);
}

/// rangeCount: faces or strands, of which a kernel goes through at most 4096 between two questions.
void expectCancelledAtAnyQuestion(Operation const& operation, Sample const& sample, int threadCount, int rangeCount)
{
    CancelAfter const never(1 << 30);
    EXPECT_TRUE(run(operation, sample).has_value());
    int const wholeRun = CancelAfter::questionCount;
    EXPECT_GE(wholeRun, rangeCount / 4096);
    // Several threads cut the work otherwise each time: then only so many questions are certain.
    int const late = threadCount == 1 ? wholeRun - 1 : rangeCount / 4096 - 1;
    for (int const count : {0, 1, late / 2, late}) {
        CancelAfter const cancel(count);
        EXPECT_FALSE(run(operation, sample).has_value()) << count << " of " << wholeRun;
        // Every thread may be in a chunk of its own when the answer comes.
        EXPECT_LE(CancelAfter::questionCount, count + 4 * threadCount);
    }
}

TEST(Cancellation, IsAskedForOnceAChunk)
{
    struct {
        unsigned int side, stride;
        int threadCount;
        bool hasRoom;
    } const rows[] = {
        {160, 1, 1, false},
        {160, 1, 2, true},
        {370, 1, 3, true},     // more points than one thread adds the normals of: each its own part,
        {370, 7919, 6, false}, // or, where neighbours have far numbers, its own stripe
    };
    for (auto const& row : rows) {
        unsigned int const count = row.side * row.side;
        auto geometry = support::meshOn(count, support::torusFaces(row.side, row.stride));
        // Strands of one point each over the same points.
        support::Indices offsets(count + 1);
        std::iota(offsets.begin(), offsets.end(), 0u);
        auto const strands = support::strands(std::vector<Veldrin::Math::float3>(count), offsets);
        for (auto const* name : {Veldrin::Geometry::sStrandComp, Veldrin::Geometry::sStrandOffset})
            setProperty(*geometry, name, support::part(*strands, name));
        Sample sample;
        sample.geometry = std::move(geometry);
        sample.room = row.hasRoom ? 4 * count : 0;
        tbb::global_control const limit(tbb::global_control::max_allowed_parallelism,
                                        static_cast<std::size_t>(row.threadCount));
        for (Operation const& algorithm : support::algorithms()) {
            SCOPED_TRACE(testing::Message() << algorithm.name << " on " << row.threadCount << " threads");
            tbb::task_arena(row.threadCount).execute([&] {
                expectCancelledAtAnyQuestion(algorithm, sample, row.threadCount, static_cast<int>(count));
            });
        }
    }
}

} // namespace
