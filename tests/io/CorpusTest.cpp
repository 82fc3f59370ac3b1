#include <support/StreamDescription.h>
#include <support/Streams.h>

#include <gtest/gtest.h>

#include <algorithm>
#include <filesystem>

namespace {

namespace fs = std::filesystem;

std::vector<fs::path> filesIn(char const* folder, char const* extension)
{
    std::vector<fs::path> files;
    for (auto const& entry : fs::directory_iterator(std::string(VELDRIN_TEST_CORPUS "/streams/") + folder))
        if (entry.path().extension() == extension)
            files.push_back(entry.path());
    std::sort(files.begin(), files.end());
    return files;
}

/// The kept description without its first line, which tells of the header.
std::string keptObjects(fs::path path)
{
    std::string const text = support::fileBytes(path.replace_extension(".json").string());
    return text.substr(text.find('\n') + 1);
}

TEST(StreamCorpus, EveryGoodStreamGivesWhatStandsBesideItAndIsWrittenAndReadBackTheSame)
{
    auto const files = filesIn("valid", ".zon");
    ASSERT_GT(files.size(), 30u);
    for (auto const& file : files) {
        auto const result = support::read(support::fileBytes(file.string()));
        EXPECT_TRUE(result.isRead) << file << testing::PrintToString(result.errors);
        EXPECT_EQ(support::describeObjects(result.objects), keptObjects(file)) << file;
        for (int const level : {0, 1, 9}) {
            auto const again = support::read(support::written(result.objects, level));
            EXPECT_TRUE(again.isRead) << file;
            EXPECT_EQ(support::describeObjects(again.objects), keptObjects(file)) << file << " level " << level;
        }
    }
}

TEST(StreamCorpus, EveryBadStreamIsRefusedWithItsMessage)
{
    std::istringstream table(support::fileBytes(VELDRIN_TEST_CORPUS "/streams/bad/expected.tsv"));
    std::size_t rows = 0;
    for (std::string line; std::getline(table, line); ++rows) {
        auto const tab = line.find('\t');
        auto const name = line.substr(0, tab);
        auto const result = support::read(support::fileBytes(VELDRIN_TEST_CORPUS "/streams/bad/" + name));
        std::vector<std::string> expected;
        if (tab + 1 < line.size())
            expected.push_back(line.substr(tab + 1));
        EXPECT_FALSE(result.isRead) << name;
        EXPECT_EQ(result.errors, expected) << name;
        EXPECT_TRUE(result.objects.empty()) << name;
    }
    EXPECT_EQ(rows, filesIn("bad", ".zon").size());
}

TEST(StreamCorpus, TheWriterGivesTheBytesOfTheWalkThrough)
{
    // The page that describes the format takes this file apart byte by byte.
    std::string const kept = support::fileBytes(VELDRIN_TEST_CORPUS "/streams/valid/v6_walk.zon");
    EXPECT_EQ(support::written(support::read(kept).objects, 0), kept);
}

} // namespace
