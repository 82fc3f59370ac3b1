#pragma once

#include <cstdint>

/// Memory that is counted, and that runs out at a chosen moment. A program that asks for either is linked with
/// FailingMemory.cpp.
namespace support {

/// How many blocks this thread has taken so far; under a sanitizer, which has memory functions of its own, only those of
/// `operator new`.
std::uint64_t allocationCount() noexcept;

/// While it lives, the allocation of this thread with that number, from 1 on, fails, and all others succeed.
///
/// What counts are the allocations of our libraries, of this program and of the standard library on behalf of them; the
/// task runtime and the compressor keep theirs. Under a sanitizer only `operator new` counts.
class FailingAllocation {
public:
    explicit FailingAllocation(std::uint64_t number) noexcept;
    FailingAllocation(FailingAllocation const&) = delete;
    FailingAllocation& operator=(FailingAllocation const&) = delete;
    ~FailingAllocation();

    /// Whether it was reached.
    [[nodiscard]] bool hasFailed() const noexcept;
};

} // namespace support
