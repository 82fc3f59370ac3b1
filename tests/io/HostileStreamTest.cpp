#include <support/Geometry.h>
#include <support/StreamDescription.h>
#include <support/Streams.h>
#include <volume/Samples.h>

#include <veldrin/volume/VolumeConversion.h>
#include <vld/BuildFromValues.h>

#include <gtest/gtest.h>

#include <filesystem>
#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

namespace {

std::string valid(std::string const& name)
{
    return support::fileBytes(VELDRIN_TEST_CORPUS "/streams/valid/" + name + ".zon");
}

/// Small streams of both kinds of chunks that together hold sharing, repeated and null slots, handles, every framing, and a
/// volume, of whose damage its own checks may tell before the checksum does.
std::vector<std::string> sweptStreams()
{
    std::vector<std::string> streams{valid("v6_handles"), valid("v6_handles_level9")};
    auto volume = VLD::createObject();
    Nexil::Array<VLD::TileTree3D::Coordinate> const voxel{{-3, 0, 5}};
    VLD::TileTree3D::buildFromVoxels<VLD::TileTree3D::SmallTiles>({.channelName = "density"}, voxel,
                                                                  Nexil::Array<unsigned char>{7}, '\0')
        .addTo(*volume);
    support::addPoints<VLD::TileTree3D::SmallTiles>(*volume);
    std::vector<support::Objects> kept{{Veldrin::Geometry::move_vld_volume_to_object(*volume)}};
    for (char const* name : {"v6_walk", "v6_slots", "v6_slot_in_slot", "v6_empty", "v6_shared_everywhere", "v6_names"})
        kept.push_back(support::read(valid(name)).objects);
    for (auto const& objects : kept)
        for (int const level : {0, 9})
            streams.push_back(support::written(objects, level));
    return streams;
}

TEST(HostileStream, NoBeginningAndNoFlippedByteIsReadAsSomethingElse)
{
    for (std::string const& stream : sweptStreams()) {
        std::string const original = support::describeObjects(support::read(stream).objects);
        for (std::size_t at = 0; at < stream.size(); ++at) {
            SCOPED_TRACE(std::to_string(at) + " of " + std::to_string(stream.size()));
            auto const beginning = support::read(stream.substr(0, at));
            EXPECT_FALSE(beginning.isRead);
            EXPECT_EQ(beginning.errors.size(), 1u);
            for (int const flip : {0x01, 0x02, 0x04, 0x08, 0x10, 0x20, 0x40, 0x80, 0xFF}) {
                std::string flipped = stream;
                flipped[at] = static_cast<char>(flipped[at] ^ flip);
                auto const result = support::read(flipped);
                // A refusal says why in one message, or nothing when the version reads as 0.
                EXPECT_LE(result.errors.size(), result.isRead ? 0u : 1u) << flip;
                EXPECT_EQ(support::describeObjects(result.objects), result.isRead ? original : "]}\n") << flip;
            }
            // Without checksums, as version 5, damage goes as deep as the compressor.
            std::string unchecked = stream;
            unchecked[stream.find("file_version") + 14] = 5;
            unchecked[at] = static_cast<char>(unchecked[at] ^ 0x15);
            auto const result = support::read(unchecked);
            EXPECT_LE(result.errors.size() + result.objects.size() * !result.isRead, result.isRead ? 0u : 1u);
        }
    }
}

/// Whether a process of its own, with what it has before, reads the bytes in 300 times their size and 64 MiB.
bool isReadModestly(std::string const& bytes)
{
    auto const peakKibibytes = [] {
        rusage usage{};
        getrusage(RUSAGE_SELF, &usage);
        return static_cast<std::uint64_t>(usage.ru_maxrss);
    };
    pid_t const child = fork();
    if (child == 0) {
        auto const before = peakKibibytes();
        support::read(bytes);
        _exit(peakKibibytes() - before <= 300 * bytes.size() / 1024 + 64 * 1024 ? 0 : 1);
    }
    int status = 1;
    waitpid(child, &status, 0);
    return status == 0;
}

TEST(HostileStream, NoStreamTakesMuchMoreMemoryThanItsSize)
{
#if defined(__SANITIZE_ADDRESS__) || defined(__SANITIZE_THREAD__)
    GTEST_SKIP() << "the sanitizer's own memory would be measured";
#endif
    for (auto const& entry : std::filesystem::directory_iterator(VELDRIN_TEST_CORPUS "/streams/bad"))
        EXPECT_TRUE(isReadModestly(support::fileBytes(entry.path()))) << entry;

    // What expands most: a million of the smallest values, in the old form that needs no checksum.
    std::string const header = valid("v2");
    auto const headerSize = header.find("compression_level") + 17 + 3;
    auto old = [&](std::string const& values) { return header.substr(0, headerSize) + values; };
    auto list = [](char const* code, std::string const& element) {
        std::string bytes = std::string("\x92\xA1p\x92", 4) + code + std::string("\xDD\x00\x0F\x42\x40", 5);
        for (int i = 0; i < 1000000; ++i)
            bytes += element;
        return bytes;
    };
    std::pair<char const*, std::string> const dense[] = {
        {"empty objects", old(list("\xCD\x01\x6B", "\x90"))},
        {"empty strings", old(list("\xCC\x83", "\xA0"))},
        {"empty arrays", old(list("\xCC\xF2", std::string("\x92\x00\x90", 3)))},
        {"null pointers", old(list("\xCC\xF2", "\xC0"))}};
    for (auto const& [name, bytes] : dense) {
        EXPECT_TRUE(support::read(bytes).isRead) << name;
        EXPECT_TRUE(isReadModestly(bytes)) << name;
    }
}

} // namespace
