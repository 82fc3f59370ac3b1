#pragma once

#include <cstdint>

/// One pass over an array of indices, at the speed of memory. Parallel; std::runtime_error when the job is cancelled.
namespace Veldrin::Geometry::Internal {

/// The largest index; 0 for none.
[[nodiscard]] unsigned int largestIndex(unsigned int const* indices, std::uint64_t count);

/// One more than the largest index that is not `kInvalidIndex`; 0 where there is none.
[[nodiscard]] unsigned int elementBound(unsigned int const* indices, std::uint64_t count);

/// Whether no entry is less than the one before.
[[nodiscard]] bool neverFalls(unsigned int const* offsets, std::uint64_t count);

} // namespace Veldrin::Geometry::Internal
