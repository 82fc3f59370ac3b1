#include "MeshArrays.h"
#include "TextInput.h"

#include <fmt/format.h>

#include <algorithm>

namespace Zon {

namespace {

    using Veldrin::Math::float3;

    /// What the letters before "OFF" announce for each point.
    struct Header {
        bool hasTexture = false;
        bool hasColor = false;
        bool hasNormal = false;
    };

    Header parseKeyword(std::string_view word, Words& words)
    {
        Header header;
        auto const take = [&](std::string_view prefix) {
            bool const found = word.starts_with(prefix) && word != "OFF";
            if (found)
                word.remove_prefix(prefix.size());
            return found;
        };
        header.hasTexture = take("ST");
        header.hasColor = take("C");
        header.hasNormal = take("N");
        if (word == "4OFF" || word == "nOFF" || word == "4nOFF")
            words.fail(fmt::format("points of other than three dimensions ({}) are not read", inQuotes(word)));
        if (word != "OFF")
            words.fail(fmt::format("{} is not the word OFF that such a file starts with", inQuotes(word)));
        return header;
    }

    float3 readFloat3(Words& words, std::string_view what)
    {
        float3 value;
        value.x = words.number(what);
        value.y = words.number(what);
        value.z = words.number(what);
        return value;
    }

    /// The words behind what was wanted of a line: nothing, or a colour. Gives their number.
    unsigned int skipColor(Words& words)
    {
        unsigned int count = 0;
        for (auto word = words.nextInLine(); !word.empty(); word = words.nextInLine())
            if (++count > 4 || !parseFloat(word))
                words.fail(fmt::format("{} is too much on this line", inQuotes(word)));
        return count;
    }

} // namespace

MeshFile readOff(std::string const& path, std::string_view bytes)
{
    Words words(path, bytes, true);
    auto const keyword = words.next();
    if (keyword.empty())
        failAtLine(path, 1, "the file is empty");
    Header const header = parseKeyword(keyword, words);

    MeshFile file;
    MeshArrays& mesh = file.parts.emplace_back();
    auto const first = words.next();
    if (first == "BINARY")
        words.fail("binary OFF is not read");
    auto const wantedPoints = parseInteger(first);
    if (!wantedPoints || *wantedPoints < 0 || static_cast<std::uint64_t>(*wantedPoints) > kMostElements)
        words.fail(fmt::format("{} is no number of points", inQuotes(first)));
    std::uint32_t const pointCount = static_cast<std::uint32_t>(*wantedPoints);
    std::uint32_t const faceCount = words.count("the number of faces", kMostElements);
    // The number of edges is often left out, and never of use.
    (void)words.nextInLine();
    if (pointCount == 0)
        words.fail("the file has no points");

    // A point takes at least six bytes, a face two: a header that promises more than the file holds costs no memory.
    mesh.positions.reserve(std::min<std::uint64_t>(pointCount, bytes.size() / 6 + 1));
    for (std::uint32_t point = 0; point < pointCount; ++point) {
        mesh.positions.push_back(readFloat3(words, "a coordinate"));
        if (header.hasNormal)
            mesh.pointNormals.push_back(readFloat3(words, "a normal"));
        if (header.hasColor || header.hasTexture)
            for (auto word = words.nextInLine(); !word.empty(); word = words.nextInLine())
                if (!parseFloat(word))
                    words.fail(fmt::format("{} is no number", inQuotes(word)));
    }
    mesh.offsets.reserve(std::min<std::uint64_t>(faceCount, bytes.size() / 2) + 1);
    bool hasFaceColors = false;
    for (std::uint32_t face = 0; face < faceCount; ++face) {
        std::uint32_t const cornerCount = words.count("the number of corners of a face");
        if (cornerCount == 0)
            words.fail("a face without corners");
        for (std::uint32_t corner = 0; corner < cornerCount; ++corner)
            mesh.corners.push_back(words.count("a point index", pointCount - 1));
        hasFaceColors |= skipColor(words) > 0;
        if (mesh.corners.size() > kMostElements)
            words.fail("too many corners");
        mesh.offsets.push_back(static_cast<unsigned int>(mesh.corners.size()));
    }
    if (header.hasColor || hasFaceColors)
        file.leftOut.emplace_back("colours");
    if (header.hasTexture)
        file.leftOut.emplace_back("texture coordinates of points");
    if (!words.next().empty())
        file.leftOut.push_back(fmt::format("what follows the last face, from line {} on", words.line()));
    return file;
}

} // namespace Zon
