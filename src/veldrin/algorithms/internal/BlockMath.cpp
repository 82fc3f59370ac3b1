#include <veldrin/algorithms/internal/BlockMath.h>

#include <veldrin/algorithms/internal/VectorClones.h>

#include <algorithm>
#include <cmath>
#include <limits>

namespace Veldrin::GeometryAlgorithms {

namespace {

    constexpr float kPi = 3.14159265358979f;
    constexpr float kHalfPi = 1.57079632679490f;
    constexpr float kSmallestNormal = std::numeric_limits<float>::min();

    // What is compiled twice; see the macro for why it stands apart.
    namespace cloned {

        template <unsigned int N>
        VELDRIN_VECTOR_CLONES void fanVectors(CornerBlock<N> const& corners, float* __restrict x, float* __restrict y,
                                              float* __restrict z) noexcept
        {
            for (std::size_t i = 0; i < kBlockSize; ++i) {
                float const originX = corners.x[0][i];
                float const originY = corners.y[0][i];
                float const originZ = corners.z[0][i];
                float previousX = corners.x[1][i] - originX;
                float previousY = corners.y[1][i] - originY;
                float previousZ = corners.z[1][i] - originZ;
                float sumX = 0;
                float sumY = 0;
                float sumZ = 0;
                for (unsigned int k = 2; k < N; ++k) {
                    float const nextX = corners.x[k][i] - originX;
                    float const nextY = corners.y[k][i] - originY;
                    float const nextZ = corners.z[k][i] - originZ;
                    sumX += previousY * nextZ - previousZ * nextY;
                    sumY += previousZ * nextX - previousX * nextZ;
                    sumZ += previousX * nextY - previousY * nextX;
                    previousX = nextX;
                    previousY = nextY;
                    previousZ = nextZ;
                }
                x[i] = sumX;
                y[i] = sumY;
                z[i] = sumZ;
            }
        }

        template <unsigned int N>
        VELDRIN_VECTOR_CLONES void newellVectors(CornerBlock<N> const& corners, float* __restrict x,
                                                 float* __restrict y, float* __restrict z) noexcept
        {
            for (std::size_t i = 0; i < kBlockSize; ++i) {
                float sumX = 0;
                float sumY = 0;
                float sumZ = 0;
                for (unsigned int k = 0; k < N; ++k) {
                    unsigned int const next = k + 1 == N ? 0 : k + 1;
                    sumX += corners.y[k][i] * corners.z[next][i] - corners.z[k][i] * corners.y[next][i];
                    sumY += corners.z[k][i] * corners.x[next][i] - corners.x[k][i] * corners.z[next][i];
                    sumZ += corners.x[k][i] * corners.y[next][i] - corners.y[k][i] * corners.x[next][i];
                }
                x[i] = sumX;
                y[i] = sumY;
                z[i] = sumZ;
            }
        }

        VELDRIN_VECTOR_CLONES void unitsOrFallback(float* __restrict x, float* __restrict y, float* __restrict z,
                                                   std::size_t count) noexcept
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

        VELDRIN_VECTOR_CLONES void unitsOrSelf(float* __restrict x, float* __restrict y, float* __restrict z,
                                               std::size_t count) noexcept
        {
            for (std::size_t i = 0; i < count; ++i) {
                float const length = std::sqrt(x[i] * x[i] + y[i] * y[i] + z[i] * z[i]);
                float const scale = length > kSmallestNormal ? 1 / length : 1.0f;
                x[i] *= scale;
                y[i] *= scale;
                z[i] *= scale;
            }
        }

        VELDRIN_VECTOR_CLONES void scaleByHalfLength(float* __restrict x, float* __restrict y, float* __restrict z,
                                                     float const* __restrict u, float const* __restrict v,
                                                     float const* __restrict w, std::size_t count) noexcept
        {
            for (std::size_t i = 0; i < count; ++i) {
                float const half = 0.5f * std::sqrt(u[i] * u[i] + v[i] * v[i] + w[i] * w[i]);
                x[i] *= half;
                y[i] *= half;
                z[i] *= half;
            }
        }

        VELDRIN_VECTOR_CLONES void arcCosines(float* values, std::size_t count) noexcept
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

        template <unsigned int N>
        VELDRIN_VECTOR_CLONES void cornerAngles(CornerBlock<N> const& corners, float (&angles)[N][kBlockSize]) noexcept
        {
            // Edge k leads from corner k to the next.
            CornerBlock<N> edges;
            for (unsigned int k = 0; k < N; ++k) {
                unsigned int const next = k + 1 == N ? 0 : k + 1;
                for (std::size_t i = 0; i < kBlockSize; ++i) {
                    edges.x[k][i] = corners.x[next][i] - corners.x[k][i];
                    edges.y[k][i] = corners.y[next][i] - corners.y[k][i];
                    edges.z[k][i] = corners.z[next][i] - corners.z[k][i];
                }
                unitsOrSelf(edges.x[k], edges.y[k], edges.z[k], kBlockSize);
            }
            for (unsigned int k = 0; k < N; ++k) {
                unsigned int const previous = k == 0 ? N - 1 : k - 1;
                for (std::size_t i = 0; i < kBlockSize; ++i)
                    angles[k][i] = -(edges.x[previous][i] * edges.x[k][i] + edges.y[previous][i] * edges.y[k][i] +
                                     edges.z[previous][i] * edges.z[k][i]);
                arcCosines(angles[k], kBlockSize);
            }
        }

    } // namespace cloned

} // namespace

template <unsigned int N>
void fanVectors(CornerBlock<N> const& corners, float* x, float* y, float* z) noexcept
{
    cloned::fanVectors(corners, x, y, z);
}

template <unsigned int N>
void newellVectors(CornerBlock<N> const& corners, float* x, float* y, float* z) noexcept
{
    cloned::newellVectors(corners, x, y, z);
}

template <unsigned int N>
void cornerAngles(CornerBlock<N> const& corners, float (&angles)[N][kBlockSize]) noexcept
{
    cloned::cornerAngles(corners, angles);
}

template void fanVectors(CornerBlock<3> const&, float*, float*, float*) noexcept;
template void fanVectors(CornerBlock<4> const&, float*, float*, float*) noexcept;
template void newellVectors(CornerBlock<3> const&, float*, float*, float*) noexcept;
template void newellVectors(CornerBlock<4> const&, float*, float*, float*) noexcept;
template void cornerAngles(CornerBlock<3> const&, float (&)[3][kBlockSize]) noexcept;
template void cornerAngles(CornerBlock<4> const&, float (&)[4][kBlockSize]) noexcept;

void unitsOrFallback(float* x, float* y, float* z, std::size_t count) noexcept
{
    cloned::unitsOrFallback(x, y, z, count);
}

void unitsOrSelf(float* x, float* y, float* z, std::size_t count) noexcept
{
    cloned::unitsOrSelf(x, y, z, count);
}

void scaleByHalfLength(float* x, float* y, float* z, float const* u, float const* v, float const* w,
                       std::size_t count) noexcept
{
    cloned::scaleByHalfLength(x, y, z, u, v, w, count);
}

void arcCosines(float* values, std::size_t count) noexcept
{
    cloned::arcCosines(values, count);
}

} // namespace Veldrin::GeometryAlgorithms
