#include <support/Streams.h>

#include <veldrin/io/StreamInspection.h>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cstdio>
#include <filesystem>

namespace {

using Veldrin::IO::StreamEntry;
using Veldrin::IO::StreamLayout;

std::string kept(char const* name)
{
    return support::fileBytes(std::string(VELDRIN_TEST_CORPUS "/streams/valid/") + name + ".zon");
}

/// Puts the bytes into a file and inspects that.
bool inspect(std::string const& bytes, StreamLayout& layout, support::Messages& messages)
{
    std::string const path =
        testing::TempDir() + testing::UnitTest::GetInstance()->current_test_info()->name() + ".zon";
    std::ofstream(path, std::ios::binary) << bytes;
    bool const isInspected = Veldrin::IO::inspectStream(path.c_str(), layout, &messages);
    std::remove(path.c_str());
    return isInspected;
}

TEST(StreamInspection, TellsEveryEntryAndWhichOneIsDamaged)
{
    std::string bytes = kept("v6_walk");
    support::Messages messages;
    StreamLayout layout;
    ASSERT_TRUE(inspect(bytes, layout, messages));
    EXPECT_EQ(layout.version, 6u);
    EXPECT_EQ(layout.compressionLevel, 0);
    EXPECT_EQ(layout.byteCount, bytes.size());
    ASSERT_EQ(layout.entries.size(), 2u);
    // The positions of the walk through this file that the format's page takes.
    EXPECT_EQ(layout.entries[0].position, 0x70u);
    EXPECT_EQ(layout.entries[0].byteCount, 0xFu);
    EXPECT_EQ(layout.entries[0].role, StreamEntry::Role::TopLevel);
    EXPECT_EQ(layout.entries[0].typeCode, 362u);
    EXPECT_EQ(layout.entries[1].position, 0x5Bu);
    EXPECT_EQ(layout.entries[1].role, StreamEntry::Role::Shared);
    EXPECT_EQ(layout.entries[1].typeCode, 122u);
    EXPECT_TRUE(layout.entries[0].isIntact && layout.entries[1].isIntact);

    bytes[0x6F] = static_cast<char>(bytes[0x6F] ^ 1);
    ASSERT_TRUE(inspect(bytes, layout, messages));
    EXPECT_TRUE(layout.entries[0].isIntact);
    EXPECT_FALSE(layout.entries[1].isIntact);
    EXPECT_TRUE(messages.heard.empty());
}

TEST(StreamInspection, KnowsOlderVersionsAndRefusesWhatHasNoTable)
{
    support::Messages messages;
    StreamLayout layout;
    ASSERT_TRUE(inspect(kept("v3"), layout, messages));
    EXPECT_EQ(layout.version, 3u);
    EXPECT_TRUE(layout.entries.empty());
    ASSERT_TRUE(inspect(kept("v5"), layout, messages));
    EXPECT_FALSE(layout.hasHashes);
    EXPECT_GT(layout.entries.size(), 0u);

    EXPECT_FALSE(inspect(kept("v6_walk").substr(0, 85), layout, messages));
    EXPECT_FALSE(inspect(kept("v6_walk") + "\x01", layout, messages));
    EXPECT_FALSE(inspect("", layout, messages));
    EXPECT_THAT(messages.errors(),
                testing::ElementsAre("Corrupt stream header", "Corrupt handles", "Unknown msgpack error occurred"));
    EXPECT_EQ(layout.version, 5u);
}

TEST(StreamInspection, StaysInsideOfDamagedStreamsAndFindsNoFaultInReadableOnes)
{
    for (auto const& file : std::filesystem::recursive_directory_iterator(VELDRIN_TEST_CORPUS "/streams")) {
        if (file.path().extension() != ".zon")
            continue;
        auto const bytes = support::fileBytes(file.path().string());
        bool const isReadable = support::read(bytes).isRead;
        support::Messages messages;
        StreamLayout layout;
        bool const isInspected = inspect(bytes, layout, messages);
        EXPECT_TRUE(isInspected || !isReadable) << file;
        EXPECT_EQ(messages.errors().size(), isInspected ? 0u : 1u) << file;
        for (auto const& entry : layout.entries) {
            EXPECT_LE(entry.position + entry.byteCount, bytes.size()) << file;
            EXPECT_TRUE(!isReadable || (entry.isIntact && entry.typeCode < 370)) << file;
        }
    }
}

} // namespace
