#include "Command.h"
#include "MeshArrays.h"
#include "TextInput.h"

#include <fmt/format.h>

#include <algorithm>
#include <array>
#include <bit>
#include <cmath>
#include <cstring>
#include <string_view>
#include <type_traits>
#include <unordered_set>
#include <utility>

namespace Zon {

namespace {

    enum class Scalar { Int8, UInt8, Int16, UInt16, Int32, UInt32, Float32, Float64 };

    struct ScalarName {
        std::string_view name;
        Scalar scalar;
    };
    constexpr ScalarName kScalarNames[] = {
        {"char", Scalar::Int8},       {"int8", Scalar::Int8},       {"uchar", Scalar::UInt8},
        {"uint8", Scalar::UInt8},     {"short", Scalar::Int16},     {"int16", Scalar::Int16},
        {"ushort", Scalar::UInt16},   {"uint16", Scalar::UInt16},   {"int", Scalar::Int32},
        {"int32", Scalar::Int32},     {"uint", Scalar::UInt32},     {"uint32", Scalar::UInt32},
        {"float", Scalar::Float32},   {"float32", Scalar::Float32}, {"double", Scalar::Float64},
        {"float64", Scalar::Float64},
    };
    constexpr std::size_t kScalarBytes[] = {1, 1, 2, 2, 4, 4, 4, 8};

    struct Property {
        std::string_view name;
        Scalar scalar{};
        bool isList = false;
        Scalar countScalar{};
    };

    struct Element {
        std::string_view name;
        std::uint64_t count = 0;
        std::vector<Property> properties;
    };

    enum class Format { Ascii, LittleEndian, BigEndian };

    struct Header {
        Format format = Format::Ascii;
        std::vector<Element> elements;
        std::size_t size = 0;
        std::uint64_t lineCount = 0;
    };

    Scalar scalarOf(std::string_view word, std::string const& path, std::uint64_t line)
    {
        auto const* const row = std::find_if(std::begin(kScalarNames), std::end(kScalarNames),
                                             [&](ScalarName const& each) { return each.name == word; });
        if (row == std::end(kScalarNames))
            failAtLine(path, line, fmt::format("{} is no type of a property", inQuotes(word)));
        return row->scalar;
    }

    Header readHeader(std::string const& path, std::string_view bytes)
    {
        Header header;
        Lines lines(bytes);
        bool hasFormat = false;
        std::unordered_set<std::string_view> names; // of the properties of the last element
        if (!lines.next() || lines.current() != "ply")
            failAtLine(path, 1, "the file does not start with the line 'ply'");
        while (lines.next()) {
            auto rest = lines.current();
            auto const fail = [&](std::string_view reason) { failAtLine(path, lines.number(), reason); };
            auto const keyword = takeWord(rest);
            if (keyword == "end_header") {
                if (!hasFormat)
                    fail("the header names no format");
                header.size = lines.position();
                header.lineCount = lines.number();
                return header;
            }
            if (keyword == "format") {
                auto const name = takeWord(rest);
                if (name != "ascii" && name != "binary_little_endian" && name != "binary_big_endian")
                    fail(fmt::format("{} is no format", inQuotes(name)));
                header.format = name == "ascii"                  ? Format::Ascii
                                : name == "binary_little_endian" ? Format::LittleEndian
                                                                 : Format::BigEndian;
                hasFormat = true;
            } else if (keyword == "element") {
                Element element;
                element.name = takeWord(rest);
                auto const word = takeWord(rest);
                auto const count = parseInteger(word);
                if (!count || *count < 0 || static_cast<std::uint64_t>(*count) > kMostElements)
                    fail(fmt::format("{} is no number of elements", inQuotes(word)));
                element.count = static_cast<std::uint64_t>(*count);
                header.elements.push_back(std::move(element));
                names.clear();
            } else if (keyword == "property") {
                if (header.elements.empty())
                    fail("a property before the first element");
                Property property;
                auto word = takeWord(rest);
                if (word == "list") {
                    property.isList = true;
                    property.countScalar = scalarOf(takeWord(rest), path, lines.number());
                    if (property.countScalar >= Scalar::Float32)
                        fail("the length of a list is no whole number");
                    word = takeWord(rest);
                }
                property.scalar = scalarOf(word, path, lines.number());
                property.name = takeWord(rest);
                if (!names.insert(property.name).second)
                    fail(fmt::format("{} is named twice", inQuotes(property.name)));
                header.elements.back().properties.push_back(property);
            } else if (!keyword.empty() && keyword != "comment" && keyword != "obj_info") {
                fail(fmt::format("{} is no keyword of the header", inQuotes(keyword)));
            }
        }
        failAtLine(path, lines.number(), "the file ends within the header");
    }

    /// The values of a text body.
    class TextBody {
    public:
        TextBody(std::string const& path, std::string_view bytes, std::uint64_t headerLineCount)
            : words_(path, bytes, false, headerLineCount)
        {
        }

        float asFloat(Scalar) { return words_.number("a number"); }
        std::int64_t asInteger(Scalar)
        {
            auto const word = words_.next();
            auto const value = parseInteger(word);
            if (!value)
                fail(word.empty() ? "the file ends before the last element"
                                  : fmt::format("{} is no whole number", inQuotes(word)));
            return *value;
        }
        void skip(Scalar)
        {
            if (words_.next().empty())
                fail("the file ends before the last element");
        }
        [[nodiscard]] bool isAtEnd() { return words_.next().empty(); }
        [[noreturn]] void fail(std::string_view reason) const { words_.fail(reason); }

    private:
        Words words_;
    };

    /// The values of a binary body.
    class BinaryBody {
    public:
        BinaryBody(std::string const& path, std::string_view bytes, std::size_t position, bool isBigEndian)
            : path_(path), bytes_(bytes), position_(position), isBigEndian_(isBigEndian)
        {
        }

        float asFloat(Scalar scalar)
        {
            return visit<float>(scalar, [&](auto value) {
                auto const narrow = static_cast<float>(value);
                if (std::isinf(narrow) && !std::isinf(static_cast<double>(value)))
                    fail("a number that a float does not hold");
                return narrow;
            });
        }
        std::int64_t asInteger(Scalar scalar)
        {
            return visit<std::int64_t>(scalar, [&](auto value) {
                if constexpr (std::is_floating_point_v<decltype(value)>) {
                    if (!(std::abs(value) < 1e15f) || std::trunc(value) != value)
                        fail("an index that is no whole number");
                }
                return static_cast<std::int64_t>(value);
            });
        }
        void skip(Scalar scalar) { (void)take(kScalarBytes[static_cast<std::size_t>(scalar)]); }
        [[nodiscard]] bool isAtEnd() const { return position_ == bytes_.size(); }
        [[noreturn]] void fail(std::string_view reason) const
        {
            throw Failure(fmt::format("{}: byte {}: {}", path_, position_, reason));
        }

    private:
        template <class Result, class Use>
        Result visit(Scalar scalar, Use const& use)
        {
            switch (scalar) {
            case Scalar::Int8: return use(read<std::int8_t>());
            case Scalar::UInt8: return use(read<std::uint8_t>());
            case Scalar::Int16: return use(read<std::int16_t>());
            case Scalar::UInt16: return use(read<std::uint16_t>());
            case Scalar::Int32: return use(read<std::int32_t>());
            case Scalar::UInt32: return use(read<std::uint32_t>());
            case Scalar::Float32: return use(read<float>());
            case Scalar::Float64: break;
            }
            return use(read<double>());
        }

        template <class T>
        T read()
        {
            std::array<char, sizeof(T)> raw;
            std::memcpy(raw.data(), take(sizeof(T)), sizeof(T));
            if (isBigEndian_ != (std::endian::native == std::endian::big))
                std::reverse(raw.begin(), raw.end());
            return std::bit_cast<T>(raw);
        }

        char const* take(std::size_t count)
        {
            if (bytes_.size() - position_ < count)
                fail("the file ends before the last element");
            char const* const at = bytes_.data() + position_;
            position_ += count;
            return at;
        }

        std::string const& path_;
        std::string_view bytes_;
        std::size_t position_;
        bool isBigEndian_;
    };

    /// Where a property's value goes: into a float of the point, into the corners, or nowhere.
    int floatSlot(Property const& property)
    {
        constexpr std::string_view kNames[] = {"x", "y", "z", "nx", "ny", "nz"};
        auto const* const found = std::find(std::begin(kNames), std::end(kNames), property.name);
        return property.isList || found == std::end(kNames) ? -1 : static_cast<int>(found - std::begin(kNames));
    }

    bool isCorners(Property const& property)
    {
        return property.isList && (property.name == "vertex_indices" || property.name == "vertex_index");
    }

    template <class Body>
    std::uint64_t listLength(Property const& property, Body& body)
    {
        auto const length = body.asInteger(property.countScalar);
        if (length < 0)
            body.fail("a list of negative length");
        return static_cast<std::uint64_t>(length);
    }

    template <class Body>
    void skipProperty(Property const& property, Body& body)
    {
        for (std::uint64_t left = property.isList ? listLength(property, body) : 1; left > 0; --left)
            body.skip(property.scalar);
    }

    template <class Body>
    void readPoints(Element const& element, Body& body, std::size_t byteCount, MeshArrays& mesh)
    {
        unsigned int slots = 0;
        for (auto const& property : element.properties)
            if (int const slot = floatSlot(property); slot >= 0)
                slots |= 1u << slot;
        if ((slots & 7u) != 7u)
            body.fail("the points lack x, y or z");
        bool const hasNormals = (slots & 56u) == 56u;
        mesh.positions.reserve(std::min<std::uint64_t>(element.count, byteCount / 3));
        for (std::uint64_t point = 0; point < element.count; ++point) {
            float values[6] = {};
            for (auto const& property : element.properties) {
                if (int const slot = floatSlot(property); slot >= 0)
                    values[slot] = body.asFloat(property.scalar);
                else
                    skipProperty(property, body);
            }
            mesh.positions.push_back({values[0], values[1], values[2]});
            if (hasNormals)
                mesh.pointNormals.push_back({values[3], values[4], values[5]});
        }
    }

    template <class Body>
    void readFaces(Element const& element, std::uint64_t pointCount, Body& body, std::size_t byteCount,
                   MeshArrays& mesh)
    {
        if (std::count_if(element.properties.begin(), element.properties.end(), isCorners) != 1)
            body.fail("the faces lack their list 'vertex_indices'");
        mesh.offsets.reserve(std::min<std::uint64_t>(element.count, byteCount) + 1);
        for (std::uint64_t face = 0; face < element.count; ++face) {
            for (auto const& property : element.properties) {
                if (!isCorners(property)) {
                    skipProperty(property, body);
                    continue;
                }
                auto const length = listLength(property, body);
                if (length == 0)
                    body.fail("a face without corners");
                for (std::uint64_t corner = 0; corner < length; ++corner) {
                    auto const index = body.asInteger(property.scalar);
                    if (index < 0 || static_cast<std::uint64_t>(index) >= pointCount)
                        body.fail(fmt::format("point index {} of {} points", index, pointCount));
                    mesh.corners.push_back(static_cast<unsigned int>(index));
                }
            }
            if (mesh.corners.size() > kMostElements)
                body.fail("too many corners");
            mesh.offsets.push_back(static_cast<unsigned int>(mesh.corners.size()));
        }
    }

    template <class Body>
    void readBody(Header const& header, Body& body, std::size_t byteCount, MeshFile& file)
    {
        MeshArrays& mesh = file.parts.emplace_back();
        // Indices may come before the points that they name, so these are counted first.
        auto const points = std::find_if(header.elements.begin(), header.elements.end(),
                                         [](Element const& element) { return element.name == "vertex"; });
        if (points == header.elements.end() || points->count == 0)
            body.fail("the file has no points");
        std::string names;
        auto const leaveOut = [&](std::string_view element, std::string_view property) {
            names += fmt::format("{}{}{}{}", names.empty() ? "" : ", ", element, property.empty() ? "" : ".", property);
        };
        bool hasPoints = false;
        bool hasFaces = false;
        for (auto const& element : header.elements) {
            if (element.name == "vertex" && !std::exchange(hasPoints, true)) {
                readPoints(element, body, byteCount, mesh);
                for (auto const& property : element.properties) {
                    int const slot = floatSlot(property);
                    if (slot < 0 || (slot > 2 && mesh.pointNormals.empty()))
                        leaveOut(element.name, property.name);
                }
            } else if (element.name == "face" && !std::exchange(hasFaces, true)) {
                if (element.count > 0)
                    readFaces(element, points->count, body, byteCount, mesh);
                for (auto const& property : element.properties)
                    if (!isCorners(property))
                        leaveOut(element.name, property.name);
            } else {
                for (std::uint64_t i = 0; i < element.count && !element.properties.empty(); ++i)
                    for (auto const& property : element.properties)
                        skipProperty(property, body);
                if (element.count > 0)
                    leaveOut(element.name, "");
            }
        }
        if (!names.empty())
            file.leftOut.push_back(names);
        if (!body.isAtEnd())
            file.leftOut.emplace_back("what follows the last element");
    }

} // namespace

MeshFile readPly(std::string const& path, std::string_view bytes)
{
    Header const header = readHeader(path, bytes);
    MeshFile file;
    std::size_t const bodySize = bytes.size() - header.size;
    if (header.format == Format::Ascii) {
        TextBody body(path, bytes, header.lineCount);
        readBody(header, body, bodySize, file);
    } else {
        BinaryBody body(path, bytes, header.size, header.format == Format::BigEndian);
        readBody(header, body, bodySize, file);
    }
    return file;
}

} // namespace Zon
