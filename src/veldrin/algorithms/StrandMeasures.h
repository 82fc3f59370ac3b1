#pragma once

#include <nexil/Array.h>
#include <nexil/RuntimeMessage.h>
#include <veldrin/geometry/Export.h>
#include <veldrin/math/Vector.h>
#include <veldrin/object/Object.h>

#include <cmath>
#include <cstddef>
#include <iterator>
#include <limits>

/// Tangents, lengths and ratios along strands.
///
///     Nexil::Array<float> lengths, segments;
///     if (GeometryAlgorithms::computeStrandLength(*strands, lengths, segments, nullptr))
///         ...
///
/// Strand s owns the points [strand_offset[s], strand_offset[s + 1]), cut off at the last point. Where offsets fall, which
/// no valid geometry's do, a strand starts behind those before it. Lengths are in the unit
/// of the positions. Elements of an output that no strand owns are 0.
/// Cost: one pass over the points, parallel over strands; no memory but the outputs.
/// Errors: false leaves the outputs untouched; std::bad_alloc; std::runtime_error when the job is cancelled.
/// Threads: same bits for every thread count. services: hears nothing so far; may be null.
namespace Veldrin::GeometryAlgorithms {

namespace Internal {

    /// The vector scaled to length 1; one not longer than the smallest normal float stays as it is.
    [[nodiscard]] inline Math::float3 unitOrSelf(Math::float3 const& v) noexcept
    {
        float const length = std::sqrt(v.x * v.x + v.y * v.y + v.z * v.z);
        return length > std::numeric_limits<float>::min() ? v * (1 / length) : v;
    }

} // namespace Internal

/// Tangents of one strand: unit vectors to the next point at the first, from the one before at the last, and from the one
/// before to the next in between. Coinciding points give a tangent of (0, 0, 0); a single point gets (0, 1, 0).
///
/// begin, end: random-access range of `float3`; out: room for as many.
template <class Positions, class Tangents>
void computeStrandTangent(Positions begin, Positions end, Tangents out)
{
    std::ptrdiff_t const n = std::distance(begin, end);
    if (n == 1)
        *out = Math::float3{0, 1, 0};
    if (n < 2)
        return;
    out[0] = Internal::unitOrSelf(begin[1] - begin[0]);
    out[n - 1] = Internal::unitOrSelf(begin[n - 1] - begin[n - 2]);
    for (std::ptrdiff_t i = 1; i < n - 1; ++i)
        out[i] = Internal::unitOrSelf(begin[i + 1] - begin[i - 1]);
}

/// One tangent per point, by the rule of `computeStrandTangent`.
///
/// tangents: resized to the element count of "point_component". False when "strand_offset" or "point_position" is missing,
/// positions are fewer than points, or offsets fewer than strands and one.
VELDRIN_API bool computeStrandTangents(Object const& strands, Nexil::Array<Math::float3>& tangents,
                                       Nexil::RuntimeServices const* services);

/// Lengths of strands and of their segments.
///
/// strandLengths:  resized to the element count of "strand_component"; the sum of the strand's segments in order, in float.
/// segmentLengths: resized to the element count of "point_component"; the distance from each point to the next of its
///                 strand, 0 at the last.
/// False as for `computeStrandTangents`.
VELDRIN_API bool computeStrandLength(Object const& strands, Nexil::Array<float>& strandLengths,
                                     Nexil::Array<float>& segmentLengths, Nexil::RuntimeServices const* services);

/// Where each point lies along its strand, from 0 at the first to 1 at the last, evenly by index; 0 for a single point.
///
/// ratios: resized to the element count of "point_component". False when the object is no strand geometry.
VELDRIN_API bool computeStrandRatio(Object const& strands, Nexil::Array<float>& ratios,
                                    Nexil::RuntimeServices const* services);

} // namespace Veldrin::GeometryAlgorithms
