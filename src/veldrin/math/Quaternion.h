#pragma once

namespace Veldrin::Math {

/// A rotation: vector part x, y, z and scalar part w; no rotation by default. Not normalised by itself.
template <class T>
struct Quaternion {
    using value_type = T;
    T x{}, y{}, z{}, w{1};

    friend constexpr bool operator==(Quaternion const&, Quaternion const&) = default;
};

using quatf = Quaternion<float>;
using quatd = Quaternion<double>;

} // namespace Veldrin::Math
