#pragma once

#include <nexil/Any.h>
#include <nexil/Array.h>
#include <nexil/Ptr.h>
#include <nexil/TypeId.h>

#include <cstddef>
#include <cstdint>

/// The types that a stream holds, with what the packer and the unpackers need to handle each without naming it.
namespace Veldrin::IO {

/// Type codes beyond the value types' own (0 to 119).
namespace TypeCode {

    inline constexpr unsigned int kString = 11;
    inline constexpr unsigned int kArray = 120;       ///< plus the element's code: `Ptr<Array<T>>`
    inline constexpr unsigned int kNestedArray = 240; ///< plus the element's code: `Ptr<Array<Ptr<Array<T>>>>`
    inline constexpr unsigned int kInterpolation = 360;
    inline constexpr unsigned int kInterpolationArray = 361;
    inline constexpr unsigned int kObject = 362;
    inline constexpr unsigned int kObjectArray = 363;
    inline constexpr unsigned int kNestedObjectArray = 364;
    inline constexpr unsigned int kCurve = 365;
    inline constexpr unsigned int kCurveArray = 366;
    inline constexpr unsigned int kGeoLocation = 367;
    inline constexpr unsigned int kGeoLocationArray = 368;
    inline constexpr unsigned int kAnyArray = 369;
    inline constexpr unsigned int kCount = 370;
    inline constexpr unsigned int kUnknown = ~0u;

    inline constexpr unsigned int kUnsignedIntArray = kArray + 2;
    inline constexpr unsigned int kFloatArray = kArray + 8;
    inline constexpr unsigned int kUnsignedLongArray = kArray + 3;

    [[nodiscard]] constexpr bool isScalar(unsigned int code) noexcept
    {
        return code < kString;
    }
    [[nodiscard]] constexpr bool isMathValue(unsigned int code) noexcept
    {
        return code > kString && code < kArray;
    }
    [[nodiscard]] constexpr bool isValueArray(unsigned int code) noexcept
    {
        return code >= kArray && code < kNestedArray;
    }
    [[nodiscard]] constexpr bool isNestedValueArray(unsigned int code) noexcept
    {
        return code >= kNestedArray && code < kInterpolation;
    }
    /// An array whose elements are stored as their bytes.
    [[nodiscard]] constexpr bool isTrivialArray(unsigned int code) noexcept
    {
        return isValueArray(code) && code != kArray + kString;
    }
    /// A shared pointer to an object or an array: what a stream shares, and what may stand as an entry of its own.
    [[nodiscard]] constexpr bool isShareable(unsigned int code) noexcept
    {
        return (code >= kArray && code < kInterpolation) || code == kInterpolationArray || code == kObject ||
               code == kObjectArray || code == kNestedObjectArray || code == kCurveArray || code == kGeoLocationArray ||
               code == kAnyArray;
    }
    /// The code of the arrays that are the elements of a nested array.
    [[nodiscard]] constexpr unsigned int elementOfNested(unsigned int code) noexcept
    {
        return code == kNestedObjectArray ? kObjectArray : code - kNestedArray + kArray;
    }

} // namespace TypeCode

/// The elements of an array of plain values, as bytes.
struct ArrayBytes {
    std::byte const* bytes = nullptr;
    std::uint64_t count = 0;
};

/// An array made for a reader: the pointer that will be stored, and where its elements are to be written. Trivial
/// elements are not filled.
struct NewArray {
    Nexil::Any pointer;
    std::byte* bytes = nullptr;
};

/// A value type of codes 0 to 119 (`string` has no row functions but those for nested arrays): one instance a type.
struct ValueRow {
    char const* name = nullptr;
    std::uint32_t elementSize = 0;
    bool holdsBools = false;
    Nexil::Any (*fromBytes)(std::byte const* bytes) = nullptr;
    NewArray (*newArray)(std::uint64_t count) = nullptr;
    /// Nested array whose `count` elements are the pointers in `arrays`, each of exactly the element type.
    Nexil::Any (*nestArrays)(Nexil::Any const* arrays, std::uint64_t count) = nullptr;
};

/// How the packer looks into a value of one exact C++ type. Twin types (`long`) have their own under the same code.
struct StreamType {
    unsigned int code = TypeCode::kUnknown;
    std::uint32_t elementSize = 0;
    /// Scalars and math values: the value's bytes.
    std::byte const* (*valueBytes)(Nexil::Any const& value) = nullptr;
    /// Trivial arrays: the elements; only for pointers that are not null.
    ArrayBytes (*arrayBytes)(Nexil::Any const& pointer) = nullptr;
    /// Shareable types: address and number of holders of what is pointed to; null address for a null pointer.
    void const* (*address)(Nexil::Any const& pointer, std::uint64_t& useCount) = nullptr;
    /// Nested arrays: number of elements, and one of them as a pointer of its own type.
    std::uint64_t (*nestedCount)(Nexil::Any const& pointer) = nullptr;
    Nexil::Any (*nestedElement)(Nexil::Any const& pointer, std::uint64_t index) = nullptr;
};

/// The row of a value type; `code` is below 120.
[[nodiscard]] ValueRow const& valueRow(unsigned int code);

/// What a stream makes of the exact type of `value`; code kUnknown for what it cannot hold.
/// Cost: one look-up in a hash table. Threads: any.
[[nodiscard]] StreamType const& streamTypeOf(Nexil::Any const& value);

/// The exact type that a value of `code` has once read; `code` is below TypeCode::kCount.
[[nodiscard]] Nexil::TypeId typeOfCode(unsigned int code);

/// A null pointer of the type that a value of `code` has; `code` is a pointer type's.
[[nodiscard]] Nexil::Any nullPointer(unsigned int code);

} // namespace Veldrin::IO
