#pragma once

#include <veldrin/object/Object.h>

#include <cstddef>
#include <string>
#include <string_view>
#include <type_traits>
#include <utility>

/// Typed reading and storing of properties.
namespace Veldrin {

namespace Internal {

    template <class T>
    struct WritablePointer : std::false_type {};
    template <class T>
    struct WritablePointer<Nexil::MutablePtr<T>> : std::true_type {
        using Shared = Nexil::Ptr<T>;
    };

} // namespace Internal

/// The value under `key` when it is exactly a T, else T(): null for pointers, "" for strings, 0 for numbers.
template <class T>
[[nodiscard]] T getPropertyAs(Object const& object, Nexil::String const& key)
{
    Nexil::Any value = object.getProperty(key);
    auto* const typed = value.get<T>();
    return typed ? std::move(*typed) : T();
}

/// Stores `value` under `key`; false, and nothing stored, under an empty key.
///
/// What the object model knows only by its base is stored as that: a writable pointer becomes a shared one, a pointer to
/// a class derived from Object a `Ptr<Object>`, a text constant or
/// standard string a `String`.
template <class T>
bool setProperty(Object& object, Nexil::String const& key, T&& value)
{
    using Value = std::decay_t<T>;
    static_assert(!std::is_same_v<Value, std::nullptr_t>, "say of which type the null pointer is");
    if constexpr (std::is_convertible_v<Value, Nexil::Ptr<Object>>)
        return object.setPropertyAny(key, Nexil::Ptr<Object>(std::forward<T>(value)));
    else if constexpr (Internal::WritablePointer<Value>::value)
        return object.setPropertyAny(key, typename Internal::WritablePointer<Value>::Shared(std::forward<T>(value)));
    else if constexpr (std::is_same_v<Value, std::string> || std::is_same_v<Value, std::string_view>)
        return object.setPropertyAny(key, Nexil::String(std::string_view(value)));
    else if constexpr (std::is_convertible_v<Value, char const*>)
        return object.setPropertyAny(key, Nexil::String(value));
    else
        return object.setPropertyAny(key, Nexil::Any(std::forward<T>(value)));
}

/// Moves all properties of `from` to `to`, in their order, replacing those that are there already.
///
/// All or none: where one is refused, which false tells, or memory runs out, `to` is as it was; `from` is then left without
/// some of its properties.
VELDRIN_PLATFORM_API bool moveProperties(Object& from, Object& to);

} // namespace Veldrin
