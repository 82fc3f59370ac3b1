#pragma once

#include <nexil/Array.h>
#include <veldrin/geometry/Export.h>

/// Set operations on selections. A selection is a mask: one flag per element, true where it is selected.
///
///     unionTagData(*border, *selection); // selection: what either of them selects
///
/// Masks of different sizes are combined over the shorter one; what the written mask has beyond that stays as it is.
/// Cost: one pass, parallel from 65537 flags on; no memory. A job's cancellation does not cut it short.
/// Threads: same result for every thread count; the written mask must be the caller's alone. The masks may be the same.
namespace Veldrin::Geometry {

/// b = b or a.
VELDRIN_API void unionTagData(Nexil::Array<bool> const& a, Nexil::Array<bool>& b);

/// b = a and b.
VELDRIN_API void intersectTagData(Nexil::Array<bool> const& a, Nexil::Array<bool>& b);

/// b = a and not b: what `b` selects is taken away from `a`, and the result is in `b`.
VELDRIN_API void subtractTagData(Nexil::Array<bool> const& a, Nexil::Array<bool>& b);

/// a = not a.
VELDRIN_API void negateTagData(Nexil::Array<bool>& a);

} // namespace Veldrin::Geometry
