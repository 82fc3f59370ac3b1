#pragma once

#include <veldrin/object/Object.h>

#include <typeinfo>

namespace Veldrin {

/// A look at an object's own table, for readers that would otherwise copy every name and value.
struct ObjectAccess {
    /// The table; null when the object's class presents its properties by other means.
    [[nodiscard]] static Internal::PropertyTable const* table(Object const& object) noexcept
    {
        return typeid(object) == typeid(Object) ? &object.properties_ : nullptr;
    }
};

} // namespace Veldrin
