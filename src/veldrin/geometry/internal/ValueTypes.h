#pragma once

#include <nexil/String.h>
#include <veldrin/math/BBox.h>
#include <veldrin/math/Matrix.h>
#include <veldrin/math/Quaternion.h>
#include <veldrin/math/Vector.h>

/// The value types that objects hold and files store: one table for the stream, the debug dump and the documentation.
///
/// VELDRIN_VALUE_TYPES(ROW) expands ROW(code, type, name) for each. A code is the type's number in every file ever
/// written: rows are never moved, removed or renumbered. `Nexil::String` is the one type that is not plain bytes.
#define VELDRIN_VALUE_TYPES(ROW)                     \
    ROW(0, unsigned char, "unsigned char")           \
    ROW(1, unsigned short, "unsigned short")         \
    ROW(2, unsigned int, "unsigned int")             \
    ROW(3, unsigned long long, "unsigned long long") \
    ROW(4, signed char, "signed char")               \
    ROW(5, short, "short")                           \
    ROW(6, int, "int")                               \
    ROW(7, long long, "long long")                   \
    ROW(8, float, "float")                           \
    ROW(9, double, "double")                         \
    ROW(10, bool, "bool")                            \
    ROW(11, Nexil::String, "string")                 \
    ROW(12, Math::uchar2, "Math::uchar2")            \
    ROW(13, Math::ushort2, "Math::ushort2")          \
    ROW(14, Math::uint2, "Math::uint2")              \
    ROW(15, Math::ulong2, "Math::ulong2")            \
    ROW(16, Math::char2, "Math::char2")              \
    ROW(17, Math::short2, "Math::short2")            \
    ROW(18, Math::int2, "Math::int2")                \
    ROW(19, Math::long2, "Math::long2")              \
    ROW(20, Math::float2, "Math::float2")            \
    ROW(21, Math::double2, "Math::double2")          \
    ROW(22, Math::bool2, "Math::bool2")              \
    ROW(23, Math::uchar3, "Math::uchar3")            \
    ROW(24, Math::ushort3, "Math::ushort3")          \
    ROW(25, Math::uint3, "Math::uint3")              \
    ROW(26, Math::ulong3, "Math::ulong3")            \
    ROW(27, Math::char3, "Math::char3")              \
    ROW(28, Math::short3, "Math::short3")            \
    ROW(29, Math::int3, "Math::int3")                \
    ROW(30, Math::long3, "Math::long3")              \
    ROW(31, Math::float3, "Math::float3")            \
    ROW(32, Math::double3, "Math::double3")          \
    ROW(33, Math::bool3, "Math::bool3")              \
    ROW(34, Math::uchar4, "Math::uchar4")            \
    ROW(35, Math::ushort4, "Math::ushort4")          \
    ROW(36, Math::uint4, "Math::uint4")              \
    ROW(37, Math::ulong4, "Math::ulong4")            \
    ROW(38, Math::char4, "Math::char4")              \
    ROW(39, Math::short4, "Math::short4")            \
    ROW(40, Math::int4, "Math::int4")                \
    ROW(41, Math::long4, "Math::long4")              \
    ROW(42, Math::float4, "Math::float4")            \
    ROW(43, Math::double4, "Math::double4")          \
    ROW(44, Math::bool4, "Math::bool4")              \
    ROW(45, Math::ushort2x2, "Math::ushort2x2")      \
    ROW(46, Math::uint2x2, "Math::uint2x2")          \
    ROW(47, Math::ulong2x2, "Math::ulong2x2")        \
    ROW(48, Math::short2x2, "Math::short2x2")        \
    ROW(49, Math::int2x2, "Math::int2x2")            \
    ROW(50, Math::long2x2, "Math::long2x2")          \
    ROW(51, Math::float2x2, "Math::float2x2")        \
    ROW(52, Math::double2x2, "Math::double2x2")      \
    ROW(53, Math::ushort2x3, "Math::ushort2x3")      \
    ROW(54, Math::uint2x3, "Math::uint2x3")          \
    ROW(55, Math::ulong2x3, "Math::ulong2x3")        \
    ROW(56, Math::short2x3, "Math::short2x3")        \
    ROW(57, Math::int2x3, "Math::int2x3")            \
    ROW(58, Math::long2x3, "Math::long2x3")          \
    ROW(59, Math::float2x3, "Math::float2x3")        \
    ROW(60, Math::double2x3, "Math::double2x3")      \
    ROW(61, Math::ushort2x4, "Math::ushort2x4")      \
    ROW(62, Math::uint2x4, "Math::uint2x4")          \
    ROW(63, Math::ulong2x4, "Math::ulong2x4")        \
    ROW(64, Math::short2x4, "Math::short2x4")        \
    ROW(65, Math::int2x4, "Math::int2x4")            \
    ROW(66, Math::long2x4, "Math::long2x4")          \
    ROW(67, Math::float2x4, "Math::float2x4")        \
    ROW(68, Math::double2x4, "Math::double2x4")      \
    ROW(69, Math::ushort3x2, "Math::ushort3x2")      \
    ROW(70, Math::uint3x2, "Math::uint3x2")          \
    ROW(71, Math::ulong3x2, "Math::ulong3x2")        \
    ROW(72, Math::short3x2, "Math::short3x2")        \
    ROW(73, Math::int3x2, "Math::int3x2")            \
    ROW(74, Math::long3x2, "Math::long3x2")          \
    ROW(75, Math::float3x2, "Math::float3x2")        \
    ROW(76, Math::double3x2, "Math::double3x2")      \
    ROW(77, Math::ushort3x3, "Math::ushort3x3")      \
    ROW(78, Math::uint3x3, "Math::uint3x3")          \
    ROW(79, Math::ulong3x3, "Math::ulong3x3")        \
    ROW(80, Math::short3x3, "Math::short3x3")        \
    ROW(81, Math::int3x3, "Math::int3x3")            \
    ROW(82, Math::long3x3, "Math::long3x3")          \
    ROW(83, Math::float3x3, "Math::float3x3")        \
    ROW(84, Math::double3x3, "Math::double3x3")      \
    ROW(85, Math::ushort3x4, "Math::ushort3x4")      \
    ROW(86, Math::uint3x4, "Math::uint3x4")          \
    ROW(87, Math::ulong3x4, "Math::ulong3x4")        \
    ROW(88, Math::short3x4, "Math::short3x4")        \
    ROW(89, Math::int3x4, "Math::int3x4")            \
    ROW(90, Math::long3x4, "Math::long3x4")          \
    ROW(91, Math::float3x4, "Math::float3x4")        \
    ROW(92, Math::double3x4, "Math::double3x4")      \
    ROW(93, Math::ushort4x2, "Math::ushort4x2")      \
    ROW(94, Math::uint4x2, "Math::uint4x2")          \
    ROW(95, Math::ulong4x2, "Math::ulong4x2")        \
    ROW(96, Math::short4x2, "Math::short4x2")        \
    ROW(97, Math::int4x2, "Math::int4x2")            \
    ROW(98, Math::long4x2, "Math::long4x2")          \
    ROW(99, Math::float4x2, "Math::float4x2")        \
    ROW(100, Math::double4x2, "Math::double4x2")     \
    ROW(101, Math::ushort4x3, "Math::ushort4x3")     \
    ROW(102, Math::uint4x3, "Math::uint4x3")         \
    ROW(103, Math::ulong4x3, "Math::ulong4x3")       \
    ROW(104, Math::short4x3, "Math::short4x3")       \
    ROW(105, Math::int4x3, "Math::int4x3")           \
    ROW(106, Math::long4x3, "Math::long4x3")         \
    ROW(107, Math::float4x3, "Math::float4x3")       \
    ROW(108, Math::double4x3, "Math::double4x3")     \
    ROW(109, Math::ushort4x4, "Math::ushort4x4")     \
    ROW(110, Math::uint4x4, "Math::uint4x4")         \
    ROW(111, Math::ulong4x4, "Math::ulong4x4")       \
    ROW(112, Math::short4x4, "Math::short4x4")       \
    ROW(113, Math::int4x4, "Math::int4x4")           \
    ROW(114, Math::long4x4, "Math::long4x4")         \
    ROW(115, Math::float4x4, "Math::float4x4")       \
    ROW(116, Math::double4x4, "Math::double4x4")     \
    ROW(117, Math::quatf, "Math::quatf")             \
    ROW(118, Math::quatd, "Math::quatd")             \
    ROW(119, Box3f, "Math::bbox<Math::float3, float>")

/// ROW(code, type) for the types that are, to a file, the same as a value type: `long` beside `long long`. They are
/// written under its code and come back as the value type itself.
#define VELDRIN_VALUE_TYPE_TWINS(ROW) \
    ROW(3, unsigned long)             \
    ROW(15, ULong2)                   \
    ROW(26, ULong3)                   \
    ROW(37, ULong4)                   \
    ROW(7, long)                      \
    ROW(19, Long2)                    \
    ROW(30, Long3)                    \
    ROW(41, Long4)                    \
    ROW(47, ULong2x2)                 \
    ROW(55, ULong2x3)                 \
    ROW(63, ULong2x4)                 \
    ROW(71, ULong3x2)                 \
    ROW(79, ULong3x3)                 \
    ROW(87, ULong3x4)                 \
    ROW(95, ULong4x2)                 \
    ROW(103, ULong4x3)                \
    ROW(111, ULong4x4)                \
    ROW(50, Long2x2)                  \
    ROW(58, Long2x3)                  \
    ROW(66, Long2x4)                  \
    ROW(74, Long3x2)                  \
    ROW(82, Long3x3)                  \
    ROW(90, Long3x4)                  \
    ROW(98, Long4x2)                  \
    ROW(106, Long4x3)                 \
    ROW(114, Long4x4)

namespace Veldrin::Geometry::Internal {

/// Number of value types; their codes run from 0 to one less.
inline constexpr unsigned int kValueTypeCount = 120;

/// The one value type whose C++ spelling holds a comma, under a name that a macro argument can carry.
using Box3f = Math::bbox<Math::float3, float>;

using ULong2 = Math::Vector<unsigned long, 2>;
using ULong3 = Math::Vector<unsigned long, 3>;
using ULong4 = Math::Vector<unsigned long, 4>;
using ULong2x2 = Math::Matrix<unsigned long, 2, 2>;
using ULong2x3 = Math::Matrix<unsigned long, 2, 3>;
using ULong2x4 = Math::Matrix<unsigned long, 2, 4>;
using ULong3x2 = Math::Matrix<unsigned long, 3, 2>;
using ULong3x3 = Math::Matrix<unsigned long, 3, 3>;
using ULong3x4 = Math::Matrix<unsigned long, 3, 4>;
using ULong4x2 = Math::Matrix<unsigned long, 4, 2>;
using ULong4x3 = Math::Matrix<unsigned long, 4, 3>;
using ULong4x4 = Math::Matrix<unsigned long, 4, 4>;
using Long2 = Math::Vector<long, 2>;
using Long3 = Math::Vector<long, 3>;
using Long4 = Math::Vector<long, 4>;
using Long2x2 = Math::Matrix<long, 2, 2>;
using Long2x3 = Math::Matrix<long, 2, 3>;
using Long2x4 = Math::Matrix<long, 2, 4>;
using Long3x2 = Math::Matrix<long, 3, 2>;
using Long3x3 = Math::Matrix<long, 3, 3>;
using Long3x4 = Math::Matrix<long, 3, 4>;
using Long4x2 = Math::Matrix<long, 4, 2>;
using Long4x3 = Math::Matrix<long, 4, 3>;
using Long4x4 = Math::Matrix<long, 4, 4>;

/// Number of a value type in files; does not compile for any other type.
template <class T>
struct ValueTypeCode;

#define VELDRIN_ROW(code, type, name)               \
    template <>                                     \
    struct ValueTypeCode<type> {                    \
        static constexpr unsigned int value = code; \
    };
VELDRIN_VALUE_TYPES(VELDRIN_ROW)
#undef VELDRIN_ROW

/// Calls visit.operator()<T>(code, name) for every value type T in code order.
template <class Visit>
constexpr void forEachValueType(Visit&& visit)
{
#define VELDRIN_ROW(code, type, name) visit.template operator()<type>(static_cast<unsigned int>(code), name);
    VELDRIN_VALUE_TYPES(VELDRIN_ROW)
#undef VELDRIN_ROW
}

/// Calls visit.operator()<T>(code) for every twin type T.
template <class Visit>
constexpr void forEachValueTypeTwin(Visit&& visit)
{
#define VELDRIN_ROW(code, type) visit.template operator()<type>(static_cast<unsigned int>(code));
    VELDRIN_VALUE_TYPE_TWINS(VELDRIN_ROW)
#undef VELDRIN_ROW
}

} // namespace Veldrin::Geometry::Internal
