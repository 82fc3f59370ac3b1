#pragma once

#include <nexil/Any.h>

/// Types that a program and a library each instantiate for themselves, hidden on both sides.
namespace foreign {

template <class T>
struct Pair {
    T first;
    T second;
};

enum Kind { APair, PointerToArray, Hidden };

/// A value made inside the library.
[[nodiscard]] __attribute__((visibility("default"))) Nexil::Any make(Kind kind);
/// True when the library finds a value as the type it would have made.
[[nodiscard]] __attribute__((visibility("default"))) bool finds(Kind kind, Nexil::Any const& value);

} // namespace foreign
