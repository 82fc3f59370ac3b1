#include "MeshArrays.h"

#include <veldrin/geometry/Names.h>

#include <fmt/format.h>

#include <charconv>
#include <cmath>

namespace Zon {

namespace {

    /// The shortest text that reads back to the same bits.
    void appendFloat(std::string& text, float value)
    {
        char digits[32];
        auto const [end, status] = std::to_chars(std::begin(digits), std::end(digits), value);
        text.append(digits, end);
    }

    template <class V>
    void appendStatement(std::string& text, std::string_view keyword, V const& value)
    {
        text += keyword;
        for (int i = 0; i < V::kSize; ++i) {
            text += ' ';
            appendFloat(text, value[i]);
        }
        text += '\n';
    }

    void appendIndex(std::string& text, std::uint64_t index)
    {
        fmt::format_to(std::back_inserter(text), "{}", index);
    }

    struct Totals {
        std::uint64_t points = 0;
        std::uint64_t normals = 0;
        std::uint64_t uvs = 0;
    };

    template <class T>
    bool hasValue(std::optional<CornerValues<T>> const& values, std::uint64_t corner)
    {
        return values && values->indices[corner] != Veldrin::Geometry::kInvalidIndex;
    }

    void appendPart(std::string& text, MeshArrays const& part, Totals& before)
    {
        for (auto const& position : part.positions)
            appendStatement(text, "v", position);
        if (part.cornerNormals)
            for (auto const& normal : part.cornerNormals->values)
                appendStatement(text, "vn", normal);
        if (part.cornerUVs)
            for (auto const& uv : part.cornerUVs->values)
                appendStatement(text, "vt", uv);
        for (std::uint64_t face = 0; face < part.faceCount(); ++face) {
            text += 'f';
            for (std::uint64_t corner = part.offsets[face]; corner < part.offsets[face + 1]; ++corner) {
                text += ' ';
                appendIndex(text, before.points + part.corners[corner] + 1);
                bool const hasUV = hasValue(part.cornerUVs, corner);
                bool const hasNormal = hasValue(part.cornerNormals, corner);
                if (hasUV || hasNormal)
                    text += '/';
                if (hasUV)
                    appendIndex(text, before.uvs + part.cornerUVs->indices[corner] + 1);
                if (hasNormal) {
                    text += '/';
                    appendIndex(text, before.normals + part.cornerNormals->indices[corner] + 1);
                }
            }
            text += '\n';
        }
        before.points += part.positions.size();
        before.normals += part.cornerNormals ? part.cornerNormals->values.size() : 0;
        before.uvs += part.cornerUVs ? part.cornerUVs->values.size() : 0;
    }

} // namespace

std::string writeObj(std::vector<MeshArrays> const& parts)
{
    std::string text;
    Totals before;
    for (auto const& part : parts) {
        // Without a statement of its own, a part would go on with the part before it.
        if (part.name || parts.size() > 1)
            text += fmt::format("o {}\n", part.name.value_or(""));
        appendPart(text, part, before);
    }
    return text;
}

} // namespace Zon
