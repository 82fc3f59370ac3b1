#include "Console.h"
#include "MeshArrays.h"
#include "TextInput.h"

#include <veldrin/geometry/Names.h>

#include <fmt/format.h>
#include <tiny_obj_loader.h>

#include <algorithm>
#include <functional>
#include <istream>
#include <iterator>
#include <map>
#include <set>
#include <streambuf>

/// tinyobjloader takes the statements apart; its numbers are not used, because they are not always the nearest float and
/// because it takes what is no number for 0. It is fed one statement at a time, so that when it calls back, the line
/// that it read is known: numbers come from that line, and so does the place of every fault.
namespace Zon {

namespace {

    using Veldrin::Geometry::kInvalidIndex;
    using Veldrin::Math::float2;
    using Veldrin::Math::float3;

    constexpr std::string_view kUsedKeywords[] = {"v", "vn", "vt", "f", "o", "g"};
    // Statements of the format that have no place in an object here; they are passed over with a warning.
    constexpr std::string_view kPassedOverKeywords[] = {
        "usemtl", "mtllib", "s",      "l",      "p",        "vp",       "mg",   "cstype",     "deg",
        "bmat",   "step",   "curv",   "curv2",  "surf",     "parm",     "trim", "hole",       "scrv",
        "sp",     "end",    "con",    "bevel",  "c_interp", "d_interp", "lod",  "shadow_obj", "trace_obj",
        "ctech",  "stech",  "usemap", "maplib", "call",     "csh"};

    template <std::size_t Count>
    bool contains(std::string_view const (&words)[Count], std::string_view word)
    {
        return std::find(std::begin(words), std::end(words), word) != std::end(words);
    }

    /// Hands a text out statement by statement, each as one line, to whoever reads from this buffer.
    class StatementBuffer : public std::streambuf {
    public:
        /// onStatement: called for each statement of the file before it is handed out; false leaves it out.
        StatementBuffer(std::string_view text, std::function<bool()> onStatement)
            : lines_(text), onStatement_(std::move(onStatement))
        {
        }

        /// The current statement: its keyword, the rest, the number of its first line, the byte behind it.
        [[nodiscard]] std::string_view keyword() const noexcept { return keyword_; }
        [[nodiscard]] std::string_view arguments() const noexcept { return arguments_; }
        [[nodiscard]] std::uint64_t line() const noexcept { return firstLine_; }
        [[nodiscard]] std::size_t position() const noexcept { return lines_.position(); }

    protected:
        int_type underflow() override
        {
            do {
                if (!next())
                    return traits_type::eof();
            } while (!onStatement_());
            handedOut_.assign(keyword_).append(" ").append(arguments_).append("\n");
            setg(handedOut_.data(), handedOut_.data(), handedOut_.data() + handedOut_.size());
            return traits_type::to_int_type(handedOut_[0]);
        }

    private:
        bool next()
        {
            while (lines_.next()) {
                firstLine_ = lines_.number();
                statement_ = lines_.current();
                // A backslash at its end continues a line with the next one.
                while (!statement_.empty() && statement_.back() == '\\' && lines_.next()) {
                    statement_.back() = ' ';
                    statement_ += lines_.current();
                }
                if (auto const comment = statement_.find('#'); comment != std::string::npos)
                    statement_.erase(comment);
                // To the parser it would end the line, and what follows would be a statement that nobody else saw.
                std::ranges::replace(statement_, '\r', ' ');
                arguments_ = statement_;
                keyword_ = takeWord(arguments_);
                if (!keyword_.empty())
                    return true;
            }
            return false;
        }

        Lines lines_;
        std::function<bool()> onStatement_;
        std::string statement_;
        std::string handedOut_;
        std::string_view keyword_;
        std::string_view arguments_;
        std::uint64_t firstLine_ = 0;
    };

    /// Values of one kind ("v", "vn", "vt") with the section that each was stated in.
    template <class T>
    struct Values {
        Nexil::Array<T> all;
        Nexil::Array<unsigned int> section;
    };

    struct Corner {
        unsigned int point;
        unsigned int normal;
        unsigned int uv;
    };

    /// What stands between two "o" or "g" statements.
    struct Section {
        bool isObject = false;
        std::string name;
    };

    class Reader {
    public:
        Reader(std::string const& path, std::string_view bytes)
            : path_(path), bytes_(bytes), buffer_(bytes, [this] { return onStatement(); }),
              progress_("reading", bytes.size())
        {
        }

        MeshFile read()
        {
            if (auto const zero = bytes_.find('\0'); zero != std::string_view::npos)
                failAtLine(path_,
                           1 + static_cast<std::uint64_t>(
                                   std::count(bytes_.begin(), bytes_.begin() + std::ptrdiff_t(zero), '\n')),
                           "a zero byte: the file is no text");
            sections_.emplace_back();
            tinyobj::callback_t callbacks;
            callbacks.vertex_cb = [](void* self, auto...) { static_cast<Reader*>(self)->onPoint(); };
            callbacks.normal_cb = [](void* self, auto...) { static_cast<Reader*>(self)->onNormal(); };
            callbacks.texcoord_cb = [](void* self, auto...) { static_cast<Reader*>(self)->onUV(); };
            callbacks.index_cb = [](void* self, tinyobj::index_t* corners, int count) {
                static_cast<Reader*>(self)->onFace(corners, count);
            };
            callbacks.group_cb = [](void* self, char const**, int) { static_cast<Reader*>(self)->onSection(false); };
            callbacks.object_cb = [](void* self, char const*) { static_cast<Reader*>(self)->onSection(true); };
            std::istream stream(&buffer_);
            // Lets faults that the buffer finds come out of the parser.
            stream.exceptions(std::ios::badbit);
            tinyobj::LoadObjWithCallback(stream, callbacks, this);
            return sortIntoParts();
        }

    private:
        [[noreturn]] void fail(std::string_view reason) const { failAtLine(path_, buffer_.line(), reason); }

        bool onStatement()
        {
            progress_.update(buffer_.position());
            if (buffer_.keyword() == "f")
                checkFace();
            if (contains(kUsedKeywords, buffer_.keyword()))
                return true;
            if (!contains(kPassedOverKeywords, buffer_.keyword()))
                fail(fmt::format("{} is no statement of this format", inQuotes(buffer_.keyword())));
            passedOver_.emplace(buffer_.keyword());
            return false;
        }

        /// The numbers of the current statement; from `least` to `most` of them. Those not stated are 0.
        template <std::size_t Most>
        std::size_t numbers(float (&values)[Most], std::size_t least)
        {
            auto rest = buffer_.arguments();
            std::size_t count = 0;
            for (auto word = takeWord(rest); !word.empty(); word = takeWord(rest)) {
                if (count == Most)
                    fail(fmt::format("more than {} numbers", Most));
                auto const value = parseFloat(word);
                if (!value)
                    fail(fmt::format("{} is no number that a float holds", inQuotes(word)));
                values[count++] = *value;
            }
            if (count < least)
                fail(fmt::format("{} where {} belong", count == 1 ? "1 number" : fmt::format("{} numbers", count),
                                 least));
            return count;
        }

        template <class T>
        void add(Values<T>& values, T const& value)
        {
            if (values.all.size() >= kMostElements)
                fail("too many values");
            values.all.push_back(value);
            values.section.push_back(static_cast<unsigned int>(sections_.size() - 1));
        }

        void onPoint()
        {
            // Behind the position a weight may follow, or a colour with or without one.
            float values[7] = {};
            auto const count = numbers(values, 3);
            if (count >= 6)
                leftOut_.emplace("colours");
            if ((count == 4 || count == 7) && values[3] != 1.0f)
                leftOut_.emplace("weights of points");
            add(points_, {values[0], values[1], values[2]});
        }

        void onNormal()
        {
            float values[3];
            numbers(values, 3);
            add(normals_, {values[0], values[1], values[2]});
        }

        void onUV()
        {
            float values[3] = {};
            numbers(values, 1);
            if (values[2] != 0.0f)
                leftOut_.emplace("third texture coordinates");
            add(uvs_, {values[0], values[1]});
        }

        /// The parser reads any text as an index; this one sees to it that there are only numbers. Nine digits are far
        /// more than any file has, and fit an int.
        void checkFace()
        {
            auto rest = buffer_.arguments();
            bool isEmpty = true;
            for (auto word = takeWord(rest); !word.empty(); word = takeWord(rest)) {
                isEmpty = false;
                std::size_t slashes = 0;
                std::size_t digits = 0;
                for (std::size_t i = 0; i < word.size(); ++i) {
                    if (word[i] == '/') {
                        ++slashes;
                        digits = 0;
                    } else if (word[i] >= '0' && word[i] <= '9') {
                        ++digits;
                    } else if (word[i] != '-' || (i > 0 && word[i - 1] != '/')) {
                        slashes = 3;
                    }
                    if (slashes > 2 || digits > 9)
                        fail(fmt::format("{} is no corner of a face", inQuotes(word)));
                }
            }
            if (isEmpty)
                fail("a face without corners");
        }

        /// From an index of the file, counted from 1 or, when negative, back from the latest value, to one from 0.
        template <class T>
        unsigned int resolve(int stated, Values<T> const& values, std::string_view what)
        {
            auto const count = static_cast<std::int64_t>(values.all.size());
            std::int64_t const index = stated > 0 ? stated - 1 : count + stated;
            if (stated == 0)
                fail(fmt::format("{} index 0: indices count from 1", what));
            if (index < 0 || index >= count)
                fail(fmt::format("{} index {}, but only {} were stated so far", what, stated, count));
            return static_cast<unsigned int>(index);
        }

        void onFace(tinyobj::index_t const* corners, int count)
        {
            auto rest = buffer_.arguments();
            for (int i = 0; i < count; ++i) {
                // Absent indices and zeros look the same to the parser; the text tells them apart.
                auto const word = takeWord(rest);
                auto const slash = word.find('/');
                auto const second = slash == std::string_view::npos ? slash : word.find('/', slash + 1);
                bool const hasUV = slash != std::string_view::npos && slash + 1 < word.size() && slash + 1 != second;
                bool const hasNormal = second != std::string_view::npos && second + 1 < word.size();
                corners_.push_back(
                    {resolve(corners[i].vertex_index, points_, "point"),
                     hasNormal ? resolve(corners[i].normal_index, normals_, "normal") : kInvalidIndex,
                     hasUV ? resolve(corners[i].texcoord_index, uvs_, "texture coordinate") : kInvalidIndex});
            }
            if (corners_.size() > kMostElements)
                fail("too many corners");
            faceEnds_.push_back(static_cast<unsigned int>(corners_.size()));
            sectionOfFace_.push_back(static_cast<unsigned int>(sections_.size() - 1));
        }

        void onSection(bool isObject)
        {
            auto name = buffer_.arguments();
            name.remove_prefix(std::min(name.find_first_not_of(" \t"), name.size()));
            name.remove_suffix(name.size() - std::min(name.find_last_not_of(" \t\r") + 1, name.size()));
            Section section;
            section.isObject = isObject;
            section.name = std::string(name);
            sections_.push_back(std::move(section));
        }

        /// Number of the part that each section goes to. Objects make the parts; groups do where there is no object.
        std::vector<unsigned int> partsOfSections(std::vector<std::string>& names)
        {
            bool const hasObjects = std::any_of(sections_.begin(), sections_.end(),
                                                [](Section const& section) { return section.isObject; });
            std::vector<unsigned int> parts;
            std::map<std::string, unsigned int> partOfGroup;
            names.emplace_back();
            for (std::size_t i = 0; i < sections_.size(); ++i) {
                auto const& section = sections_[i];
                unsigned int part = parts.empty() ? 0 : parts.back();
                if (i > 0 && section.isObject == hasObjects) {
                    auto const fresh = static_cast<unsigned int>(names.size());
                    part = hasObjects ? fresh : partOfGroup.try_emplace(section.name, fresh).first->second;
                    if (part == fresh)
                        names.push_back(section.name);
                } else if (i > 0) {
                    leftOut_.emplace("groups");
                }
                parts.push_back(part);
            }
            return parts;
        }

        /// Gives every part the values that its faces name, and those that no face names to the part that states them;
        /// within a part they keep the order of the file. target: number of each value in the part that is built.
        template <class T>
        static void takeValues(Values<T> const& values, std::vector<unsigned int> const& namedByPart,
                               std::vector<unsigned int> const& unnamed, Nexil::Array<T>& result,
                               std::vector<unsigned int>& target)
        {
            result.reserve(namedByPart.size() + unnamed.size());
            auto const take = [&](unsigned int value) {
                target[value] = static_cast<unsigned int>(result.size());
                result.push_back(values.all[value]);
            };
            auto own = unnamed.begin();
            for (unsigned int const value : namedByPart) {
                for (; own != unnamed.end() && *own < value; ++own)
                    take(*own);
                take(value);
            }
            for (; own != unnamed.end(); ++own)
                take(*own);
        }

        /// The values of a kind that a part's corners name, each once, in increasing order.
        template <class Index>
        static std::vector<unsigned int> namedValues(std::vector<Corner> const& corners, Index const& index,
                                                     std::vector<unsigned int>& lastPart, unsigned int part)
        {
            std::vector<unsigned int> named;
            for (Corner const& corner : corners) {
                unsigned int const value = index(corner);
                if (value == kInvalidIndex || lastPart[value] == part)
                    continue;
                lastPart[value] = part;
                named.push_back(value);
            }
            std::sort(named.begin(), named.end());
            return named;
        }

        /// Per part, the values that no face names.
        template <class T, class Index>
        std::vector<std::vector<unsigned int>> unnamedValues(Values<T> const& values, Index const& index,
                                                             std::vector<unsigned int> const& partOfSection,
                                                             std::size_t partCount, unsigned int firstPart) const
        {
            std::vector<bool> isNamed(values.all.size());
            for (Corner const& corner : corners_)
                if (unsigned int const value = index(corner); value != kInvalidIndex)
                    isNamed[value] = true;
            std::vector<std::vector<unsigned int>> unnamed(partCount);
            for (unsigned int value = 0; value < isNamed.size(); ++value)
                if (!isNamed[value])
                    unnamed[std::max(partOfSection[values.section[value]], firstPart)].push_back(value);
            return unnamed;
        }

        MeshFile sortIntoParts()
        {
            std::vector<std::string> names;
            auto const partOfSection = partsOfSections(names);
            std::size_t const partCount = names.size();
            std::vector<std::vector<unsigned int>> facesOfPart(partCount);
            for (unsigned int face = 0; face < sectionOfFace_.size(); ++face)
                facesOfPart[partOfSection[sectionOfFace_[face]]].push_back(face);
            // What is stated before the first object and used by nothing goes to that object.
            unsigned int const firstPart = facesOfPart[0].empty() && partCount > 1 ? 1 : 0;

            auto const pointOf = [](Corner const& corner) { return corner.point; };
            auto const normalOf = [](Corner const& corner) { return corner.normal; };
            auto const uvOf = [](Corner const& corner) { return corner.uv; };
            auto const unnamedPoints = unnamedValues(points_, pointOf, partOfSection, partCount, firstPart);
            auto const unnamedNormals = unnamedValues(normals_, normalOf, partOfSection, partCount, firstPart);
            auto const unnamedUVs = unnamedValues(uvs_, uvOf, partOfSection, partCount, firstPart);
            std::vector<unsigned int> pointTarget(points_.all.size(), kInvalidIndex), lastPointPart(pointTarget);
            std::vector<unsigned int> normalTarget(normals_.all.size(), kInvalidIndex), lastNormalPart(normalTarget);
            std::vector<unsigned int> uvTarget(uvs_.all.size(), kInvalidIndex), lastUVPart(uvTarget);

            MeshFile file;
            for (unsigned int part = 0; part < partCount; ++part) {
                MeshArrays mesh;
                if (!names[part].empty())
                    mesh.name = names[part];
                std::vector<Corner> corners;
                for (unsigned int const face : facesOfPart[part]) {
                    auto const begin = face == 0 ? 0 : faceEnds_[face - 1];
                    for (auto corner = begin; corner < faceEnds_[face]; ++corner)
                        corners.push_back(corners_[corner]);
                    mesh.offsets.push_back(static_cast<unsigned int>(corners.size()));
                }
                takeValues(points_, namedValues(corners, pointOf, lastPointPart, part), unnamedPoints[part],
                           mesh.positions, pointTarget);
                mesh.corners.reserve(corners.size());
                for (Corner const& corner : corners)
                    mesh.corners.push_back(pointTarget[corner.point]);
                takeCornerValues(normals_, corners, normalOf, lastNormalPart, part, unnamedNormals[part], normalTarget,
                                 mesh.cornerNormals);
                takeCornerValues(uvs_, corners, uvOf, lastUVPart, part, unnamedUVs[part], uvTarget, mesh.cornerUVs);
                if (corners.empty() && !unnamedNormals[part].empty())
                    leftOut_.emplace("normals that no face uses");
                if (corners.empty() && !unnamedUVs[part].empty())
                    leftOut_.emplace("texture coordinates that no face uses");
                if (!mesh.positions.empty())
                    file.parts.push_back(std::move(mesh));
            }
            if (file.parts.empty())
                failAtLine(path_, std::max<std::uint64_t>(buffer_.line(), 1), "the file has no points");
            file.leftOut.assign(leftOut_.begin(), leftOut_.end());
            if (!passedOver_.empty())
                file.leftOut.push_back(fmt::format("the statements {}", fmt::join(passedOver_, ", ")));
            return file;
        }

        template <class T, class Index>
        static void takeCornerValues(Values<T> const& values, std::vector<Corner> const& corners, Index const& index,
                                     std::vector<unsigned int>& lastPart, unsigned int part,
                                     std::vector<unsigned int> const& unnamed, std::vector<unsigned int>& target,
                                     std::optional<CornerValues<T>>& result)
        {
            auto const named = namedValues(corners, index, lastPart, part);
            if (corners.empty() || (named.empty() && unnamed.empty()))
                return;
            result.emplace();
            takeValues(values, named, unnamed, result->values, target);
            result->indices.reserve(corners.size());
            for (Corner const& corner : corners)
                result->indices.push_back(index(corner) == kInvalidIndex ? kInvalidIndex : target[index(corner)]);
        }

        std::string const& path_;
        std::string_view bytes_;
        StatementBuffer buffer_;
        Progress progress_;
        Values<float3> points_;
        Values<float3> normals_;
        Values<float2> uvs_;
        std::vector<Corner> corners_;
        std::vector<unsigned int> faceEnds_; // per face, the end of its corners
        std::vector<unsigned int> sectionOfFace_;
        std::vector<Section> sections_;
        std::set<std::string> leftOut_;
        std::set<std::string, std::less<>> passedOver_;
    };

} // namespace

MeshFile readObj(std::string const& path, std::string_view bytes)
{
    // Some programs write a byte-order mark first.
    if (bytes.starts_with("\xEF\xBB\xBF"))
        bytes.remove_prefix(3);
    return Reader(path, bytes).read();
}

} // namespace Zon
