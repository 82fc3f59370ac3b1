#include "Command.h"
#include "MeshArrays.h"
#include "TextInput.h"

#include <fmt/format.h>

#include <array>
#include <bit>
#include <cstring>
#include <unordered_map>

namespace Zon {

namespace {

    using Veldrin::Math::float3;

    constexpr std::size_t kBinaryHeaderSize = 84;
    constexpr std::size_t kFacetSize = 50;

    struct PositionBits {
        std::array<std::uint32_t, 3> bits;
        bool operator==(PositionBits const&) const = default;
    };

    struct PositionHash {
        std::size_t operator()(PositionBits const& position) const noexcept
        {
            std::uint64_t hash = 0;
            for (auto const bits : position.bits)
                hash = (hash ^ bits) * 0x9E3779B97F4A7C15u ^ (hash >> 29);
            return static_cast<std::size_t>(hash ^ (hash >> 32));
        }
    };

    /// Builds a mesh from facets that state positions: equal positions become one point, in the order in which they
    /// first come. -0 equals 0.
    class Joiner {
    public:
        explicit Joiner(MeshArrays& mesh) : mesh_(mesh) {}

        void addCorner(float3 const& position)
        {
            PositionBits key;
            for (int i = 0; i < 3; ++i)
                key.bits[static_cast<std::size_t>(i)] =
                    position[i] == 0.0f ? 0u : std::bit_cast<std::uint32_t>(position[i]);
            auto const next = static_cast<unsigned int>(mesh_.positions.size());
            auto const [entry, isNew] = pointOfPosition_.try_emplace(key, next);
            if (isNew)
                mesh_.positions.push_back(position);
            mesh_.corners.push_back(entry->second);
        }
        void endFace() { mesh_.offsets.push_back(static_cast<unsigned int>(mesh_.corners.size())); }

    private:
        MeshArrays& mesh_;
        std::unordered_map<PositionBits, unsigned int, PositionHash> pointOfPosition_;
    };

    float littleEndianFloat(char const* bytes)
    {
        std::array<char, 4> raw;
        std::memcpy(raw.data(), bytes, 4);
        if constexpr (std::endian::native == std::endian::big)
            std::swap(raw[0], raw[3]), std::swap(raw[1], raw[2]);
        return std::bit_cast<float>(raw);
    }

    std::uint64_t facetCountOf(std::string_view bytes)
    {
        std::uint64_t count = 0;
        for (std::size_t i = 0; i < 4; ++i)
            count |= std::uint64_t(static_cast<unsigned char>(bytes[80 + i])) << (8 * i);
        return count;
    }

    void readBinary(std::string_view bytes, MeshFile& file)
    {
        MeshArrays& mesh = file.parts.emplace_back();
        Joiner joiner(mesh);
        bool hasAttributes = false;
        for (std::size_t at = kBinaryHeaderSize; at + kFacetSize <= bytes.size(); at += kFacetSize) {
            char const* const facet = bytes.data() + at;
            for (std::size_t corner = 0; corner < 3; ++corner) {
                char const* const xyz = facet + 12 + 12 * corner;
                joiner.addCorner({littleEndianFloat(xyz), littleEndianFloat(xyz + 4), littleEndianFloat(xyz + 8)});
            }
            joiner.endFace();
            hasAttributes |= facet[48] != 0 || facet[49] != 0;
        }
        if (hasAttributes)
            file.leftOut.emplace_back("attributes of facets");
    }

    void expect(Words& words, std::string_view wanted)
    {
        auto const word = words.next();
        if (word != wanted)
            words.fail(word.empty() ? fmt::format("the file ends where '{}' belongs", wanted)
                                    : fmt::format("{} where '{}' belongs", inQuotes(word), wanted));
    }

    void readText(std::string const& path, std::string_view bytes, MeshFile& file)
    {
        Words words(path, bytes, false);
        auto word = words.next();
        while (!word.empty()) {
            if (word != "solid")
                words.fail(fmt::format("{} where 'solid' belongs", inQuotes(word)));
            std::string name;
            for (auto part = words.nextInLine(); !part.empty(); part = words.nextInLine())
                name += fmt::format("{}{}", name.empty() ? "" : " ", part);
            MeshArrays& mesh = file.parts.emplace_back();
            if (!name.empty())
                mesh.name = name;
            Joiner joiner(mesh);
            for (word = words.next(); word == "facet"; word = words.next()) {
                expect(words, "normal");
                for (int i = 0; i < 3; ++i)
                    (void)words.number("a normal");
                expect(words, "outer");
                expect(words, "loop");
                auto const begin = mesh.corners.size();
                for (word = words.next(); word == "vertex"; word = words.next()) {
                    float3 position;
                    for (int i = 0; i < 3; ++i)
                        position[i] = words.number("a coordinate");
                    joiner.addCorner(position);
                }
                if (word != "endloop")
                    words.fail(fmt::format("{} where 'vertex' or 'endloop' belongs", inQuotes(word)));
                if (mesh.corners.size() == begin)
                    words.fail("a facet without corners");
                expect(words, "endfacet");
                joiner.endFace();
            }
            if (word != "endsolid")
                words.fail(word.empty() ? "the file ends where 'facet' or 'endsolid' belongs"
                                        : fmt::format("{} where 'facet' or 'endsolid' belongs", inQuotes(word)));
            // The name may be repeated here.
            while (!words.nextInLine().empty()) {
            }
            word = words.next();
        }
    }

} // namespace

MeshFile readStl(std::string const& path, std::string_view bytes)
{
    MeshFile file;
    // The size tells a binary file from a text: some binary ones start with the word "solid" too.
    bool const isBinary =
        bytes.size() >= kBinaryHeaderSize && bytes.size() == kBinaryHeaderSize + kFacetSize * facetCountOf(bytes);
    if (isBinary)
        readBinary(bytes, file);
    else if (bytes.starts_with("solid"))
        readText(path, bytes, file);
    else if (bytes.size() >= kBinaryHeaderSize)
        throw Failure(fmt::format("{}: {} facets take {} bytes, but the file has {}", path, facetCountOf(bytes),
                                  kBinaryHeaderSize + kFacetSize * facetCountOf(bytes), bytes.size()));
    else
        failAtLine(path, 1, "neither the word 'solid' nor a binary header");
    for (auto const& mesh : file.parts)
        if (mesh.corners.size() > kMostElements)
            throw Failure(fmt::format("{}: too many corners", path));
    std::erase_if(file.parts, [](MeshArrays const& mesh) { return mesh.positions.empty(); });
    if (file.parts.empty())
        throw Failure(fmt::format("{}: the file has no facets", path));
    return file;
}

} // namespace Zon
