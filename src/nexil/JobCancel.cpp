#include <nexil/JobCancel.h>

#include <atomic>
#include <stdexcept>

namespace Nexil {

namespace {

    std::atomic<bool (*)()> cancelHook{nullptr};

} // namespace

void setJobCancelHook(bool (*hook)()) noexcept
{
    cancelHook.store(hook, std::memory_order_release);
}

bool isJobCancelled() noexcept
{
    auto* const hook = cancelHook.load(std::memory_order_acquire);
    return hook && hook();
}

bool Internal::hasJobCancelHook() noexcept
{
    return cancelHook.load(std::memory_order_acquire) != nullptr;
}

void Internal::throwIfJobCancelled()
{
    if (isJobCancelled())
        throw std::runtime_error(kJobCancelledText);
}

} // namespace Nexil
