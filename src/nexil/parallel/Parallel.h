#pragma once

#include <nexil/JobCancel.h>
#include <nexil/parallel/PlainThreads.h>

#include <tbb/blocked_range.h>
#include <tbb/global_control.h>
#include <tbb/parallel_for.h>
#include <tbb/parallel_invoke.h>
#include <tbb/parallel_reduce.h>
#include <tbb/parallel_sort.h>
#include <tbb/task_arena.h>
#include <tbb/task_group.h>

#include <algorithm>
#include <cstddef>
#include <utility>

/// The one way to loop in parallel here: the range, the grain by name, the body.
///
///     parallel::forRange(faceCount, grain::kFaces, [&](std::size_t begin, std::size_t end) { ... });
///
/// Every call runs in a task context of its own, so that neither side's cancellation cuts the other short, and passes on
/// the first exception of a body. Loops and reductions ask for cancellation once per chunk unless they say otherwise.
/// Ranges of one grain or less stay on the calling thread. A grain is at least 1.
namespace Nexil::parallel {

/// How many threads a loop started here may run on, for who keeps a table per thread. Results must not depend on it.
[[nodiscard]] inline std::size_t threadCount()
{
    auto const allowed = tbb::global_control::active_value(tbb::global_control::max_allowed_parallelism);
    return std::min(allowed, static_cast<std::size_t>(std::max(1, tbb::this_task_arena::max_concurrency())));
}

/// Calls body(begin, end) over disjoint chunks that cover [0, count), and does not ask for cancellation: for loops that
/// leave their target half changed when they are cut short, and are done in a blink. Where the cuts lie depends on the
/// schedule, so the body's results must not depend on them.
template <class Body>
void forRangeToTheEnd(std::size_t count, std::size_t grain, Body const& body)
{
    if (count == 0)
        return;
    if (count <= grain) {
        body(std::size_t(0), count);
        return;
    }
#if defined(NEXIL_PARALLEL_ON_PLAIN_THREADS)
    PlainThreads::forRange(0, count, grain, PlainThreads::threadCount(), body);
#else
    tbb::task_group_context context(tbb::task_group_context::isolated);
    tbb::parallel_for(
        tbb::blocked_range<std::size_t>(0, count, grain),
        [&body](tbb::blocked_range<std::size_t> const& range) { body(range.begin(), range.end()); },
        tbb::auto_partitioner(), context);
#endif
}

/// The same, asking for cancellation once per chunk.
template <class Body>
void forRange(std::size_t count, std::size_t grain, Body const& body)
{
    forRangeToTheEnd(count, grain, [&body](std::size_t begin, std::size_t end) {
        Nexil::Internal::throwIfJobCancelled();
        body(begin, end);
    });
}

/// Runs both, one beside the other where a thread is free; the second one on the calling thread. While a thread waits for
/// the other side it takes work of these two sides only, so that calls nested in each other need no more stack than their
/// nesting.
template <class First, class Second>
void invoke(First const& first, Second const& second)
{
#if defined(NEXIL_PARALLEL_ON_PLAIN_THREADS)
    PlainThreads::runBoth(second, first);
#else
    tbb::task_group_context context(tbb::task_group_context::isolated);
    tbb::this_task_arena::isolate([&] { tbb::parallel_invoke(first, second, context); });
#endif
}

/// Joins the results of chunk(begin, end, identity) by unite(left, right): one value for every thread count.
///
/// [0, count) is halved until no range is longer than `grain`, and results are joined along the same halvings, the left
/// one first, so `unite` needs to be neither commutative nor exactly associative. `identity` where count is 0.
template <class Value, class Chunk, class Unite>
[[nodiscard]] Value reduceInOrder(std::size_t count, std::size_t grain, Value const& identity, Chunk const& chunk,
                                  Unite const& unite)
{
    if (count == 0)
        return identity;
#if defined(NEXIL_PARALLEL_ON_PLAIN_THREADS)
    return PlainThreads::reduceInOrder(0, count, grain, PlainThreads::threadCount(), identity, chunk, unite);
#else
    tbb::task_group_context context(tbb::task_group_context::isolated);
    return tbb::parallel_deterministic_reduce(
        tbb::blocked_range<std::size_t>(0, count, grain), identity,
        [&](tbb::blocked_range<std::size_t> const& range, Value value) {
            Nexil::Internal::throwIfJobCancelled();
            return chunk(range.begin(), range.end(), std::move(value));
        },
        unite, tbb::simple_partitioner(), context);
#endif
}

/// Sorts [first, last). Not stable: the order must be total, or equal elements indistinguishable.
template <class Iterator, class Less>
void sort(Iterator first, Iterator last, Less const& less)
{
#if defined(NEXIL_PARALLEL_ON_PLAIN_THREADS)
    std::sort(first, last, less);
#else
    tbb::task_group_context context(tbb::task_group_context::isolated);
    // tbb::parallel_sort takes no context; a loop of one task lends it this one.
    tbb::parallel_for(
        0, 1, [&](int) { tbb::parallel_sort(first, last, less); }, tbb::simple_partitioner(), context);
#endif
}

} // namespace Nexil::parallel
