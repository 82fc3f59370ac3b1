#include <support/StreamDescription.h>

#include <nexil/Any.h>
#include <veldrin/geometry/DataInterpolationMode.h>
#include <veldrin/geometry/GeoLocation.h>
#include <veldrin/geometry/internal/ValueTypes.h>
#include <veldrin/math/FCurve.h>
#include <veldrin/volume/VldProxyDescription.h>

#include <nlohmann/json.hpp>
#include <xxhash.h>

#include <string>
#include <type_traits>
#include <typeindex>
#include <unordered_map>

namespace support {

namespace {

    using Veldrin::Geometry::Common::GeoLocation;
    using FCurve = Veldrin::Math::FCurve;
    using nlohmann::json;
    using ObjectPtr = Nexil::Ptr<Veldrin::Object>;
    template <class T>
    using ArrayPtr = Nexil::Ptr<Nexil::Array<T>>;

    std::string hex(void const* bytes, std::size_t count)
    {
        constexpr char kDigits[] = "0123456789abcdef";
        std::string text;
        for (std::size_t i = 0; i < count; ++i) {
            auto const byte = static_cast<unsigned char const*>(bytes)[i];
            text += {kDigits[byte >> 4], kDigits[byte & 15]};
        }
        return text;
    }

    template <class Elements, class One>
    json listed(Elements const& elements, One const& one)
    {
        json list = json::array();
        for (auto const& element : elements)
            list.push_back(one(element));
        return list;
    }

    /// One describer numbers what it meets, so it describes one set of objects.
    class StreamDescriber {
    public:
        json value(ObjectPtr const& held)
        {
            return shared(held, [&](json& description) {
                Veldrin::Object const& content = contentOf(*held);
                if (&content != held.get())
                    description["proxy"] = true;
                description["properties"] = listed(content.keys(), [&](Nexil::String const& key) {
                    Nexil::Any const property = content.getProperty(key);
                    json const frame = value(property);
                    return property.empty() ? json{value(key), nullptr, nullptr} : json{value(key), frame[0], frame[1]};
                });
            });
        }

    private:
        struct Type {
            unsigned int code;
            json (*describe)(StreamDescriber&, Nexil::Any const&);
        };

        template <class T>
            requires std::is_trivially_copyable_v<T>
        json value(T const& held)
        {
            if constexpr (std::is_integral_v<T>)
                return held;
            else if constexpr (std::is_enum_v<T>)
                return static_cast<unsigned int>(held);
            else
                return hex(&held, sizeof(held));
        }

        /// One character for each byte.
        json value(Nexil::String const& bytes)
        {
            std::string text;
            for (char const byte : bytes.view()) {
                auto const code = static_cast<unsigned char>(byte);
                if (code < 0x80)
                    text += byte;
                else
                    text += {static_cast<char>(0xC0 | code >> 6), static_cast<char>(0x80 | (code & 0x3F))};
            }
            return text;
        }

        json value(Nexil::Ptr<FCurve> const& curve)
        {
            if (!curve)
                return nullptr;
            auto const tangent = [&](FCurve::Tangent const& t) { return json{value(t.time), value(t.value)}; };
            auto const key = [&](FCurve::Key const& k) {
                return json{value(k.time), value(k.value), tangent(k.in), tangent(k.out), value(k.interpolation)};
            };
            return {{"pre", value(curve->preExtrapolation())},
                    {"post", value(curve->postExtrapolation())},
                    {"keys", listed(curve->keys(), key)}};
        }

        json value(GeoLocation const& held)
        {
            json list = listed(held.ids, [this](unsigned int id) { return value(id); });
            for (float const parameter : held.params)
                list.push_back(value(parameter));
            list.push_back(value(held.indices));
            list.push_back(value(held.weights));
            return list;
        }

        /// With the code of its type.
        json value(Nexil::Any const& held)
        {
            if (held.empty())
                return nullptr;
            auto const type = types().find(std::type_index(*held.type().info()));
            return type == types().end() ? json{-1, "unknown"}
                                         : json{type->second.code, type->second.describe(*this, held)};
        }

        template <class T>
        json value(ArrayPtr<T> const& array)
        {
            return shared(array, [&](json& description) {
                description["count"] = array->size();
                if constexpr (std::is_trivially_copyable_v<T> && !std::is_enum_v<T>) {
                    std::size_t const size = array->size() * sizeof(T);
                    XXH64_canonical_t hash;
                    XXH64_canonicalFromHash(&hash, XXH3_64bits(array->data(), size));
                    if (size <= 64)
                        description["bytes"] = hex(array->data(), size);
                    else
                        description["xxh3"] = hex(hash.digest, sizeof(hash.digest));
                } else {
                    description["elements"] = listed(*array, [this](T const& part) { return value(part); });
                }
            });
        }

        /// A shared value: described where it is met first, by its number where it is met again.
        template <class Pointer, class Describe>
        json shared(Pointer const& held, Describe const& describe)
        {
            if (!held)
                return nullptr;
            auto const [place, isNew] = numbers_.try_emplace(held.get(), numbers_.size());
            if (!isNew)
                return {{"ref", place->second}};
            json description{{"id", place->second}};
            describe(description);
            return description;
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
    StreamDescriber describer;
    return listed(objects, [&](ObjectPtr const& object) { return describer.value(object); }).dump();
}

} // namespace support
