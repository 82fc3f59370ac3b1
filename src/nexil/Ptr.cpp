#include <nexil/Ptr.h>

namespace Nexil::Internal {

/// The blocks that a thread still has to destroy, linked through their counts, which are zero and of no more use.
struct PendingReleases {
    ControlBlock* first = nullptr;
    bool isDraining = false;

    void push(ControlBlock* block) noexcept
    {
        block->count_.store(reinterpret_cast<std::uint64_t>(first), std::memory_order_relaxed);
        first = block;
    }

    ControlBlock* pop() noexcept
    {
        ControlBlock* block = first;
        first = reinterpret_cast<ControlBlock*>(block->count_.load(std::memory_order_relaxed));
        return block;
    }
};

void ControlBlock::releaseWithoutRecursion(ControlBlock* block) noexcept
{
    // A value that holds the last reference to another one drops it from its destructor. Released there and then, a
    // chain of a million nested objects would take a million stack frames; the outermost release works it off instead.
    thread_local PendingReleases pending;
    if (pending.isDraining) {
        pending.push(block);
        return;
    }
    pending.isDraining = true;
    block->release();
    while (pending.first)
        pending.pop()->release();
    pending.isDraining = false;
}

} // namespace Nexil::Internal
