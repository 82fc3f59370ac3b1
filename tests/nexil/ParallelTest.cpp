#include <nexil/parallel/Parallel.h>
#include <support/Cancellation.h>
#include <support/Threads.h>

#include <gmock/gmock.h>

#include <stdexcept>
#include <string>
#include <vector>

namespace {

namespace parallel = Nexil::parallel;

/// What [begin, end) gives when it is halved down to ranges of 10: each join in brackets, with the indices in order.
std::string joinsOf(std::size_t begin, std::size_t end)
{
    if (end - begin <= 10)
        return std::to_string(begin) + '-' + std::to_string(end);
    auto const middle = begin + (end - begin) / 2;
    return '(' + joinsOf(begin, middle) + ' ' + joinsOf(middle, end) + ')';
}

TEST(Parallel, AReductionJoinsInOneOrderOnEveryThreadCount)
{
    support::onThreadCounts([] {
        for (std::size_t const count : {0u, 1u, 9u, 10u, 11u, 21u, 1003u}) {
            auto const joins = parallel::reduceInOrder(
                count, 10, std::string(),
                [](std::size_t begin, std::size_t end, std::string const& identity) {
                    return identity + std::to_string(begin) + '-' + std::to_string(end);
                },
                [](std::string const& left, std::string const& right) { return '(' + left + ' ' + right + ')'; });
            EXPECT_EQ(joins, count == 0 ? "" : joinsOf(0, count));
        }
    });
}

TEST(Parallel, ExceptionsAndCancellationLeaveTheCall)
{
    auto const loop = [](std::size_t count) { parallel::forRange(count, 10, [](std::size_t, std::size_t) {}); };
    auto const reduce = [](std::size_t count) {
        (void)parallel::reduceInOrder(
            count, 10, 0, [](std::size_t, std::size_t, int sum) { return sum; }, [](int a, int b) { return a + b; });
    };
    auto const isCancellation = testing::ThrowsMessage<std::runtime_error>("Job cancelled");
    support::onThreadCounts([&] {
        for (std::size_t const count : {std::size_t(5), std::size_t(1000)}) {
            for (int const questionCount : {0, count == 5 ? 0 : 3}) {
                support::CancelAfter const cancel(questionCount);
                EXPECT_THAT([&] { loop(count); }, isCancellation);
                EXPECT_THAT([&] { reduce(count); }, isCancellation);
                EXPECT_NO_THROW(parallel::forRangeToTheEnd(count, 10, [](std::size_t, std::size_t) {}));
            }
            EXPECT_NO_THROW(loop(count));
            auto const fail = [&](std::size_t begin, std::size_t end) {
                if (begin <= count / 2 && count / 2 < end)
                    throw std::invalid_argument("the middle");
            };
            EXPECT_THAT([&] { parallel::forRange(count, 10, fail); },
                        testing::ThrowsMessage<std::invalid_argument>("the middle"));
        }
    });
}

TEST(Parallel, AFailureInsideIsPassedOnAndCutsNothingElseShort)
{
    auto const fail = [] { throw std::invalid_argument("inside"); };
    support::onThreadCounts([&] {
        std::vector<int> visits(300);
        parallel::forRange(visits.size(), 1, [&](std::size_t begin, std::size_t end) {
            EXPECT_THROW(parallel::forRange(50, 1, [&](std::size_t, std::size_t) { fail(); }), std::invalid_argument);
            EXPECT_THROW(parallel::invoke(fail, [] {}), std::invalid_argument);
            EXPECT_THROW(parallel::invoke([] {}, fail), std::invalid_argument);
            for (std::size_t i = begin; i < end; ++i)
                ++visits[i];
        });
        EXPECT_THAT(visits, testing::Each(1));
    });
}

} // namespace
