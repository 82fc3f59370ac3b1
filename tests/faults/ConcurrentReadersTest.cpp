#include "Operations.h"

#include <veldrin/geometry/Prototypes.h>

#include <gtest/gtest.h>

#include <atomic>
#include <cstdio>
#include <fstream>
#include <thread>

namespace {

using support::Sample;

TEST(ConcurrentReaders, EightThreadsRunEveryFunctionSideBySide)
{
    Sample sample;
    sample.path = ::testing::TempDir() + "concurrent_readers.zon";
    std::ofstream(sample.path, std::ios::binary) << sample.stream;
    auto const before = sample.description();
    std::vector<std::string> expected;
    for (auto const& operation : support::operations())
        expected.push_back(operation.run(sample));

    for (int round = 0; round < 3; ++round) {
        // The first question of a round builds the registry, from whichever thread it comes.
        Veldrin::Geometry::clearGeometryPrototypes();
        std::atomic<unsigned int> differences = 0;
        std::vector<std::thread> readers;
        for (std::size_t reader = 0; reader < 8; ++reader)
            readers.emplace_back([&, reader] {
                auto const& all = support::operations();
                // Each begins elsewhere, so that different functions run side by side.
                for (std::size_t i = 0; i < all.size(); ++i) {
                    auto const at = (i + reader * 5) % all.size();
                    if (all[at].run(sample) != expected[at])
                        ++differences;
                }
            });
        for (auto& reader : readers)
            reader.join();
        EXPECT_EQ(differences, 0u);
    }
    EXPECT_EQ(sample.description(), before);
    std::remove(sample.path.c_str());
}

} // namespace
