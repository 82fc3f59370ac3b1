#pragma once

#include <veldrin/math/Vector.h>

#include <limits>

namespace Veldrin::Math {

/// Axis-aligned box over vectors V of scalars S: `min` and `max` corner, both inside. The default one is empty, that
/// is, every `min` component is the largest number and every `max` component the lowest.
template <class V, class S>
struct bbox {
    using vector_type = V;
    using value_type = S;

    V min = filled(std::numeric_limits<S>::max());
    V max = filled(std::numeric_limits<S>::lowest());

    /// True when no point lies inside.
    [[nodiscard]] constexpr bool isEmpty() const noexcept
    {
        for (int i = 0; i < V::kSize; ++i)
            if (!(min[i] <= max[i]))
                return true;
        return false;
    }

    /// Grows to hold `point`. Components that are not numbers are passed over.
    constexpr void extend(V const& point) noexcept
    {
        for (int i = 0; i < V::kSize; ++i) {
            min[i] = point[i] < min[i] ? point[i] : min[i];
            max[i] = point[i] > max[i] ? point[i] : max[i];
        }
    }

    friend constexpr bool operator==(bbox const&, bbox const&) = default;

private:
    static constexpr V filled(S value) noexcept
    {
        V vector{};
        for (int i = 0; i < V::kSize; ++i)
            vector[i] = value;
        return vector;
    }
};

} // namespace Veldrin::Math
