#include <support/Geometry.h>
#include <support/Streams.h>
#include <volume/Samples.h>

#include <veldrin/object/Properties.h>
#include <veldrin/volume/VldProxyComponentTopology.h>
#include <veldrin/volume/VolumeConversion.h>
#include <vld/BuildFromValues.h>

#include <gtest/gtest.h>

#include <filesystem>
#include <malloc.h>
#include <random>
#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

namespace {

std::string valid(std::string const& name)
{
    return support::fileBytes(VELDRIN_TEST_CORPUS "/streams/valid/" + name + ".zon");
}

/// Small streams of both kinds of chunks that together hold sharing, repeated and null slots, handles, every framing.
std::vector<std::string> sweptStreams()
{
    std::vector<std::string> streams;
    for (char const* name : {"v6_walk", "v6_slots", "v6_slot_in_slot", "v6_handles", "v6_handles_level9", "v6_empty",
                             "v6_shared_everywhere", "v6_names"})
        for (int const level : {0, 9}) {
            auto const objects = support::read(valid(name)).objects;
            streams.push_back(support::written(objects, level));
        }
    // Points and voxels in one tile each, with damage that the sweep may reach before the checksum tells of it.
    auto volume = VLD::createObject();
    Nexil::Array<VLD::TileTree3D::Coordinate> const voxel{{-3, 0, 5}};
    VLD::TileTree3D::buildFromVoxels<VLD::TileTree3D::SmallTiles>({.channelName = "density"}, voxel,
                                                                  Nexil::Array<unsigned char>{7}, '\0')
        .addTo(*volume);
    support::addPoints<VLD::TileTree3D::SmallTiles>(*volume);
    Nexil::Ptr<Veldrin::Object> const geometry = Veldrin::Geometry::move_vld_volume_to_object(*volume);
    for (int const level : {0, 9})
        streams.push_back(support::written({geometry}, level));
    streams.push_back(valid("v6_handles"));
    streams.push_back(valid("v6_handles_level9"));
    return streams;
}

TEST(HostileStream, NoBeginningAndNoFlippedByteIsReadAsSomethingElse)
{
    std::string const nothing = support::contentOf({});
    for (std::string const& stream : sweptStreams()) {
        std::string const original = support::contentOf(support::read(stream).objects);
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
                EXPECT_EQ(support::contentOf(result.objects), result.isRead ? original : nothing) << flip;
            }
        }
    }
}

TEST(HostileStream, AChunkThatGrowsBetweenTwoLooksStaysWithinItsArray)
{
    /// A file that somebody else writes to: a byte grows after some looks at it.
    class Changing : public std::stringbuf {
    public:
        Changing(std::string const& bytes, std::size_t at, int looks)
            : std::stringbuf(bytes, std::ios::in), at_(at), looks_(looks)
        {
        }

    protected:
        std::streamsize xsgetn(char* target, std::streamsize count) override
        {
            auto const from = static_cast<std::size_t>(gptr() - eback());
            std::streamsize const got = std::stringbuf::xsgetn(target, count);
            if (at_ >= from && at_ < from + static_cast<std::size_t>(got) && looks_-- <= 0)
                ++target[at_ - from];
            return got;
        }

    private:
        std::size_t at_;
        int looks_;
    };
    // Eight equal bytes, then eight that follow no rule, so that it shrinks to half.
    std::vector<unsigned char> values(300000);
    std::mt19937 random(1);
    for (std::size_t i = 0; i < values.size(); ++i)
        values[i] = i % 16 < 8 ? 0 : static_cast<unsigned char>(random());
    auto object = Veldrin::createObject();
    Veldrin::setProperty(*object, "values", support::array(values));
    std::string bytes = support::written({Nexil::Ptr<Veldrin::Object>(std::move(object))}, 1);
    // In version 5, which has no checksums, an array and its only chunk that pretend to be 65536 bytes shorter.
    bytes[bytes.find("file_version") + 14] = 5;
    std::size_t const count = bytes.find(std::string("\xCE\x00\x04\x93\xE0", 5));
    std::size_t const declaredSize = bytes.find(std::string("\xE0\x93\x04\x00", 4));
    ASSERT_LT(count, declaredSize);
    ASSERT_NE(declaredSize, std::string::npos);
    bytes[count + 2] = 3;
    bytes[declaredSize + 2] = 3;
    for (int looks = 0; looks < 4; ++looks) {
        Changing buffer(bytes, declaredSize + 2, looks);
        std::istream stream(&buffer);
        Nexil::InputStream input(stream);
        support::Objects out;
        support::Messages messages;
        EXPECT_FALSE(Veldrin::IO::deserialize(input, out, {}, &messages)) << looks;
        EXPECT_EQ(messages.errors().size(), 1u) << looks;
    }
}

#if defined(__SANITIZE_ADDRESS__) || defined(__SANITIZE_THREAD__)
constexpr bool kMeasuresMemory = false; // the sanitizer's own shadow would be measured
#else
constexpr bool kMeasuresMemory = true;
#endif

/// Whether a process of its own, with what it has before, reads the bytes in 300 times their size and 64 MiB.
bool isReadModestly(std::string const& bytes)
{
    auto const peakKibibytes = [] {
        rusage usage{};
        getrusage(RUSAGE_SELF, &usage);
        return static_cast<std::uint64_t>(usage.ru_maxrss);
    };
    malloc_trim(0); // what was given back must not serve the child
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

/// A stream of topologies that share the one array of places by which each finds its tiles, small and wide ones in turn.
std::string tilesOfBothKindsInTurn()
{
    using namespace VLD::TileTree3D;
    using Places = Nexil::Array<Coordinate>;
    using Numbers = Nexil::Array<unsigned int>;
    Places places;
    for (int i = 0; i < 300000; ++i)
        places.push_back({0, i / 1000 * 200, i % 1000 * 200}); // where tiles of either kind begin
    SharedTileLevels levels{nullptr, Nexil::makePtr<Numbers>(), Nexil::makePtr<Places>(std::move(places)), nullptr};
    auto geometry = Veldrin::createObject();
    for (int i = 0; i < 40; ++i)
        Veldrin::setProperty(*geometry, std::to_string(i).c_str(), i); // keeps the place of what comes
    auto add = [&]<class Traits>(Traits, int number) {
        Numbers children;
        children.resize(levels.innerOrigins->size() * Traits::kInnerCells);
        std::fill(children.begin(), children.end(), kNoTile);
        levels.innerChildren = Nexil::makePtr<Numbers>(std::move(children));
        Nexil::Ptr<VoxelTopology<Traits>> topology;
        for (; number < 40; number += 2) {
            levels.leafOrigins = Nexil::makePtr<Places>(); // empty, but another array each time
            topology = topology ? VoxelTopology<Traits>::create("t", levels, *topology)
                                : VoxelTopology<Traits>::create("t", levels);
            Veldrin::setProperty(
                *geometry, std::to_string(number).c_str(),
                Nexil::Ptr<Veldrin::Object>(Nexil::makePtr<Veldrin::Geometry::VldProxyComponentTopology>(topology)));
        }
    };
    add(SmallTiles(), 0);
    add(WideTiles(), 1);
    return support::written({Nexil::Ptr<Veldrin::Object>(std::move(geometry))}, 9);
}

TEST(HostileStream, NoStreamTakesMuchMoreMemoryThanItsSize)
{
    if (!kMeasuresMemory)
        GTEST_SKIP() << "memory is measured in builds without sanitizers";
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
    std::vector<std::pair<std::string, std::string>> const dense{
        {"empty objects", old(list("\xCD\x01\x6B", "\x90"))},
        {"empty strings", old(list("\xCC\x83", "\xA0"))},
        {"empty arrays", old(list("\xCC\xF2", std::string("\x92\x00\x90", 3)))},
        {"null pointers", old(list("\xCC\xF2", "\xC0"))},
        {"tiles in turn", tilesOfBothKindsInTurn()}};
    for (auto const& [name, bytes] : dense) {
        EXPECT_TRUE(isReadModestly(bytes)) << name;
        EXPECT_TRUE(support::read(bytes).isRead) << name;
    }
}

} // namespace
