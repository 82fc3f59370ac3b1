#include <veldrin/geometry/DebugDump.h>

#include <veldrin/geometry/DataInterpolationMode.h>
#include <veldrin/geometry/internal/ValueTypes.h>

#include <algorithm>
#include <cstring>
#include <locale>
#include <sstream>
#include <string>
#include <type_traits>
#include <unordered_map>
#include <unordered_set>
#include <utility>
#include <vector>

namespace Veldrin::Geometry::Internal {

namespace {

    using ObjectPtr = Nexil::Ptr<Object>;
    using ObjectListPtr = Nexil::Ptr<Nexil::Array<ObjectPtr>>;
    using Common::DataInterpolationMode;

    constexpr unsigned int kMostLevels = 1000;
    // Shared objects are written wherever they are met. Forty objects that each hold the next one twice would make 2^40.
    constexpr unsigned int kMostRepeats = 10000;

    /// What a value is made of: one number, a row of `rows` numbers, or `columns` such rows.
    struct Layout {
        enum class Leaf { String, Bool, Float, Double, Signed, Unsigned } leaf = Leaf::String;
        unsigned int leafSize = 0;
        unsigned int rows = 0;
        unsigned int columns = 0;
    };

    template <class T>
    constexpr Layout layoutOf()
    {
        if constexpr (std::is_same_v<T, Nexil::String>) {
            return {Layout::Leaf::String, sizeof(T)};
        } else if constexpr (std::is_arithmetic_v<T>) {
            auto const leaf = std::is_same_v<T, bool>     ? Layout::Leaf::Bool
                              : std::is_same_v<T, float>  ? Layout::Leaf::Float
                              : std::is_same_v<T, double> ? Layout::Leaf::Double
                              : std::is_signed_v<T>       ? Layout::Leaf::Signed
                                                          : Layout::Leaf::Unsigned;
            return {leaf, sizeof(T)};
        } else {
            auto layout =
                layoutOf<typename std::conditional_t<std::is_same_v<T, Box3f>, Math::float3, T>::value_type>();
            constexpr unsigned int leafCount = sizeof(T) / sizeof(typename T::value_type);
            if constexpr (requires { T::kColumns; })
                layout.columns = T::kColumns;
            else if constexpr (std::is_same_v<T, Box3f>)
                layout.columns = 2;
            layout.rows = leafCount / std::max(layout.columns, 1u);
            return layout;
        }
    }

    struct Values {
        void const* first;
        std::uint64_t count;
    };

    /// One known type of property.
    struct Row {
        char const* name; ///< null where the type goes by its C++ spelling
        bool isArray;
        Layout layout;
        unsigned int valueSize;
        Values (*values)(Nexil::Any const& value);
    };

    template <class T>
    Values singleValue(Nexil::Any const& value)
    {
        return {value.get<T>(), 1};
    }

    template <class T>
    Values arrayValues(Nexil::Any const& value)
    {
        auto const* const array = value.get<Nexil::Ptr<Nexil::Array<T>>>()->get();
        return array ? Values{array->data(), array->size()} : Values{nullptr, 0};
    }

    class RowTable {
    public:
        RowTable()
        {
            forEachValueType([this]<class T>(unsigned int, char const* name) { add<T>(name); });
            forEachValueTypeTwin([this]<class T>(unsigned int) { add<T>(nullptr); });
        }

        Row const* find(Nexil::TypeId type) const
        {
            auto const found = rows_.find(type);
            return found == rows_.end() ? nullptr : &found->second;
        }

    private:
        template <class T>
        void add(char const* name)
        {
            constexpr auto layout = layoutOf<T>();
            rows_.emplace(Nexil::TypeId::of<T>(), Row{name, false, layout, sizeof(T), &singleValue<T>});
            rows_.emplace(Nexil::TypeId::of<Nexil::Ptr<Nexil::Array<T>>>(),
                          Row{name, true, layout, sizeof(T), &arrayValues<T>});
        }

        std::unordered_map<Nexil::TypeId, Row> rows_;
    };

    Row const* knownType(Nexil::TypeId type)
    {
        static RowTable const table;
        return table.find(type);
    }

    char const* modeName(DataInterpolationMode mode)
    {
        switch (mode) {
        case DataInterpolationMode::Nearest: return "Nearest";
        case DataInterpolationMode::Linear: return "Linear";
        case DataInterpolationMode::DefaultValue: return "DefaultValue";
        }
        return nullptr;
    }

    class Dump {
    public:
        explicit Dump(unsigned long long maxElements) : maxElements_(maxElements)
        {
            text_.imbue(std::locale::classic());
        }

        std::string text() && { return std::move(text_).str(); }

        // Objects and lists wait on a stack of their own: a thousand levels are too many for small thread stacks.
        void write(Object const& object)
        {
            openObject(object, nullptr, 0);
            while (!open_.empty()) {
                if (open_.back().list)
                    continueList(open_.back());
                else
                    continueObject(open_.back());
            }
        }

    private:
        /// An object or a list whose next key or element is still to be written.
        struct Open {
            Object const* object;
            ObjectPtr holder;
            Nexil::Array<Nexil::String> keys;
            ObjectListPtr list;
            unsigned int depth;
            std::uint64_t next = 0;
        };

        void openObject(Object const& object, ObjectPtr holder, unsigned int depth)
        {
            indent(depth);
            if (depth > kMostLevels || isOneRepeatTooMany(object)) {
                text_ << "...";
                return;
            }
            text_ << "{\n";
            open_.push_back({&object, std::move(holder), object.keys(), nullptr, depth});
        }

        void openList(ObjectListPtr list, unsigned int depth)
        {
            indent(depth);
            text_ << "[\n";
            open_.push_back({nullptr, nullptr, {}, std::move(list), depth});
        }

        void continueObject(Open& open)
        {
            if (open.next != 0)
                text_ << '\n';
            if (open.next == open.keys.size()) {
                indent(open.depth);
                text_ << '}';
                open_.pop_back();
                return;
            }
            Nexil::String const& key = open.keys[open.next++];
            indent(open.depth + 1);
            text_ << key << ": ";
            writeProperty(open.object->getProperty(key), open.depth);
        }

        void continueList(Open& open)
        {
            if (open.next == open.list->size()) {
                indent(open.depth);
                text_ << ']';
                open_.pop_back();
                return;
            }
            if (open.next != 0)
                text_ << ",\n";
            ObjectPtr element = (*open.list)[open.next++];
            if (Object const* object = element.get()) {
                openObject(*object, std::move(element), open.depth + 1);
            } else {
                indent(open.depth + 1);
                text_ << "(unknown data type)";
            }
        }

        void indent(unsigned int depth)
        {
            for (unsigned int i = 0; i < depth; ++i)
                text_ << "    ";
        }

        bool isOneRepeatTooMany(Object const& object)
        {
            return !written_.insert(&object).second && ++repeatCount_ > kMostRepeats;
        }

        void writeProperty(Nexil::Any const& value, unsigned int depth)
        {
            if (Row const* row = knownType(value.type())) {
                writeKnown(*row, value);
            } else if (auto const* mode = value.get<DataInterpolationMode>()) {
                if (char const* name = modeName(*mode))
                    text_ << name;
                else
                    text_ << static_cast<unsigned int>(*mode);
                text_ << " (Geometry::Common::DataInterpolationMode)";
            } else if (auto const* object = value.get<ObjectPtr>(); object && *object) {
                text_ << '\n';
                openObject(**object, *object, depth + 1);
            } else if (auto const* list = value.get<ObjectListPtr>(); list && *list) {
                openList(*list, depth + 1);
            } else {
                if (!Nexil::AnyArray::is_any_array(value))
                    text_ << "(unknown data type)";
                else if (auto const size = Nexil::AnyArray::get_any_array_size(value))
                    text_ << "[ ... ] " << size << " elements (array<unknown data type>)";
                else
                    text_ << "[] 0 elements (array<unknown data type>)";
                writeSpelledType(value);
            }
        }

        void writeKnown(Row const& row, Nexil::Any const& value)
        {
            auto const [first, count] = row.values(value);
            auto const* const bytes = static_cast<unsigned char const*>(first);
            if (row.isArray)
                writeElements(row, bytes, count);
            else
                writeValue(row.layout, bytes);
            if (!row.name)
                writeSpelledType(value);
            else if (row.isArray)
                text_ << " (array<" << row.name << ">)";
            else
                text_ << " (" << row.name << ')';
        }

        void writeElements(Row const& row, unsigned char const* bytes, std::uint64_t count)
        {
            std::uint64_t const written = std::min<std::uint64_t>(count, maxElements_);
            text_ << "[ ";
            for (std::uint64_t i = 0; i < written; ++i) {
                writeValue(row.layout, bytes + i * row.valueSize);
                if (i + 1 != count)
                    text_ << ", ";
            }
            if (written < count)
                text_ << "...";
            text_ << " ] " << count << " elements";
        }

        void writeSpelledType(Nexil::Any const& value)
        {
            auto const type = Nexil::anyToTypeString(value);
            if (!type.empty())
                text_ << " (" << type << ')';
        }

        void writeValue(Layout const& layout, unsigned char const* bytes)
        {
            if (layout.rows == 0) {
                writeLeaf(layout, bytes, "");
                return;
            }
            if (layout.columns == 0) {
                writeRow(layout, bytes);
                return;
            }
            text_ << '{';
            for (unsigned int column = 0; column < layout.columns; ++column) {
                if (column != 0)
                    text_ << ", ";
                writeRow(layout, bytes + column * layout.rows * layout.leafSize);
            }
            text_ << '}';
        }

        void writeRow(Layout const& layout, unsigned char const* bytes)
        {
            text_ << '{';
            for (unsigned int i = 0; i < layout.rows; ++i) {
                if (i != 0)
                    text_ << ", ";
                writeLeaf(layout, bytes + i * layout.leafSize, layout.leaf == Layout::Leaf::Float ? "f" : "");
            }
            text_ << '}';
        }

        void writeLeaf(Layout const& layout, unsigned char const* bytes, char const* suffix)
        {
            switch (layout.leaf) {
            case Layout::Leaf::String: text_ << *reinterpret_cast<Nexil::String const*>(bytes); break;
            case Layout::Leaf::Bool: text_ << (*bytes != 0); break;
            case Layout::Leaf::Float: text_ << read<float>(bytes); break;
            case Layout::Leaf::Double: text_ << read<double>(bytes); break;
            case Layout::Leaf::Signed: text_ << readSigned(layout.leafSize, bytes); break;
            case Layout::Leaf::Unsigned: text_ << readUnsigned(layout.leafSize, bytes); break;
            }
            text_ << suffix;
        }

        template <class T>
        static T read(unsigned char const* bytes)
        {
            T value;
            std::memcpy(&value, bytes, sizeof(T));
            return value;
        }

        static std::int64_t readSigned(unsigned int size, unsigned char const* bytes)
        {
            switch (size) {
            case 1: return read<std::int8_t>(bytes);
            case 2: return read<std::int16_t>(bytes);
            case 4: return read<std::int32_t>(bytes);
            default: return read<std::int64_t>(bytes);
            }
        }

        static std::uint64_t readUnsigned(unsigned int size, unsigned char const* bytes)
        {
            switch (size) {
            case 1: return read<std::uint8_t>(bytes);
            case 2: return read<std::uint16_t>(bytes);
            case 4: return read<std::uint32_t>(bytes);
            default: return read<std::uint64_t>(bytes);
            }
        }

        std::ostringstream text_;
        unsigned long long maxElements_;
        std::vector<Open> open_;
        std::unordered_set<Object const*> written_;
        unsigned int repeatCount_ = 0;
    };

} // namespace

DebugDumpInterface::DebugDumpInterface() = default;
DebugDumpInterface::DebugDumpInterface(DebugDumpInterface const&) = default;
DebugDumpInterface& DebugDumpInterface::operator=(DebugDumpInterface const&) = default;
DebugDumpInterface::~DebugDumpInterface() = default;

void debugDumpToStream(DebugDumpInterface& sink, Object const& object, unsigned long long maxElements)
{
    Dump dump(maxElements);
    dump.write(object);
    std::string const text = std::move(dump).text();
    sink.write(text.data(), text.size());
}

} // namespace Veldrin::Geometry::Internal
