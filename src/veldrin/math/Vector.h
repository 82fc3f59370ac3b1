#pragma once

#include <cmath>
#include <cstddef>

/// Vectors of two to four numbers: plain structures without padding, laid out as an array of their components.
namespace Veldrin::Math {

template <class T, int N>
struct Vector;

template <class T>
struct Vector<T, 2> {
    using value_type = T;
    static constexpr int kSize = 2;
    T x{}, y{};

    [[nodiscard]] constexpr T& operator[](int i) noexcept { return i == 0 ? x : y; }
    [[nodiscard]] constexpr T const& operator[](int i) const noexcept { return i == 0 ? x : y; }
    friend constexpr bool operator==(Vector const&, Vector const&) = default;
};

template <class T>
struct Vector<T, 3> {
    using value_type = T;
    static constexpr int kSize = 3;
    T x{}, y{}, z{};

    [[nodiscard]] constexpr T& operator[](int i) noexcept { return i == 0 ? x : i == 1 ? y : z; }
    [[nodiscard]] constexpr T const& operator[](int i) const noexcept { return i == 0 ? x : i == 1 ? y : z; }
    friend constexpr bool operator==(Vector const&, Vector const&) = default;
};

template <class T>
struct Vector<T, 4> {
    using value_type = T;
    static constexpr int kSize = 4;
    T x{}, y{}, z{}, w{};

    [[nodiscard]] constexpr T& operator[](int i) noexcept { return i == 0 ? x : i == 1 ? y : i == 2 ? z : w; }
    [[nodiscard]] constexpr T const& operator[](int i) const noexcept
    {
        return i == 0 ? x : i == 1 ? y : i == 2 ? z : w;
    }
    friend constexpr bool operator==(Vector const&, Vector const&) = default;
};

template <class T, int N>
[[nodiscard]] constexpr Vector<T, N> operator+(Vector<T, N> a, Vector<T, N> const& b) noexcept
{
    for (int i = 0; i < N; ++i)
        a[i] = static_cast<T>(a[i] + b[i]);
    return a;
}

template <class T, int N>
[[nodiscard]] constexpr Vector<T, N> operator-(Vector<T, N> a, Vector<T, N> const& b) noexcept
{
    for (int i = 0; i < N; ++i)
        a[i] = static_cast<T>(a[i] - b[i]);
    return a;
}

template <class T, int N>
[[nodiscard]] constexpr Vector<T, N> operator*(Vector<T, N> a, T factor) noexcept
{
    for (int i = 0; i < N; ++i)
        a[i] = static_cast<T>(a[i] * factor);
    return a;
}

/// Sum of the products of the components, first to last.
template <class T, int N>
[[nodiscard]] constexpr T dot(Vector<T, N> const& a, Vector<T, N> const& b) noexcept
{
    T sum = static_cast<T>(a[0] * b[0]);
    for (int i = 1; i < N; ++i)
        sum = static_cast<T>(sum + a[i] * b[i]);
    return sum;
}

template <class T>
[[nodiscard]] constexpr Vector<T, 3> cross(Vector<T, 3> const& a, Vector<T, 3> const& b) noexcept
{
    return {a.y * b.z - a.z * b.y, a.z * b.x - a.x * b.z, a.x * b.y - a.y * b.x};
}

/// Euclidean length.
template <class T, int N>
[[nodiscard]] T length(Vector<T, N> const& a) noexcept
{
    return std::sqrt(dot(a, a));
}

using uchar2 = Vector<unsigned char, 2>;
using uchar3 = Vector<unsigned char, 3>;
using uchar4 = Vector<unsigned char, 4>;
using ushort2 = Vector<unsigned short, 2>;
using ushort3 = Vector<unsigned short, 3>;
using ushort4 = Vector<unsigned short, 4>;
using uint2 = Vector<unsigned int, 2>;
using uint3 = Vector<unsigned int, 3>;
using uint4 = Vector<unsigned int, 4>;
using ulong2 = Vector<unsigned long long, 2>;
using ulong3 = Vector<unsigned long long, 3>;
using ulong4 = Vector<unsigned long long, 4>;
using char2 = Vector<signed char, 2>;
using char3 = Vector<signed char, 3>;
using char4 = Vector<signed char, 4>;
using short2 = Vector<short, 2>;
using short3 = Vector<short, 3>;
using short4 = Vector<short, 4>;
using int2 = Vector<int, 2>;
using int3 = Vector<int, 3>;
using int4 = Vector<int, 4>;
using long2 = Vector<long long, 2>;
using long3 = Vector<long long, 3>;
using long4 = Vector<long long, 4>;
using float2 = Vector<float, 2>;
using float3 = Vector<float, 3>;
using float4 = Vector<float, 4>;
using double2 = Vector<double, 2>;
using double3 = Vector<double, 3>;
using double4 = Vector<double, 4>;
using bool2 = Vector<bool, 2>;
using bool3 = Vector<bool, 3>;
using bool4 = Vector<bool, 4>;

} // namespace Veldrin::Math
