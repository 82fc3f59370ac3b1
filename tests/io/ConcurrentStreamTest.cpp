#include <support/StreamDescription.h>
#include <support/Streams.h>

#include <gtest/gtest.h>

#include <thread>

namespace {

TEST(ConcurrentStreams, ThreadsWriteOneGraphAndReadTheirOwnCopies)
{
    auto const kept = support::read(support::fileBytes(VELDRIN_TEST_CORPUS "/streams/valid/v6_many_entries.zon"));
    ASSERT_GT(kept.objects.size(), 0u);
    std::string const expected = support::describeObjects(kept.objects);
    std::vector<std::string> found(4);
    std::vector<std::thread> threads;
    for (std::size_t i = 0; i < found.size(); ++i)
        threads.emplace_back([&, i] {
            for (int round = 0; round < 5; ++round)
                found[i] = support::describeObjects(
                    support::read(support::written(kept.objects, round % 2 == 0 ? 0 : 9)).objects);
        });
    for (auto& thread : threads)
        thread.join();
    for (auto const& text : found)
        EXPECT_EQ(text, expected);
}

} // namespace
