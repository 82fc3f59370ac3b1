#include <support/StreamDescription.h>

#include <nexil/Any.h>
#include <veldrin/geometry/DataInterpolationMode.h>
#include <veldrin/geometry/GeoLocation.h>
#include <veldrin/geometry/internal/ValueTypes.h>
#include <veldrin/math/FCurve.h>
#include <veldrin/volume/VldProxyDescription.h>

#include <xxhash.h>

#include <cstdio>
#include <string>
#include <string_view>
#include <type_traits>
#include <typeindex>
#include <unordered_map>

namespace support {

namespace {

    using Veldrin::Geometry::Common::GeoLocation;
    using FCurve = Veldrin::Math::FCurve;
    using ObjectPtr = Nexil::Ptr<Veldrin::Object>;
    template <class T>
    using ArrayPtr = Nexil::Ptr<Nexil::Array<T>>;

    std::string hex(void const* bytes, std::size_t count)
    {
        std::string text = "\"";
        for (std::size_t i = 0; i < count; ++i) {
            char digits[3];
            std::snprintf(digits, sizeof(digits), "%02x", static_cast<unsigned char const*>(bytes)[i]);
            text += digits;
        }
        return text + '"';
    }

    std::string quoted(std::string_view raw)
    {
        std::string text = "\"";
        for (char const c : raw) {
            if (c >= 32 && c < 127 && c != '"' && c != '\\')
                text += c;
            else
                text += "\\u00" + hex(&c, 1).substr(1, 2);
        }
        return text + '"';
    }

    template <class Elements, class One>
    std::string listed(Elements const& elements, One const& one)
    {
        std::string text;
        for (auto const& element : elements)
            text += (text.empty() ? "" : ",") + one(element);
        return "[" + text + "]";
    }

    /// One describer numbers what it meets, so it describes one set of objects.
    class StreamDescriber {
    public:
        std::string describe(Nexil::Array<ObjectPtr> const& objects)
        {
            std::string text;
            for (auto const& object : objects)
                text += (text.empty() ? "" : ",\n") + value(object);
            return text + (text.empty() ? "]}\n" : "\n]}\n");
        }

    private:
        struct Type {
            unsigned int code;
            std::string (*describe)(StreamDescriber&, Nexil::Any const&);
        };

        template <class T>
            requires std::is_trivially_copyable_v<T>
        std::string value(T const& held)
        {
            if constexpr (std::is_same_v<T, bool>)
                return held ? "true" : "false";
            else if constexpr (std::is_integral_v<T> || std::is_enum_v<T>)
                return std::to_string(static_cast<std::conditional_t<std::is_enum_v<T>, unsigned int, T>>(held));
            else
                return hex(&held, sizeof(held));
        }

        std::string value(Nexil::String const& text) { return quoted(text.view()); }

        std::string value(Nexil::Ptr<FCurve> const& curve)
        {
            if (!curve)
                return "null";
            auto const tangent = [&](FCurve::Tangent const& t) {
                return "[" + value(t.time) + "," + value(t.value) + "]";
            };
            auto const key = [&](FCurve::Key const& k) {
                return "[" + value(k.time) + "," + value(k.value) + "," + tangent(k.in) + "," + tangent(k.out) + "," +
                       value(k.interpolation) + "]";
            };
            return "{\"pre\":" + value(curve->preExtrapolation()) + ",\"post\":" + value(curve->postExtrapolation()) +
                   ",\"keys\":" + listed(curve->keys(), key) + "}";
        }

        std::string value(GeoLocation const& held)
        {
            auto const each = [this](auto part) { return value(part); };
            std::string const ids = listed(held.ids, each);
            std::string const params = listed(held.params, each);
            std::string const indices = value(held.indices);
            return ids.substr(0, ids.size() - 1) + "," + params.substr(1, params.size() - 2) + "," + indices + "," +
                   value(held.weights) + "]";
        }

        /// With the code of its type.
        std::string value(Nexil::Any const& held)
        {
            if (held.empty())
                return "null";
            auto const type = types().find(std::type_index(*held.type().info()));
            return type == types().end()
                       ? "[-1,\"unknown\"]"
                       : "[" + std::to_string(type->second.code) + "," + type->second.describe(*this, held) + "]";
        }

        template <class T>
        std::string value(ArrayPtr<T> const& array)
        {
            return shared(array, [&] {
                std::string const content = "\"count\":" + std::to_string(array->size()) + ",";
                if constexpr (std::is_trivially_copyable_v<T> && !std::is_enum_v<T>) {
                    std::size_t const size = array->size() * sizeof(T);
                    if (size <= 64)
                        return content + "\"bytes\":" + hex(array->data(), size);
                    XXH64_canonical_t hash;
                    XXH64_canonicalFromHash(&hash, XXH3_64bits(array->data(), size));
                    return content + "\"xxh3\":" + hex(hash.digest, sizeof(hash.digest));
                } else {
                    return content + "\"elements\":" + listed(*array, [this](T const& part) { return value(part); });
                }
            });
        }

        std::string value(ObjectPtr const& held)
        {
            return shared(held, [&] {
                Veldrin::Object const& content = contentOf(*held);
                std::string const lead = &content == held.get() ? "" : "\"proxy\":true,";
                return lead + "\"properties\":" + listed(content.keys(), [&](Nexil::String const& key) {
                           Nexil::Any const property = content.getProperty(key);
                           std::string const frame = value(property);
                           return "[" + value(key) + "," + (property.empty() ? "null,null]" : frame.substr(1));
                       });
            });
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

        /// The object itself, or what a file holds for a proxy of a volume.
        Veldrin::Object const& contentOf(Veldrin::Object const& object)
        {
            auto const [place, isNew] = proxies_.try_emplace(&object);
            if (isNew && !Veldrin::Geometry::describeVldProxy(object, place->second)) {
                proxies_.erase(place);
                return object;
            }
            return place->second;
        }

        static std::unordered_map<std::type_index, Type> const& types()
        {
            static auto const table = [] {
                std::unordered_map<std::type_index, Type> made;
                auto const add = [&made]<class T>(unsigned int code, std::type_identity<T>) {
                    made[std::type_index(typeid(T))] = {
                        code, [](StreamDescriber& self, Nexil::Any const& held) { return self.value(*held.get<T>()); }};
                };
                auto const addWithArray = [&]<class T>(unsigned int code, std::type_identity<T> type) {
                    add(code, type);
                    add(code + 1, std::type_identity<ArrayPtr<T>>());
                };
                Veldrin::Geometry::Internal::forEachValueType([&]<class T>(unsigned int code, char const*) {
                    add(code, std::type_identity<T>());
                    add(120 + code, std::type_identity<ArrayPtr<T>>());
                    add(240 + code, std::type_identity<ArrayPtr<ArrayPtr<T>>>());
                });
                addWithArray(360, std::type_identity<Veldrin::Geometry::Common::DataInterpolationMode>());
                addWithArray(362, std::type_identity<ObjectPtr>());
                add(364, std::type_identity<ArrayPtr<ArrayPtr<ObjectPtr>>>());
                addWithArray(365, std::type_identity<Nexil::Ptr<FCurve>>());
                addWithArray(367, std::type_identity<GeoLocation>());
                add(369, std::type_identity<ArrayPtr<Nexil::Any>>());
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
