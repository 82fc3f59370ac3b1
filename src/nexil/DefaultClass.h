#pragma once

#include <nexil/Ptr.h>

namespace Nexil::Internal {

/// The shared default value that stands for a missing T. Exists for `Veldrin::Object` and `Veldrin::Math::FCurve`,
/// each defined beside its class. Never null, never changed; every call gives the same address.
template <class T>
[[nodiscard]] Ptr<T> const& getDefaultClass();

} // namespace Nexil::Internal
