#include <lattix/DisjointSet.h>

#include <support/Labels.h>

#include <gtest/gtest.h>

#include <random>
#include <thread>
#include <vector>

namespace {

using Sets = Lattix::DisjointSet<unsigned int>;
using support::leastLabels;
using support::Pairs;

void expectSets(Sets& sets, std::vector<unsigned int> const& labels)
{
    std::vector<unsigned int> expectedRoots;
    for (unsigned int i = 0; i < labels.size(); ++i) {
        ASSERT_EQ(sets.find(i), labels[i]) << i;
        if (labels[i] == i)
            expectedRoots.push_back(i);
    }
    auto const roots = sets.TBBGetRoots();
    EXPECT_EQ(std::vector<unsigned int>(roots.begin(), roots.end()), expectedRoots);
    EXPECT_EQ(sets.rootCount(), expectedRoots.size());
}

Pairs randomPairs(unsigned int count, std::size_t pairCount, unsigned int seed)
{
    std::mt19937 random(seed);
    Pairs pairs(pairCount);
    for (auto& [a, b] : pairs) {
        a = static_cast<unsigned int>(random() % count);
        b = static_cast<unsigned int>(random() % count);
    }
    return pairs;
}

TEST(DisjointSet, SetsAreThoseOfTheLowestLabelsWhateverTheThreads)
{
    Sets nothing(0);
    expectSets(nothing, {});
    // Few sets, about half as many as elements, and one long chain from the top down.
    Pairs chain;
    for (unsigned int i = 30000; --i > 0;)
        chain.emplace_back(i, i - 1);
    for (auto const& pairs : {randomPairs(30000, 60000, 1), randomPairs(30000, 12000, 2), chain}) {
        auto const labels = leastLabels(30000, pairs);
        for (std::size_t const threadCount : {1u, 2u, 4u}) {
            Sets sets(30000);
            std::vector<std::thread> threads;
            for (std::size_t t = 0; t < threadCount; ++t)
                threads.emplace_back([&, t] {
                    for (std::size_t i = t; i < pairs.size(); i += threadCount)
                        sets.unite(pairs[i].first, pairs[i].second);
                });
            for (auto& thread : threads)
                thread.join();
            expectSets(sets, labels);
        }
    }
}

TEST(DisjointSet, LooseUnionsTellOnSeveralThreadsWhetherOneWasLost)
{
    auto const pairs = randomPairs(2000, 4000, 3);
    auto const labels = leastLabels(2000, pairs);
    // Sets that say that nothing was lost must be right as they are, others once all unions are made again. Locked unions
    // lose none, and neither do those of one thread.
    for (int round = 0; round < 200; ++round)
        for (bool const isLocked : {false, true}) {
            Sets sets(2000);
            std::uint64_t linkCounts[2] = {0, 0};
            auto const half = [&](std::size_t part) {
                std::uint64_t count = 0;
                for (std::size_t i = part; i < pairs.size(); i += 2) {
                    auto const [a, b] = pairs[i];
                    isLocked ? sets.parents().unite(a, b, count) : sets.parents().uniteLoosely(a, b, count);
                }
                linkCounts[part] = count;
            };
            bool const isAlone = round == 0;
            std::thread other(half, 1);
            if (isAlone)
                other.join();
            half(0);
            if (!isAlone)
                other.join();
            bool const isWhole = linkCounts[0] + linkCounts[1] == sets.size() - sets.rootCount();
            EXPECT_TRUE(isWhole || (!isLocked && !isAlone));
            if (!isWhole)
                for (auto const& [a, b] : pairs)
                    sets.unite(a, b);
            expectSets(sets, labels);
        }
}

} // namespace
