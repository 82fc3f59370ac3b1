#pragma once

#include <nexil/Any.h>

#include <cstdint>
#include <string>
#include <vector>

/// What the tool has to know of the types that zon files hold, as data: sizes, components and how to get at the bytes.
/// Whoever compares or measures values works on bytes by these rows, so that nothing is compiled once per type.
namespace Zon {

enum class ScalarKind { UInt8, UInt16, UInt32, UInt64, Int8, Int16, Int32, Int64, Float32, Float64, Bool, Text };

/// A value type: `componentCount` scalars one behind the other.
struct ValueRow {
    std::string name; ///< as the dump spells it: "float", "Math::float3"
    ScalarKind kind;
    unsigned int componentCount;
    unsigned int byteCount; ///< of one value
};

/// The values that an Any holds.
struct ValueView {
    void const* data = nullptr;
    std::uint64_t size = 0;
    bool isNull = false;
    /// Equal for views of one and the same array; null for a single value.
    void const* identity = nullptr;
};

/// How a type that holds values of a row is read.
struct KnownType {
    enum class Shape { Value, Array, ArrayOfArrays };

    ValueRow const* row;
    Shape shape;
    /// The value, or the elements; for arrays of arrays only size, isNull and identity count.
    ValueView (*view)(Nexil::Any const& value);
    /// The elements of array `index` of an array of arrays; null otherwise.
    ValueView (*inner)(Nexil::Any const& value, std::uint64_t index);
};

/// The 120 value types in the order of their numbers in files.
[[nodiscard]] std::vector<ValueRow> const& valueRows();

/// Null for an empty Any and for what is no value of a row, no array of them and no array of such arrays.
[[nodiscard]] KnownType const* knownType(Nexil::Any const& value);

/// The type's name as the dump spells it; "nothing" for an empty Any.
[[nodiscard]] std::string typeName(Nexil::Any const& value);

/// The name of the type that has this number in files; "" for none.
[[nodiscard]] std::string typeNameOfCode(std::uint64_t code);

/// Bytes of everything that the value holds, each shared array and object once. Numbers count with their size, texts
/// with their length, pointers with nothing.
[[nodiscard]] std::uint64_t decodedBytes(Nexil::Any const& value);

} // namespace Zon
