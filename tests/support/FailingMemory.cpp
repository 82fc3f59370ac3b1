#include <support/FailingMemory.h>

#include <dlfcn.h>
#include <link.h>

#include <cstddef>
#include <cstdlib>
#include <cstring>
#include <new>

namespace {

// Plain values only: they are used where nothing may be allocated.
thread_local std::uint64_t takenCount = 0;
thread_local std::uint64_t untilFailure = 0; // 0: nothing fails any more
thread_local bool isArmed = false;

/// Counts a block that the code at `caller` wants, and tells whether there is none.
bool failsNow(void const* caller) noexcept
{
    ++takenCount;
    if (!isArmed || untilFailure == 0)
        return false;
    dl_find_object found{};
    bool const isKnown = _dl_find_object(const_cast<void*>(caller), &found) == 0;
    char const* const library = isKnown ? found.dlfo_link_map->l_name : "";
    bool const isForeign = std::strstr(library, "libtbb") || std::strstr(library, "libblosc");
    return !isForeign && --untilFailure == 0;
}

} // namespace

std::uint64_t support::allocationCount() noexcept
{
    return takenCount;
}

support::FailingAllocation::FailingAllocation(std::uint64_t number) noexcept
{
    untilFailure = number;
    isArmed = true;
}

support::FailingAllocation::~FailingAllocation()
{
    isArmed = false;
}

bool support::FailingAllocation::hasFailed() const noexcept
{
    return untilFailure == 0;
}

#if !defined(__has_feature)
#    define __has_feature(feature) 0
#endif
#if defined(__SANITIZE_ADDRESS__) || defined(__SANITIZE_THREAD__) || __has_feature(address_sanitizer) || \
    __has_feature(thread_sanitizer)

void* operator new(std::size_t size)
{
    if (void* const block = failsNow(__builtin_return_address(0)) ? nullptr : std::malloc(size))
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

#else

// What our libraries call, in front of the C library's own.
#    pragma GCC visibility push(default)
extern "C" {
void* __libc_malloc(std::size_t);
void* __libc_memalign(std::size_t, std::size_t);

void* malloc(std::size_t size)
{
    return failsNow(__builtin_return_address(0)) ? nullptr : __libc_malloc(size);
}

void* aligned_alloc(std::size_t alignment, std::size_t size)
{
    return failsNow(__builtin_return_address(0)) ? nullptr : __libc_memalign(alignment, size);
}
}
#    pragma GCC visibility pop

#endif
