#include "Operations.h"

#include <veldrin/geometry/Prototypes.h>

#include <gtest/gtest.h>

#include <atomic>
#include <thread>

namespace {

using support::Sample;

TEST(ConcurrentReaders, EightThreadsRunEveryFunctionSideBySide)
{
    Sample const sample;
    auto const before = sample.description();
    for (int round = 0; round < 3; ++round) {
        // The first question of a round builds the registry, from whichever thread it comes.
        Veldrin::Geometry::clearGeometryPrototypes();
        std::atomic<unsigned int> failures = 0;
        std::vector<std::thread> readers;
        for (std::size_t reader = 0; reader < 8; ++reader)
            readers.emplace_back([&, reader] {
                auto const& all = support::operations();
                // Each begins elsewhere, so that different functions run side by side.
                for (std::size_t i = 0; i < all.size(); ++i)
                    if (!all[(i + reader * 5) % all.size()].run(sample))
                        ++failures;
            });
        for (auto& reader : readers)
            reader.join();
        EXPECT_EQ(failures, 0u);
    }
    EXPECT_EQ(sample.description(), before);
}

} // namespace
