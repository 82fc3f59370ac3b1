#include <support/Environment.h>
#include <support/Streams.h>

#include <gtest/gtest.h>

#include <algorithm>
#include <filesystem>

namespace {

namespace fs = std::filesystem;

constexpr char kChunkLimit[] = "VELDRIN_MAX_SERIALIZATION_ARRAY_SIZE";

std::vector<fs::path> filesIn(char const* folder)
{
    std::vector<fs::path> files;
    for (auto const& entry : fs::directory_iterator(std::string(VELDRIN_TEST_CORPUS "/streams/") + folder))
        if (entry.path().extension() == ".zon")
            files.push_back(entry.path());
    std::sort(files.begin(), files.end());
    return files;
}

int countOf(std::string const& part, std::string const& text)
{
    int count = 0;
    for (auto at = text.find(part); at != std::string::npos; at = text.find(part, at + 1))
        ++count;
    return count;
}

// The second reader tells whether what is read is what stands beside each stream.
TEST(StreamCorpus, EveryGoodStreamIsWrittenAndReadBackTheSame)
{
    auto const files = filesIn("valid");
    ASSERT_GT(files.size(), 30u);
    for (auto file : files) {
        auto const result = support::read(support::fileBytes(file.string()));
        EXPECT_TRUE(result.isRead) << file << testing::PrintToString(result.errors);
        for (int const level : {0, 1, 9})
            for (char const* limit : {"1", "1000", "99999999999999999999"}) {
                support::EnvironmentVariable const variable(kChunkLimit, limit);
                auto const again = support::read(support::written(result.objects, level));
                EXPECT_TRUE(again.isRead) << file;
                EXPECT_EQ(support::contentOf(again.objects), support::contentOf(result.objects)) << file;
            }
        // Of the components of volumes, those that are no proxies are damaged, which is warned about.
        auto const kept = support::fileBytes(file.replace_extension(".json").string());
        EXPECT_EQ(result.warnings.empty(), countOf("\"vld_component\"", kept) == countOf("\"proxy\"", kept)) << file;
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
    EXPECT_EQ(rows, filesIn("bad").size());
}

TEST(StreamCorpus, TheWriterGivesTheKeptBytes)
{
    struct Case {
        char const* name;
        char const* limit;
    };
    // The page that describes the format takes v6_walk apart byte by byte.
    // What is no number, or none above 0, means chunks of one byte.
    Case const cases[] = {{"v6_walk", "99999999999999999999"},   {"v6_every_type_level0", "4800"},
                          {"v6_volume_shared", "4800"},          {"v6_many_entries", "4800"},
                          {"v6_chunks_1000_level0", " \t1000x"}, {"v6_chunks_1000_level0", "+1000"},
                          {"v6_chunks_bytes_level0", "-5"},      {"v6_chunks_bytes_level0", "many"}};
    for (Case const& c : cases) {
        support::EnvironmentVariable const variable(kChunkLimit, c.limit);
        auto const kept = support::fileBytes(VELDRIN_TEST_CORPUS "/streams/valid/" + std::string(c.name) + ".zon");
        EXPECT_EQ(support::written(support::read(kept).objects, 0), kept) << c.name << " '" << c.limit << "'";
    }
}

} // namespace
