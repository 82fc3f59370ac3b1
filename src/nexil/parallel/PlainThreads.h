#pragma once

// The task runtime is a shared library that ThreadSanitizer does not see into: it takes every hand-over between tasks
// for a race and would drown real ones. In builds under it, loops run on plain threads instead, whose starts and joins
// it does see; cuts and joins are the task runtime's, so results are the same bits.
#if defined(__SANITIZE_THREAD__)
#    define NEXIL_PARALLEL_ON_PLAIN_THREADS 1
#elif defined(__has_feature)
#    if __has_feature(thread_sanitizer)
#        define NEXIL_PARALLEL_ON_PLAIN_THREADS 1
#    endif
#endif

#if defined(NEXIL_PARALLEL_ON_PLAIN_THREADS)

#    include <nexil/JobCancel.h>

#    include <tbb/global_control.h>

#    include <cstddef>
#    include <exception>
#    include <thread>
#    include <utility>

namespace Nexil::parallel::PlainThreads {

/// As many as the task runtime would use, tests that limit it included.
[[nodiscard]] inline std::size_t threadCount()
{
    return tbb::global_control::active_value(tbb::global_control::max_allowed_parallelism);
}

/// Runs both, the second on a thread of its own; when both throw, the first one's exception is passed on.
template <class First, class Second>
void runBoth(First const& first, Second const& second)
{
    std::exception_ptr firstError;
    std::exception_ptr secondError;
    std::thread other([&] {
        try {
            second();
        } catch (...) {
            secondError = std::current_exception();
        }
    });
    try {
        first();
    } catch (...) {
        firstError = std::current_exception();
    }
    other.join();
    if (firstError)
        std::rethrow_exception(firstError);
    if (secondError)
        std::rethrow_exception(secondError);
}

template <class Body>
void forRange(std::size_t begin, std::size_t end, std::size_t grain, std::size_t threads, Body const& body)
{
    if (end - begin <= grain) {
        body(begin, end);
        return;
    }
    auto const middle = begin + (end - begin) / 2;
    auto const left = [&] { forRange(begin, middle, grain, threads - threads / 2, body); };
    auto const right = [&] { forRange(middle, end, grain, threads / 2, body); };
    if (threads > 1) {
        runBoth(left, right);
    } else {
        left();
        right();
    }
}

template <class Value, class Chunk, class Unite>
[[nodiscard]] Value reduceInOrder(std::size_t begin, std::size_t end, std::size_t grain, std::size_t threads,
                                  Value const& identity, Chunk const& chunk, Unite const& unite)
{
    if (end - begin <= grain) {
        Nexil::Internal::throwIfJobCancelled();
        return chunk(begin, end, identity);
    }
    auto const middle = begin + (end - begin) / 2;
    Value left = identity;
    Value right = identity;
    auto const reduceLeft = [&] {
        left = reduceInOrder(begin, middle, grain, threads - threads / 2, identity, chunk, unite);
    };
    auto const reduceRight = [&] { right = reduceInOrder(middle, end, grain, threads / 2, identity, chunk, unite); };
    if (threads > 1) {
        runBoth(reduceLeft, reduceRight);
    } else {
        reduceLeft();
        reduceRight();
    }
    return unite(std::move(left), std::move(right));
}

} // namespace Nexil::parallel::PlainThreads

#endif
