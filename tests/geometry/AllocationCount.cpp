#include "AllocationCount.h"

#include <atomic>
#include <cstdlib>
#include <new>

// In a file of its own: inlined into callers, compilers take new and free for a mismatch.
namespace {

std::atomic<std::uint64_t> count = 0;

} // namespace

std::uint64_t support::allocationCount()
{
    return count;
}

void* operator new(std::size_t size)
{
    ++count;
    if (void* const block = std::malloc(size))
        return block;
    throw std::bad_alloc();
}

void operator delete(void* block) noexcept
{
    std::free(block);
}

void operator delete(void* block, std::size_t) noexcept
{
    std::free(block);
}
