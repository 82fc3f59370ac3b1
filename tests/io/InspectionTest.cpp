#include <support/Streams.h>

#include <veldrin/io/StreamInspection.h>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cstdio>
#include <filesystem>

namespace {

using Veldrin::IO::StreamLayout;

std::string kept(char const* name)
{
    return support::fileBytes(std::string(VELDRIN_TEST_CORPUS "/streams/valid/") + name + ".zon");
}

/// Inspects a file of these bytes; tells the fault, "" where there is none.
std::string inspect(std::string const& bytes, StreamLayout& layout)
{
    std::string const path =
        testing::TempDir() + testing::UnitTest::GetInstance()->current_test_info()->name() + ".zon";
    std::ofstream(path, std::ios::binary) << bytes;
    support::Messages messages;
    bool const isInspected = Veldrin::IO::inspectStream(path.c_str(), layout, &messages);
    std::remove(path.c_str());
    EXPECT_EQ(messages.heard.size(), isInspected ? 0u : 1u);
    return isInspected ? "" : messages.errors().at(0);
}

/// The layout as text: version, level, whether it has hashes, then position, size, role, type and state of each entry.
std::string told(std::string const& bytes)
{
    StreamLayout layout;
    auto const fault = inspect(bytes, layout);
    if (!fault.empty())
        return fault;
    EXPECT_EQ(layout.byteCount, bytes.size());
    std::ostringstream text;
    text << std::hex << layout.version << ' ' << layout.compressionLevel << ' ' << layout.hasHashes;
    for (auto const& e : layout.entries)
        text << " | " << e.position << ' ' << e.byteCount << ' ' << static_cast<int>(e.role) << ' ' << e.typeCode << ' '
             << e.isIntact;
    return text.str();
}

TEST(StreamInspection, TellsEveryEntryAndWhichOneIsDamaged)
{
    std::string const walk = kept("v6_walk");
    std::string damaged = walk;
    damaged[0x6F] = static_cast<char>(damaged[0x6F] ^ 1);
    // The positions of the walk through this file that the format's page takes.
    EXPECT_EQ(told(walk), "6 0 1 | 70 f 1 16a 1 | 5b 15 0 7a 1");
    EXPECT_EQ(told(damaged), "6 0 1 | 70 f 1 16a 1 | 5b 15 0 7a 0");
    EXPECT_EQ(told(kept("v3")), "3 9 0");
    EXPECT_EQ(told(kept("v5")), "5 0 0 | 70 f 1 16a 1 | 7f 5 1 16a 1 | 70 f 1 16a 1 | 5b 15 0 7a 1");
    EXPECT_EQ(told(walk.substr(0, 85)), "Corrupt stream header");
    EXPECT_EQ(told(walk + "\x01"), "Corrupt handles");
    EXPECT_EQ(told(kept("../bad/table_position_at_table")), "Corrupt handles");
    EXPECT_EQ(told(kept("../bad/table_role_3")), "6 0 1 | 5b a 3 16a 0");
    EXPECT_EQ(told(""), "Unknown msgpack error occurred");
}

TEST(StreamInspection, StaysInsideOfDamagedStreamsAndFindsNoFaultInReadableOnes)
{
    for (auto const& file : std::filesystem::recursive_directory_iterator(VELDRIN_TEST_CORPUS "/streams")) {
        if (file.path().extension() != ".zon")
            continue;
        auto const bytes = support::fileBytes(file.path().string());
        bool const isReadable = support::read(bytes).isRead;
        StreamLayout layout;
        EXPECT_TRUE(inspect(bytes, layout).empty() || !isReadable) << file;
        for (auto const& entry : layout.entries) {
            EXPECT_LE(entry.position + entry.byteCount, bytes.size()) << file;
            EXPECT_TRUE(!isReadable || (entry.isIntact && entry.typeCode < 370)) << file;
        }
    }
}

} // namespace
