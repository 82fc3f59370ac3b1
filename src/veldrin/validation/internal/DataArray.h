#pragma once

#include <nexil/Array.h>
#include <nexil/Ptr.h>
#include <veldrin/geometry/Names.h>
#include <veldrin/object/Properties.h>

namespace Veldrin::Geometry::Internal {

/// The "data" of the object under `name` when it is an array of T; null otherwise.
template <class T>
[[nodiscard]] Nexil::Ptr<Nexil::Array<T>> dataArray(Object const& geometry, char const* name)
{
    auto const geoProp = getPropertyAs<Nexil::Ptr<Object>>(geometry, name);
    return geoProp ? getPropertyAs<Nexil::Ptr<Nexil::Array<T>>>(*geoProp, sData) : nullptr;
}

} // namespace Veldrin::Geometry::Internal
