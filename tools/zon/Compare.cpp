#include "Compare.h"

#include "ValueRows.h"

#include <nexil/String.h>
#include <veldrin/geometry/DataInterpolationMode.h>
#include <veldrin/geometry/GeoLocation.h>
#include <veldrin/math/FCurve.h>
#include <veldrin/object/Object.h>
#include <veldrin/volume/VldProxyDescription.h>

#include <fmt/format.h>
#include <fmt/ranges.h>

#include <algorithm>
#include <bit>
#include <cmath>
#include <cstring>
#include <deque>
#include <unordered_set>

namespace Zon {

namespace {

    using namespace Veldrin;
    using Geometry::Common::DataInterpolationMode;
    using Geometry::Common::GeoLocation;
    using ObjectPtr = Nexil::Ptr<Object>;
    template <class T>
    using ArrayPtr = Nexil::Ptr<Nexil::Array<T>>;

    template <class T>
    T load(void const* bytes)
    {
        T value;
        std::memcpy(&value, bytes, sizeof value);
        return value;
    }

    template <class Float, class Bits>
    std::string floatText(Float value)
    {
        // Two NaNs differ in bits that their name does not show.
        return std::isnan(value) ? fmt::format("nan({:#x})", std::bit_cast<Bits>(value)) : fmt::format("{}", value);
    }

    std::string scalarText(ScalarKind kind, void const* bytes)
    {
        switch (kind) {
        case ScalarKind::UInt8: return fmt::format("{}", unsigned(load<std::uint8_t>(bytes)));
        case ScalarKind::UInt16: return fmt::format("{}", load<std::uint16_t>(bytes));
        case ScalarKind::UInt32: return fmt::format("{}", load<std::uint32_t>(bytes));
        case ScalarKind::UInt64: return fmt::format("{}", load<std::uint64_t>(bytes));
        case ScalarKind::Int8: return fmt::format("{}", int(load<std::int8_t>(bytes)));
        case ScalarKind::Int16: return fmt::format("{}", load<std::int16_t>(bytes));
        case ScalarKind::Int32: return fmt::format("{}", load<std::int32_t>(bytes));
        case ScalarKind::Int64: return fmt::format("{}", load<std::int64_t>(bytes));
        case ScalarKind::Float32: return floatText<float, std::uint32_t>(load<float>(bytes));
        case ScalarKind::Float64: return floatText<double, std::uint64_t>(load<double>(bytes));
        case ScalarKind::Bool: return load<std::uint8_t>(bytes) ? "true" : "false";
        case ScalarKind::Text: break;
        }
        auto const text = static_cast<Nexil::String const*>(bytes)->view();
        constexpr std::size_t kMost = 60;
        return fmt::format("\"{}\"{}", text.substr(0, kMost), text.size() > kMost ? "..." : "");
    }

    std::string valueText(ValueRow const& row, void const* bytes)
    {
        if (row.componentCount == 1)
            return scalarText(row.kind, bytes);
        std::string text = "(";
        unsigned int const step = row.byteCount / row.componentCount;
        for (unsigned int i = 0; i < row.componentCount; ++i)
            text += (i ? ", " : "") + scalarText(row.kind, static_cast<char const*>(bytes) + i * step);
        return text + ")";
    }

    template <class Float>
    bool isNear(void const* first, void const* second, double tolerance)
    {
        auto const a = load<Float>(first);
        auto const b = load<Float>(second);
        return a == b || std::abs(static_cast<double>(a) - static_cast<double>(b)) <= tolerance;
    }

    /// A number in room for any kind of value: what reads it by its row looks the same to the compiler for all kinds.
    struct Padded {
        template <class Number>
        explicit Padded(Number number)
        {
            std::memcpy(bytes, &number, sizeof number);
        }
        alignas(8) char bytes[sizeof(Nexil::String)] = {};
    };

    struct PairHash {
        std::size_t operator()(std::pair<void const*, void const*> const& pair) const noexcept
        {
            std::hash<void const*> const hash;
            return hash(pair.first) * 31 + hash(pair.second);
        }
    };

    /// What a proxy of a volume holds in a file: as an object it shows neither tiles nor the size of voxels, and the indices
    /// of a container would have to be made.
    ObjectPtr described(ObjectPtr const& object)
    {
        Object description;
        return Geometry::describeVldProxy(*object, description) ? Nexil::makePtr<Object>(std::move(description))
                                                                : object;
    }

    ValueRow const& row(ScalarKind kind)
    {
        return valueRows()[static_cast<std::size_t>(kind)];
    }

    /// Compares pair after pair from a queue, nearest to the top first.
    class Comparison {
    public:
        explicit Comparison(CompareOptions const& options) : options_(options) {}

        std::vector<Difference> run(Objects const& first, Objects const& second)
        {
            if (first.size() != second.size())
                report({"objects"}, "size", fmt::format("{}", first.size()), fmt::format("{}", second.size()));
            for (std::uint64_t i = 0; i < std::min(first.size(), second.size()); ++i)
                push(first[i], second[i], kTop, fmt::format("object {}", i));
            while (!queue_.empty() && !isFull()) {
                Pair const pair = std::move(queue_.front());
                queue_.pop_front();
                compareValues(pair);
            }
            return std::move(differences_);
        }

    private:
        static constexpr std::size_t kTop = ~std::size_t(0);

        struct Place {
            std::size_t parent;
            std::string name;
        };

        struct Pair {
            Nexil::Any first;
            Nexil::Any second;
            std::size_t place;
        };

        [[nodiscard]] bool isFull() const { return differences_.size() >= options_.maxDifferences; }

        std::size_t addPlace(std::size_t parent, std::string name)
        {
            places_.push_back({parent, std::move(name)});
            return places_.size() - 1;
        }

        void push(Nexil::Any first, Nexil::Any second, std::size_t parent, std::string name)
        {
            queue_.push_back({std::move(first), std::move(second), addPlace(parent, std::move(name))});
        }

        void report(std::vector<std::string> path, std::string what, std::string first, std::string second)
        {
            if (!isFull())
                differences_.push_back({std::move(path), std::move(what), std::move(first), std::move(second)});
        }

        void report(std::size_t place, std::string_view element, std::string what, std::string first,
                    std::string second)
        {
            std::vector<std::string> path;
            if (!element.empty())
                path.emplace_back(element);
            for (; place != kTop; place = places_[place].parent)
                path.push_back(places_[place].name);
            std::reverse(path.begin(), path.end());
            report(std::move(path), std::move(what), std::move(first), std::move(second));
        }

        /// False when this pair of addresses need not be compared: both null, one null (reported), or seen before.
        bool mustCompare(void const* first, void const* second, std::size_t place, std::string_view element = {})
        {
            if (!first || !second) {
                if (first != second)
                    report(place, element, "null", first ? "a value" : "null", second ? "a value" : "null");
                return false;
            }
            return first != second && seen_.emplace(first, second).second;
        }

        void compareValues(Pair const& pair)
        {
            if (!(pair.first.type() == pair.second.type())) {
                report(pair.place, {}, "type", typeName(pair.first), typeName(pair.second));
                return;
            }
            if (pair.first.empty())
                return;
            if (auto const* const known = knownType(pair.first))
                compareKnown(*known, pair);
            else if (auto const* const object = pair.first.get<ObjectPtr>())
                compareObjects(*object, *pair.second.get<ObjectPtr>(), pair.place);
            else if (auto const* const curve = pair.first.get<Nexil::Ptr<Math::FCurve>>())
                compareCurves(*curve, *pair.second.get<Nexil::Ptr<Math::FCurve>>(), pair.place);
            else if (auto const* const location = pair.first.get<GeoLocation>())
                compareLocations(*location, *pair.second.get<GeoLocation>(), pair.place);
            else if (auto const* const mode = pair.first.get<DataInterpolationMode>())
                compareModes(*mode, *pair.second.get<DataInterpolationMode>(), pair.place);
            else if (!(compareElements<ObjectPtr>(pair) || compareElements<ArrayPtr<ObjectPtr>>(pair) ||
                       compareElements<Nexil::Ptr<Math::FCurve>>(pair) || compareElements<GeoLocation>(pair) ||
                       compareElements<DataInterpolationMode>(pair) || compareElements<Nexil::Any>(pair)))
                report(pair.place, {}, "type", "cannot be compared: " + typeName(pair.first), typeName(pair.second));
        }

        /// Queues the elements of two arrays of T; false when the pair holds something else.
        template <class T>
        bool compareElements(Pair const& pair)
        {
            auto const* const first = pair.first.get<ArrayPtr<T>>();
            if (!first)
                return false;
            auto const& second = *pair.second.get<ArrayPtr<T>>();
            if (!mustCompare(first->get(), second.get(), pair.place))
                return true;
            compareSizes((*first)->size(), second->size(), pair.place);
            for (std::uint64_t i = 0; i < std::min((*first)->size(), second->size()); ++i)
                push((**first)[i], (*second)[i], pair.place, fmt::format("[{}]", i));
            return true;
        }

        bool compareSizes(std::uint64_t first, std::uint64_t second, std::size_t place, std::string_view element = {})
        {
            if (first != second)
                report(place, element, "size", fmt::format("{}", first), fmt::format("{}", second));
            return first == second;
        }

        void compareKnown(KnownType const& known, Pair const& pair)
        {
            auto const first = known.view(pair.first);
            auto const second = known.view(pair.second);
            if (known.shape == KnownType::Shape::Value) {
                if (!isEqual(*known.row, first.data, second.data))
                    report(pair.place, {}, "value", valueText(*known.row, first.data),
                           valueText(*known.row, second.data));
                return;
            }
            if (!mustCompare(first.identity, second.identity, pair.place))
                return;
            if (known.shape == KnownType::Shape::Array) {
                compareViews(*known.row, first, second, pair.place, "");
                return;
            }
            compareSizes(first.size, second.size, pair.place);
            for (std::uint64_t i = 0; i < std::min(first.size, second.size) && !isFull(); ++i) {
                auto const innerFirst = known.inner(pair.first, i);
                auto const innerSecond = known.inner(pair.second, i);
                auto const element = fmt::format("[{}]", i);
                if (mustCompare(innerFirst.identity, innerSecond.identity, pair.place, element))
                    compareViews(*known.row, innerFirst, innerSecond, pair.place, element);
            }
        }

        void compareViews(ValueRow const& valueRow, ValueView const& first, ValueView const& second, std::size_t place,
                          std::string const& prefix)
        {
            compareSizes(first.size, second.size, place, prefix);
            std::uint64_t const count = std::min(first.size, second.size);
            auto const* const a = static_cast<char const*>(first.data);
            auto const* const b = static_cast<char const*>(second.data);
            // Equal bytes are equal values; text is held by address.
            if (count == 0 || (valueRow.kind != ScalarKind::Text && std::memcmp(a, b, count * valueRow.byteCount) == 0))
                return;
            for (std::uint64_t i = 0; i < count && !isFull(); ++i) {
                auto const offset = i * valueRow.byteCount;
                if (!isEqual(valueRow, a + offset, b + offset))
                    report(place, fmt::format("{}[{}]", prefix, i), "value", valueText(valueRow, a + offset),
                           valueText(valueRow, b + offset));
            }
        }

        [[nodiscard]] bool isEqual(ValueRow const& valueRow, void const* first, void const* second) const
        {
            if (valueRow.kind == ScalarKind::Text)
                return *static_cast<Nexil::String const*>(first) == *static_cast<Nexil::String const*>(second);
            if (std::memcmp(first, second, valueRow.byteCount) == 0)
                return true;
            bool const isFloat = valueRow.kind == ScalarKind::Float32;
            if (!options_.tolerance || (!isFloat && valueRow.kind != ScalarKind::Float64))
                return false;
            unsigned int const step = valueRow.byteCount / valueRow.componentCount;
            for (unsigned int offset = 0; offset < valueRow.byteCount; offset += step) {
                auto const* const a = static_cast<char const*>(first) + offset;
                auto const* const b = static_cast<char const*>(second) + offset;
                bool const near =
                    isFloat ? isNear<float>(a, b, *options_.tolerance) : isNear<double>(a, b, *options_.tolerance);
                if (!near && std::memcmp(a, b, step) != 0)
                    return false;
            }
            return true;
        }

        void compareObjects(ObjectPtr const& first, ObjectPtr const& second, std::size_t place)
        {
            if (mustCompare(first.get(), second.get(), place))
                compareProperties(described(first), described(second), place);
        }

        void compareProperties(ObjectPtr const& first, ObjectPtr const& second, std::size_t place)
        {
            auto const firstKeys = first->keys();
            auto const secondKeys = second->keys();
            std::vector<std::string_view> firstCommon;
            std::vector<std::string_view> secondCommon;
            for (auto const& key : firstKeys) {
                if (second->hasProperty(key))
                    firstCommon.push_back(key.view());
                else
                    report(place, key.view(), "missing", typeName(first->getProperty(key)), "nothing");
            }
            for (auto const& key : secondKeys) {
                if (first->hasProperty(key))
                    secondCommon.push_back(key.view());
                else
                    report(place, key.view(), "missing", "nothing", typeName(second->getProperty(key)));
            }
            if (firstCommon != secondCommon) {
                std::size_t at = 0;
                while (firstCommon[at] == secondCommon[at])
                    ++at;
                report(place, {}, "order", fmt::format("\"{}\"", firstCommon[at]),
                       fmt::format("\"{}\"", secondCommon[at]));
            }
            for (auto const key : firstCommon) {
                Nexil::String const name(key);
                push(first->getProperty(name), second->getProperty(name), place, std::string(key));
            }
        }

        void compareCurves(Nexil::Ptr<Math::FCurve> const& first, Nexil::Ptr<Math::FCurve> const& second,
                           std::size_t place)
        {
            if (!mustCompare(first.get(), second.get(), place))
                return;
            compareNumbers(static_cast<unsigned int>(first->preExtrapolation()),
                           static_cast<unsigned int>(second->preExtrapolation()), place, "pre_extrapolation");
            compareNumbers(static_cast<unsigned int>(first->postExtrapolation()),
                           static_cast<unsigned int>(second->postExtrapolation()), place, "post_extrapolation");
            auto const& keys = first->keys();
            auto const& otherKeys = second->keys();
            compareSizes(keys.size(), otherKeys.size(), place, "keys");
            for (std::uint64_t i = 0; i < std::min(keys.size(), otherKeys.size()) && !isFull(); ++i) {
                auto const& a = keys[i];
                auto const& b = otherKeys[i];
                auto const name = [&](char const* member) { return fmt::format("keys[{}].{}", i, member); };
                compareNumbers(a.time, b.time, place, name("time"));
                compareNumbers(a.value, b.value, place, name("value"));
                compareNumbers(a.in.time, b.in.time, place, name("in_tangent.time"));
                compareNumbers(a.in.value, b.in.value, place, name("in_tangent.value"));
                compareNumbers(a.out.time, b.out.time, place, name("out_tangent.time"));
                compareNumbers(a.out.value, b.out.value, place, name("out_tangent.value"));
                compareNumbers(static_cast<unsigned int>(a.interpolation), static_cast<unsigned int>(b.interpolation),
                               place, name("interpolation"));
            }
        }

        template <class Number>
        void compareNumbers(Number first, Number second, std::size_t place, std::string_view name)
        {
            auto const& valueRow = row(std::is_same_v<Number, double>  ? ScalarKind::Float64
                                       : std::is_same_v<Number, float> ? ScalarKind::Float32
                                                                       : ScalarKind::UInt32);
            Padded const a(first);
            Padded const b(second);
            if (!isEqual(valueRow, a.bytes, b.bytes))
                report(place, name, "value", valueText(valueRow, a.bytes), valueText(valueRow, b.bytes));
        }

        void compareModes(DataInterpolationMode first, DataInterpolationMode second, std::size_t place)
        {
            compareNumbers(static_cast<unsigned int>(first), static_cast<unsigned int>(second), place, {});
        }

        void compareLocations(GeoLocation const& first, GeoLocation const& second, std::size_t place)
        {
            for (std::size_t i = 0; i < std::size(first.ids); ++i)
                compareNumbers(first.ids[i], second.ids[i], place, fmt::format("ids[{}]", i));
            for (std::size_t i = 0; i < std::size(first.params); ++i)
                compareNumbers(first.params[i], second.params[i], place, fmt::format("params[{}]", i));
            push(first.indices, second.indices, place, "indices");
            push(first.weights, second.weights, place, "weights");
        }

        CompareOptions const& options_;
        std::vector<Place> places_;
        std::deque<Pair> queue_;
        std::unordered_set<std::pair<void const*, void const*>, PairHash> seen_;
        std::vector<Difference> differences_;
    };

} // namespace

std::vector<Difference> compare(Objects const& first, Objects const& second, CompareOptions const& options)
{
    return Comparison(options).run(first, second);
}

std::string pathText(Difference const& difference)
{
    return fmt::format("{}", fmt::join(difference.path, "/"));
}

} // namespace Zon
