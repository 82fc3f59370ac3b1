#pragma once

#include <veldrin/algorithms/internal/TopologyArrays.h>

namespace Veldrin::Geometry {

/// Offsets of consecutive ranges that never fall: each at least as large as those before it.
///
/// Where a file says otherwise, which no valid geometry does, a range starts behind those before it, so that ranges never
/// overlap and work over them grows with the elements alone. Offsets that rise are shared, not copied.
class RisingOffsets {
public:
    RisingOffsets() = default;

    /// Takes the first `rangeCount` + 1 offsets, of which there must be as many; none at all count as ranges of nothing
    /// when `rangeCount` is 0. Cost: one pass, parallel.
    RisingOffsets(IndexArray offsets, std::uint64_t rangeCount);

    [[nodiscard]] std::uint64_t count() const noexcept { return count_; }
    [[nodiscard]] unsigned int const* data() const noexcept { return offsets_->data(); }
    /// Where the first range begins and the last one ends.
    [[nodiscard]] std::uint64_t first() const noexcept { return offsets_->empty() ? 0 : data()[0]; }
    [[nodiscard]] std::uint64_t last() const noexcept { return offsets_->empty() ? 0 : data()[count_]; }
    /// The size that all ranges share when the first begins at 0, so that offset i is i times that; 0 otherwise.
    [[nodiscard]] unsigned int uniformSize() const noexcept { return uniformSize_; }
    /// Whether the offsets rose without a change.
    [[nodiscard]] bool isUnchanged() const noexcept { return isUnchanged_; }

private:
    IndexArray offsets_;
    std::uint64_t count_ = 0;
    unsigned int uniformSize_ = 0;
    bool isUnchanged_ = true;
};

} // namespace Veldrin::Geometry
