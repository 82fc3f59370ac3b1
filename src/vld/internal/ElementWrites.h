#pragma once

#include <cstddef>
#include <cstdint>
#include <cstring>
#include <type_traits>

/// Writing elements of which only the size is known.
namespace VLD::TileTree3D::Internal {

/// Calls body(size), with the frequent sizes as constants, so that copies of them become single instructions.
template <class Body>
void withElementSize(std::size_t size, Body const& body)
{
    switch (size) {
    case 1: return body(std::integral_constant<std::size_t, 1>());
    case 4: return body(std::integral_constant<std::size_t, 4>());
    case 8: return body(std::integral_constant<std::size_t, 8>());
    case 12: return body(std::integral_constant<std::size_t, 12>());
    default: return body(size);
    }
}

template <class Size>
void copyElement(std::byte* to, std::uint64_t toIndex, std::byte const* from, std::uint64_t fromIndex, Size size)
{
    std::memcpy(to + toIndex * size, from + fromIndex * size, size);
}

/// Writes one value to the elements [begin, end).
template <class Size>
void fillElements(std::byte* elements, std::uint64_t begin, std::uint64_t end, std::byte const* value, Size size)
{
    if constexpr (!std::is_same_v<Size, std::size_t>) {
        // A copy that the writes cannot change, so that many go at once.
        std::byte held[Size::value];
        std::memcpy(held, value, size);
        for (std::uint64_t i = begin; i < end; ++i)
            copyElement(elements, i, held, 0, size);
    } else {
        for (std::uint64_t i = begin; i < end; ++i)
            copyElement(elements, i, value, 0, size);
    }
}

} // namespace VLD::TileTree3D::Internal
