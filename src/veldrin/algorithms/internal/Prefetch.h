#pragma once

#include <cstdint>

namespace Veldrin::Geometry {

/// Has array[index] brought to the cache, for a loop that comes to it soon: it is faster than what the machine foresees by
/// itself where pages are left behind quickly. Any index may be given.
template <class T>
[[gnu::always_inline]] inline void prefetch(T const* array, std::uint64_t index) noexcept
{
    __builtin_prefetch(reinterpret_cast<void const*>(reinterpret_cast<std::uintptr_t>(array) + index * sizeof(T)));
}

} // namespace Veldrin::Geometry
