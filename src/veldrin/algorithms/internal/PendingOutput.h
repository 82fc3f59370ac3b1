#pragma once

#include <nexil/Array.h>
#include <nexil/JobCancel.h>

#include <cstdint>
#include <utility>

namespace Veldrin::GeometryAlgorithms {

/// Where an algorithm writes the array that it hands out at the end.
///
/// That is the caller's own array when it has room and nothing can stop the work half-way, so that a repeated call touches
/// no fresh memory, which would cost more than most kernels here; otherwise an array aside, and a cancelled job leaves the
/// caller's as it was. Temporary memory is made before this where it can be; where it runs out later, what was written in
/// place stays unfinished, and the public headers say so.
template <class T>
class PendingOutput {
public:
    /// Room for `count` elements, not initialised.
    PendingOutput(Nexil::Array<T>& target, std::uint64_t count)
        : target_(target), isInPlace_(target.capacity() >= count && !Nexil::Internal::hasJobCancelHook())
    {
        Nexil::Internal::resizeUninitialized(isInPlace_ ? target_ : aside_, count);
    }

    [[nodiscard]] T* data() noexcept { return isInPlace_ ? target_.data() : aside_.data(); }

    /// Hands over; nothing can fail here.
    void commit() noexcept
    {
        if (!isInPlace_)
            target_ = std::move(aside_);
    }

private:
    Nexil::Array<T>& target_;
    Nexil::Array<T> aside_;
    bool isInPlace_;
};

} // namespace Veldrin::GeometryAlgorithms
