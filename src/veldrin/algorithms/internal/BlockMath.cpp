#include <veldrin/algorithms/internal/BlockMath.h>

#include <algorithm>
#include <cmath>
#include <limits>

namespace Veldrin::GeometryAlgorithms {

namespace {

    constexpr float kPi = 3.14159265358979f;
    constexpr float kHalfPi = 1.57079632679490f;
    constexpr float kSmallestNormal = std::numeric_limits<float>::min();

} // namespace

void unitsOrFallback(float* __restrict x, float* __restrict y, float* __restrict z, std::size_t count) noexcept
{
    for (std::size_t i = 0; i < count; ++i) {
        float const length = std::sqrt(x[i] * x[i] + y[i] * y[i] + z[i] * z[i]);
        bool const hasDirection = length > kSmallestNormal;
        float const scale = 1 / length;
        x[i] = hasDirection ? x[i] * scale : 0.0f;
        y[i] = hasDirection ? y[i] * scale : 1.0f;
        z[i] = hasDirection ? z[i] * scale : 0.0f;
    }
}

void unitsOrSelf(float* __restrict x, float* __restrict y, float* __restrict z, std::size_t count) noexcept
{
    for (std::size_t i = 0; i < count; ++i) {
        float const length = std::sqrt(x[i] * x[i] + y[i] * y[i] + z[i] * z[i]);
        float const scale = length > kSmallestNormal ? 1 / length : 1.0f;
        x[i] *= scale;
        y[i] *= scale;
        z[i] *= scale;
    }
}

void scaleByHalfLength(float* __restrict x, float* __restrict y, float* __restrict z, float const* __restrict u,
                       float const* __restrict v, float const* __restrict w, std::size_t count) noexcept
{
    for (std::size_t i = 0; i < count; ++i) {
        float const half = 0.5f * std::sqrt(u[i] * u[i] + v[i] * v[i] + w[i] * w[i]);
        x[i] *= half;
        y[i] *= half;
        z[i] *= half;
    }
}

void arcCosines(float* values, std::size_t count) noexcept
{
    for (std::size_t i = 0; i < count; ++i) {
        float const cosine = std::min(std::max(values[i], -1.0f), 1.0f);
        float const magnitude = std::abs(cosine);
        bool const isSteep = magnitude > 0.5f;
        // Near the ends arccos x = 2 arcsin sqrt((1 - x) / 2), which keeps small angles exact to the last places.
        float const square = isSteep ? 0.5f * (1 - magnitude) : magnitude * magnitude;
        float const root = std::sqrt(square);
        float const sine = isSteep ? root : magnitude;
        float polynomial = 4.2163199048e-2f;
        polynomial = polynomial * square + 2.4181311049e-2f;
        polynomial = polynomial * square + 4.5470025998e-2f;
        polynomial = polynomial * square + 7.4953002686e-2f;
        polynomial = polynomial * square + 1.6666752422e-1f;
        float const arcSine = polynomial * square * sine + sine;
        float const signedArcSine = cosine < 0 ? -arcSine : arcSine;
        float const flat = kHalfPi - signedArcSine;
        float const steep = (cosine < 0 ? kPi : 0.0f) + 2 * signedArcSine;
        values[i] = isSteep ? steep : flat;
    }
}

} // namespace Veldrin::GeometryAlgorithms
