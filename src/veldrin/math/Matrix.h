#pragma once

#include <veldrin/math/Vector.h>

/// Matrices of two to four rows and columns, stored as column vectors without padding.
///
/// `floatRxC` has R rows and C columns: float4x2 is two columns of float4.
namespace Veldrin::Math {

template <class T, int Rows, int Columns>
struct Matrix {
    using value_type = T;
    using Column = Vector<T, Rows>;
    static constexpr int kRows = Rows;
    static constexpr int kColumns = Columns;

    Column columns[Columns];

    [[nodiscard]] constexpr Column& operator[](int column) noexcept { return columns[column]; }
    [[nodiscard]] constexpr Column const& operator[](int column) const noexcept { return columns[column]; }
    friend constexpr bool operator==(Matrix const&, Matrix const&) = default;

    /// Ones on the diagonal, zeros elsewhere.
    [[nodiscard]] static constexpr Matrix identity() noexcept
    {
        Matrix matrix{};
        for (int i = 0; i < (Rows < Columns ? Rows : Columns); ++i)
            matrix.columns[i][i] = T(1);
        return matrix;
    }
};

using ushort2x2 = Matrix<unsigned short, 2, 2>;
using ushort2x3 = Matrix<unsigned short, 2, 3>;
using ushort2x4 = Matrix<unsigned short, 2, 4>;
using ushort3x2 = Matrix<unsigned short, 3, 2>;
using ushort3x3 = Matrix<unsigned short, 3, 3>;
using ushort3x4 = Matrix<unsigned short, 3, 4>;
using ushort4x2 = Matrix<unsigned short, 4, 2>;
using ushort4x3 = Matrix<unsigned short, 4, 3>;
using ushort4x4 = Matrix<unsigned short, 4, 4>;
using uint2x2 = Matrix<unsigned int, 2, 2>;
using uint2x3 = Matrix<unsigned int, 2, 3>;
using uint2x4 = Matrix<unsigned int, 2, 4>;
using uint3x2 = Matrix<unsigned int, 3, 2>;
using uint3x3 = Matrix<unsigned int, 3, 3>;
using uint3x4 = Matrix<unsigned int, 3, 4>;
using uint4x2 = Matrix<unsigned int, 4, 2>;
using uint4x3 = Matrix<unsigned int, 4, 3>;
using uint4x4 = Matrix<unsigned int, 4, 4>;
using ulong2x2 = Matrix<unsigned long long, 2, 2>;
using ulong2x3 = Matrix<unsigned long long, 2, 3>;
using ulong2x4 = Matrix<unsigned long long, 2, 4>;
using ulong3x2 = Matrix<unsigned long long, 3, 2>;
using ulong3x3 = Matrix<unsigned long long, 3, 3>;
using ulong3x4 = Matrix<unsigned long long, 3, 4>;
using ulong4x2 = Matrix<unsigned long long, 4, 2>;
using ulong4x3 = Matrix<unsigned long long, 4, 3>;
using ulong4x4 = Matrix<unsigned long long, 4, 4>;
using short2x2 = Matrix<short, 2, 2>;
using short2x3 = Matrix<short, 2, 3>;
using short2x4 = Matrix<short, 2, 4>;
using short3x2 = Matrix<short, 3, 2>;
using short3x3 = Matrix<short, 3, 3>;
using short3x4 = Matrix<short, 3, 4>;
using short4x2 = Matrix<short, 4, 2>;
using short4x3 = Matrix<short, 4, 3>;
using short4x4 = Matrix<short, 4, 4>;
using int2x2 = Matrix<int, 2, 2>;
using int2x3 = Matrix<int, 2, 3>;
using int2x4 = Matrix<int, 2, 4>;
using int3x2 = Matrix<int, 3, 2>;
using int3x3 = Matrix<int, 3, 3>;
using int3x4 = Matrix<int, 3, 4>;
using int4x2 = Matrix<int, 4, 2>;
using int4x3 = Matrix<int, 4, 3>;
using int4x4 = Matrix<int, 4, 4>;
using long2x2 = Matrix<long long, 2, 2>;
using long2x3 = Matrix<long long, 2, 3>;
using long2x4 = Matrix<long long, 2, 4>;
using long3x2 = Matrix<long long, 3, 2>;
using long3x3 = Matrix<long long, 3, 3>;
using long3x4 = Matrix<long long, 3, 4>;
using long4x2 = Matrix<long long, 4, 2>;
using long4x3 = Matrix<long long, 4, 3>;
using long4x4 = Matrix<long long, 4, 4>;
using float2x2 = Matrix<float, 2, 2>;
using float2x3 = Matrix<float, 2, 3>;
using float2x4 = Matrix<float, 2, 4>;
using float3x2 = Matrix<float, 3, 2>;
using float3x3 = Matrix<float, 3, 3>;
using float3x4 = Matrix<float, 3, 4>;
using float4x2 = Matrix<float, 4, 2>;
using float4x3 = Matrix<float, 4, 3>;
using float4x4 = Matrix<float, 4, 4>;
using double2x2 = Matrix<double, 2, 2>;
using double2x3 = Matrix<double, 2, 3>;
using double2x4 = Matrix<double, 2, 4>;
using double3x2 = Matrix<double, 3, 2>;
using double3x3 = Matrix<double, 3, 3>;
using double3x4 = Matrix<double, 3, 4>;
using double4x2 = Matrix<double, 4, 2>;
using double4x3 = Matrix<double, 4, 3>;
using double4x4 = Matrix<double, 4, 4>;

} // namespace Veldrin::Math
