#include <nexil/Array.h>
#include <nexil/Ptr.h>

#include <gmock/gmock.h>

#include <barrier>
#include <numeric>
#include <thread>
#include <vector>

namespace {

using Nexil::MutablePtr;
using Nexil::Ptr;

constexpr std::size_t kThreadCount = 4;
constexpr int kRoundCount = 500;

template <class Body>
void onAllThreads(Body const& body)
{
    std::vector<std::jthread> threads;
    for (std::size_t t = 0; t < kThreadCount; ++t)
        threads.emplace_back([&body, t] { body(t); });
}

/// Reads, when it is destroyed, what each holder wrote before it let go: a race unless the last drop sees all others.
struct Witness {
    std::vector<int> const* notes;
    int* sum;

    Witness(std::vector<int> const* n, int* s) : notes(n), sum(s) {}
    ~Witness() { *sum += std::accumulate(notes->begin(), notes->end(), 0); }
};

TEST(PtrThreads, TheLastOfManyHoldersDestroysOnceAndSeesWhatTheOthersDid)
{
    for (int round = 0; round < kRoundCount; ++round) {
        std::vector<int> notes(kThreadCount);
        int sum = 0;
        std::vector<Ptr<Witness>> held(kThreadCount, Nexil::makePtr<Witness>(&notes, &sum));
        onAllThreads([&](std::size_t t) {
            for (int i = 0; i < 20; ++i)
                std::vector<Ptr<Witness>> const copies(5, held[t]);
            notes[t] = 1;
            held[t].reset();
        });
        ASSERT_EQ(sum, static_cast<int>(kThreadCount));
    }
}

TEST(PtrThreads, WritersThatEachHoldACopyDoNotSeeEachOther)
{
    using Numbers = Nexil::Array<int>;
    constexpr int kNumberCount = 100;
    std::vector<Ptr<Numbers>> held(kThreadCount);
    std::barrier turn(kThreadCount);
    onAllThreads([&](std::size_t t) {
        for (int round = 0; round < kRoundCount; ++round) {
            if (t == 0) {
                auto fresh = Nexil::makeMutable<Numbers>();
                fresh->resize(kNumberCount);
                std::ranges::fill(*fresh, round);
                Ptr<Numbers> const shared(std::move(fresh));
                std::ranges::fill(held, shared);
            }
            turn.arrive_and_wait();
            // The last one takes the original over, and may write to it only when the others have made their copies.
            MutablePtr<Numbers> own(std::move(held[t]));
            EXPECT_EQ(std::ranges::count(*own, round), kNumberCount);
            std::ranges::fill(*own, -1 - static_cast<int>(t));
            held[t] = std::move(own);
            turn.arrive_and_wait();
            EXPECT_EQ(std::ranges::count(*held[t], -1 - static_cast<int>(t)), kNumberCount);
            turn.arrive_and_wait();
        }
    });
}

} // namespace
