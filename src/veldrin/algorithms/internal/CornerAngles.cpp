#include <veldrin/algorithms/internal/CornerAngles.h>

#include <algorithm>

namespace Veldrin::GeometryAlgorithms {

void CornerAngles<Geometry::OffsetRanges>::grow(std::size_t count)
{
    for (auto* array : {&x_, &y_, &z_, &angles_})
        array->resize(std::max(count, array->size()));
    previous_.resize(std::max(count, previous_.size()));
}

void CornerAngles<Geometry::OffsetRanges>::addFace(Positions const& positions, unsigned int const* points,
                                                   std::uint64_t n)
{
    if (count_ + n > angles_.size())
        grow(count_ + n);
    Math::float3 p = positions[points[0]];
    for (std::uint64_t k = 0; k < n; ++k) {
        Math::float3 const next = positions[points[k + 1 == n ? 0 : k + 1]];
        Math::float3 const edge = difference(next, p);
        std::size_t const i = count_ + k;
        x_[i] = edge.x;
        y_[i] = edge.y;
        z_[i] = edge.z;
        previous_[i] = static_cast<std::uint32_t>(k == 0 ? i + n - 1 : i - 1);
        p = next;
    }
    count_ += n;
}

void CornerAngles<Geometry::OffsetRanges>::computeAdded() noexcept
{
    float const* const x = x_.data();
    float const* const y = y_.data();
    float const* const z = z_.data();
    unitsOrSelf(x_.data(), y_.data(), z_.data(), count_);
    for (std::size_t i = 0; i < count_; ++i) {
        std::size_t const p = previous_[i];
        angles_[i] = -(x[p] * x[i] + y[p] * y[i] + z[p] * z[i]);
    }
    arcCosines(angles_.data(), count_);
}

} // namespace Veldrin::GeometryAlgorithms
