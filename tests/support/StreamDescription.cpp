#include <support/StreamDescription.h>

#include <nexil/Any.h>
#include <veldrin/geometry/DataInterpolationMode.h>
#include <veldrin/geometry/GeoLocation.h>
#include <veldrin/geometry/internal/ValueTypes.h>
#include <veldrin/math/FCurve.h>
#include <veldrin/volume/internal/ProxyDescription.h>

#include <xxhash.h>

#include <cstdio>
#include <functional>
#include <string>
#include <string_view>
#include <typeindex>
#include <unordered_map>

namespace support {

namespace {

    class StreamDescriber {
    public:
        std::string describe(Nexil::Array<Nexil::Ptr<Veldrin::Object>> const& objects)
        {
            std::string text;
            for (auto const& object : objects)
                text += (text.empty() ? "" : ",\n") + pointer(362, Nexil::Any(object));
            return text + (text.empty() ? "]}\n" : "\n]}\n");
        }

    private:
        using FCurvePtr = Nexil::Ptr<Veldrin::Math::FCurve>;
        using ObjectPtr = Nexil::Ptr<Veldrin::Object>;
        using GeoLocation = Veldrin::Geometry::Common::GeoLocation;
        using Mode = Veldrin::Geometry::Common::DataInterpolationMode;
        template <class T>
        using ArrayPtr = Nexil::Ptr<Nexil::Array<T>>;

        struct Type {
            unsigned int code;
            std::function<std::string(StreamDescriber&, Nexil::Any const&)> describe;
        };

        static std::string hex(void const* bytes, std::size_t count)
        {
            std::string text = "\"";
            for (std::size_t i = 0; i < count; ++i) {
                char digits[3];
                std::snprintf(digits, sizeof(digits), "%02x", static_cast<unsigned char const*>(bytes)[i]);
                text += digits;
            }
            return text + '"';
        }

        static std::string quoted(std::string_view raw)
        {
            std::string text = "\"";
            for (char const c : raw) {
                auto const byte = static_cast<unsigned char>(c);
                if (byte >= 32 && byte < 127 && c != '"' && c != '\\') {
                    text += c;
                } else {
                    char escape[8];
                    std::snprintf(escape, sizeof(escape), "\\u%04x", byte);
                    text += escape;
                }
            }
            return text + '"';
        }

        template <class T>
        static std::string scalar(T const& value)
        {
            if constexpr (std::is_same_v<T, Nexil::String>)
                return quoted(value.view());
            else if constexpr (std::is_same_v<T, bool>)
                return value ? "true" : "false";
            else if constexpr (std::is_integral_v<T>)
                return std::to_string(value);
            else
                return hex(&value, sizeof(value));
        }

        template <class Elements, class One>
        static std::string listed(Elements const& elements, One const& one)
        {
            std::string text;
            for (auto const& element : elements)
                text += (text.empty() ? "" : ",") + one(element);
            return "[" + text + "]";
        }

        /// A shared value: described where it is met first, by its number where it is met again.
        template <class Pointer, class Content>
        std::string shared(Pointer const& held, Content const& content)
        {
            if (!held)
                return "null";
            auto const [place, isNew] = numbers_.try_emplace(held.get(), numbers_.size());
            std::string const number = std::to_string(place->second);
            return isNew ? "{\"id\":" + number + "," + content() + "}" : "{\"ref\":" + number + "}";
        }

        template <class T, class One>
        std::string elements(ArrayPtr<T> const& array, One const& one)
        {
            return shared(array, [&] {
                return "\"count\":" + std::to_string(array->size()) + ",\"elements\":" + listed(*array, one);
            });
        }

        template <class T>
        std::string valueArray(ArrayPtr<T> const& array)
        {
            if constexpr (std::is_same_v<T, Nexil::String>) {
                return elements(array, [](Nexil::String const& text) { return quoted(text.view()); });
            } else {
                return shared(array, [&] {
                    std::size_t const size = array->size() * sizeof(T);
                    std::string content = "\"count\":" + std::to_string(array->size()) + ",";
                    if (size <= 64)
                        return content + "\"bytes\":" + hex(array->data(), size);
                    char digits[17];
                    std::snprintf(digits, sizeof(digits), "%016llx",
                                  static_cast<unsigned long long>(XXH3_64bits(array->data(), size)));
                    return content + "\"xxh3\":\"" + digits + '"';
                });
            }
        }

        static std::string curve(FCurvePtr const& held)
        {
            if (!held)
                return "null";
            auto mode = [](auto value) { return std::to_string(static_cast<unsigned int>(value)); };
            auto tangent = [](Veldrin::Math::FCurve::Tangent const& t) {
                return "[" + scalar(t.time) + "," + scalar(t.value) + "]";
            };
            return "{\"pre\":" + mode(held->preExtrapolation()) + ",\"post\":" + mode(held->postExtrapolation()) +
                   ",\"keys\":" +
                   listed(held->keys(),
                          [&](Veldrin::Math::FCurve::Key const& key) {
                              return "[" + scalar(key.time) + "," + scalar(key.value) + "," + tangent(key.in) + "," +
                                     tangent(key.out) + "," + mode(key.interpolation) + "]";
                          }) +
                   "}";
        }

        std::string location(GeoLocation const& held)
        {
            std::string const ids = listed(held.ids, &scalar<unsigned int>);
            std::string const params = listed(held.params, &scalar<float>);
            std::string const indices = valueArray(held.indices);
            return ids.substr(0, ids.size() - 1) + "," + params.substr(1, params.size() - 2) + "," + indices + "," +
                   valueArray(held.weights) + "]";
        }

        std::string object(ObjectPtr const& held)
        {
            return shared(held, [&] {
                Veldrin::Object const& content = contentOf(*held);
                std::string const lead = &content == held.get() ? "" : "\"proxy\":true,";
                return lead + "\"properties\":" + listed(content.keys(), [&](Nexil::String const& key) {
                           Nexil::Any const value = content.getProperty(key);
                           std::string const frame = framed(value);
                           return "[" + quoted(key.view()) + "," + (value.empty() ? "null,null]" : frame.substr(1));
                       });
            });
        }

        /// The object itself, or what a file holds for a proxy of a volume.
        Veldrin::Object const& contentOf(Veldrin::Object const& object)
        {
            auto const [place, isNew] = proxies_.try_emplace(&object);
            if (isNew && !Veldrin::Geometry::Internal::describeProxy(object, place->second)) {
                proxies_.erase(place);
                return object;
            }
            return place->second;
        }

        std::string objects(ArrayPtr<ObjectPtr> const& array)
        {
            return elements(array, [this](ObjectPtr const& held) { return object(held); });
        }

        std::string framed(Nexil::Any const& value)
        {
            if (value.empty())
                return "null";
            auto const type = types().find(std::type_index(*value.type().info()));
            if (type == types().end())
                return "[-1,\"unknown\"]";
            return "[" + std::to_string(type->second.code) + "," + type->second.describe(*this, value) + "]";
        }

        std::string pointer(unsigned int code, Nexil::Any const& value)
        {
            std::string const frame = framed(value);
            std::size_t const lead = std::to_string(code).size() + 2;
            return frame.substr(lead, frame.size() - lead - 1);
        }

        template <class T, class Describe>
        static void add(std::unordered_map<std::type_index, Type>& types, unsigned int code, Describe describe)
        {
            types[std::type_index(typeid(T))] = {code, [describe](StreamDescriber& self, Nexil::Any const& value) {
                                                     return describe(self, *value.get<T>());
                                                 }};
        }

        static std::unordered_map<std::type_index, Type> const& types()
        {
            static auto const table = [] {
                using Self = StreamDescriber;
                std::unordered_map<std::type_index, Type> made;
                Veldrin::Geometry::Internal::forEachValueType([&made]<class T>(unsigned int code, char const*) {
                    add<T>(made, code, [](Self&, T const& value) { return scalar(value); });
                    add<ArrayPtr<T>>(made, 120 + code,
                                     [](Self& self, ArrayPtr<T> const& array) { return self.valueArray(array); });
                    add<ArrayPtr<ArrayPtr<T>>>(made, 240 + code, [](Self& self, ArrayPtr<ArrayPtr<T>> const& arrays) {
                        return self.elements(arrays, [&](ArrayPtr<T> const& array) { return self.valueArray(array); });
                    });
                });
                auto mode = [](Mode value) { return std::to_string(static_cast<unsigned int>(value)); };
                add<Mode>(made, 360, [mode](Self&, Mode value) { return mode(value); });
                add<ArrayPtr<Mode>>(
                    made, 361, [mode](Self& self, ArrayPtr<Mode> const& modes) { return self.elements(modes, mode); });
                add<ObjectPtr>(made, 362, [](Self& self, ObjectPtr const& held) { return self.object(held); });
                add<ArrayPtr<ObjectPtr>>(
                    made, 363, [](Self& self, ArrayPtr<ObjectPtr> const& array) { return self.objects(array); });
                add<ArrayPtr<ArrayPtr<ObjectPtr>>>(
                    made, 364, [](Self& self, ArrayPtr<ArrayPtr<ObjectPtr>> const& arrays) {
                        return self.elements(arrays,
                                             [&](ArrayPtr<ObjectPtr> const& array) { return self.objects(array); });
                    });
                add<FCurvePtr>(made, 365, [](Self&, FCurvePtr const& held) { return curve(held); });
                add<ArrayPtr<FCurvePtr>>(made, 366, [](Self& self, ArrayPtr<FCurvePtr> const& array) {
                    return self.elements(array, curve);
                });
                add<GeoLocation>(made, 367, [](Self& self, GeoLocation const& held) { return self.location(held); });
                add<ArrayPtr<GeoLocation>>(made, 368, [](Self& self, ArrayPtr<GeoLocation> const& array) {
                    return self.elements(array, [&](GeoLocation const& held) { return self.location(held); });
                });
                add<ArrayPtr<Nexil::Any>>(made, 369, [](Self& self, ArrayPtr<Nexil::Any> const& array) {
                    return self.elements(array, [&](Nexil::Any const& value) { return self.framed(value); });
                });
                return made;
            }();
            return table;
        }

        std::unordered_map<void const*, std::size_t> numbers_;
        // Kept, so that the addresses of what they hold are no other value's.
        std::unordered_map<Veldrin::Object const*, Veldrin::Object> proxies_;
    };

} // namespace

std::string describeObjects(Nexil::Array<Nexil::Ptr<Veldrin::Object>> const& objects)
{
    return StreamDescriber().describe(objects);
}

} // namespace support
