#pragma once

#include <nexil/Export.h>
#include <nexil/String.h>

#include <cstddef>
#include <functional>
#include <typeinfo>

namespace Nexil {

/// The identity of an exact type. Equal across shared libraries for equal types; a default one stands for no type.
///
/// Cost: comparing equal identities made in one library is a pointer compare; other pairs compare the type's name.
class TypeId {
public:
    constexpr TypeId() noexcept = default;
    constexpr TypeId(std::type_info const& info) noexcept : info_(&info) {}

    template <class T>
    [[nodiscard]] static TypeId of() noexcept
    {
        return TypeId(typeid(T));
    }

    [[nodiscard]] std::type_info const* info() const noexcept { return info_; }
    [[nodiscard]] explicit operator bool() const noexcept { return info_ != nullptr; }

    // The addresses differ where a library keeps its own copy of a template's type information, so equal types are told
    // by what std::type_info compares, not by address alone.
    friend bool operator==(TypeId a, TypeId b) noexcept
    {
        return a.info_ == b.info_ || (a.info_ && b.info_ && *a.info_ == *b.info_);
    }

    [[nodiscard]] std::size_t hash() const noexcept { return info_ ? info_->hash_code() : 0; }

private:
    std::type_info const* info_ = nullptr;
};

namespace Internal {

    /// Names of types for messages to people. Never stored, never compared.
    struct VELDRIN_PLATFORM_API DebugTypeId {
        /// The C++ spelling of the type, or "" for no type.
        [[nodiscard]] static String getTypeNameForDebugOnly(TypeId const& type);
    };

} // namespace Internal

} // namespace Nexil

template <>
struct std::hash<Nexil::TypeId> {
    std::size_t operator()(Nexil::TypeId type) const noexcept { return type.hash(); }
};
