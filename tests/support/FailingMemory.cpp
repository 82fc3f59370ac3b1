#include <support/FailingMemory.h>

#include <link.h>

#include <cstddef>
#include <cstdlib>
#include <cstring>
#include <new>

#if !defined(__has_feature)
#    define __has_feature(feature) 0
#endif
#if defined(__SANITIZE_ADDRESS__) || defined(__SANITIZE_THREAD__) || __has_feature(address_sanitizer) || \
    __has_feature(thread_sanitizer)
#    define HAS_OWN_MEMORY_FUNCTIONS 0
#else
#    define HAS_OWN_MEMORY_FUNCTIONS 1
#endif

namespace {

// Plain values only: they are used where nothing may be allocated.
thread_local std::uint64_t takenCount = 0;
thread_local std::uint64_t untilFailure = 0; // 0: nothing fails any more
thread_local bool isArmed = false;
thread_local bool hasFailedOnce = false;
thread_local std::int64_t held = 0;

bool failsNow() noexcept
{
    if (!isArmed || untilFailure == 0 || --untilFailure > 0)
        return false;
    hasFailedOnce = true;
    return true;
}

#if HAS_OWN_MEMORY_FUNCTIONS

struct CodeRange {
    std::uintptr_t begin = 0;
    std::uintptr_t end = 0;
};

CodeRange ownCode[8];
int ownCodeCount = 0;

int collectCode(dl_phdr_info* info, std::size_t, void*)
{
    char const* const name = info->dlpi_name;
    bool const isOwn = *name == '\0' || std::strstr(name, "libVeldrin") || std::strstr(name, "libstdc++");
    for (int i = 0; isOwn && i < info->dlpi_phnum; ++i) {
        auto const& segment = info->dlpi_phdr[i];
        if (segment.p_type == PT_LOAD && (segment.p_flags & PF_X) && ownCodeCount < 8)
            ownCode[ownCodeCount++] = {info->dlpi_addr + segment.p_vaddr,
                                       info->dlpi_addr + segment.p_vaddr + segment.p_memsz};
    }
    return 0;
}

bool isOwnCode(void const* caller) noexcept
{
    auto const address = reinterpret_cast<std::uintptr_t>(caller);
    for (int i = 0; i < ownCodeCount; ++i)
        if (address >= ownCode[i].begin && address < ownCode[i].end)
            return true;
    return false;
}

template <class Allocate>
void* allocate(void const* caller, Allocate const& take) noexcept
{
    if (isArmed && isOwnCode(caller) && failsNow())
        return nullptr;
    ++takenCount;
    void* const block = take();
    if (isArmed && block)
        ++held;
    return block;
}

#endif

} // namespace

std::uint64_t support::allocationCount() noexcept
{
    return takenCount;
}

support::FailingAllocation::FailingAllocation(std::uint64_t number) noexcept
{
#if HAS_OWN_MEMORY_FUNCTIONS
    if (ownCodeCount == 0)
        dl_iterate_phdr(collectCode, nullptr);
#endif
    untilFailure = number;
    hasFailedOnce = false;
    held = 0;
    isArmed = true;
}

support::FailingAllocation::~FailingAllocation()
{
    isArmed = false;
}

bool support::FailingAllocation::hasFailed() const noexcept
{
    return hasFailedOnce;
}

std::int64_t support::FailingAllocation::blocksHeld() const noexcept
{
    return held;
}

#if HAS_OWN_MEMORY_FUNCTIONS

// The C library's own, under the names by which a program that brings others may still call them.
#    pragma GCC visibility push(default)
extern "C" {
void* __libc_malloc(std::size_t);
void* __libc_calloc(std::size_t, std::size_t);
void* __libc_realloc(void*, std::size_t);
void* __libc_memalign(std::size_t, std::size_t);
void __libc_free(void*);

void* malloc(std::size_t size)
{
    return allocate(__builtin_return_address(0), [&] { return __libc_malloc(size); });
}

void* calloc(std::size_t count, std::size_t size)
{
    return allocate(__builtin_return_address(0), [&] { return __libc_calloc(count, size); });
}

void* realloc(void* block, std::size_t size)
{
    if (block)
        return __libc_realloc(block, size);
    return allocate(__builtin_return_address(0), [&] { return __libc_malloc(size); });
}

void* aligned_alloc(std::size_t alignment, std::size_t size)
{
    return allocate(__builtin_return_address(0), [&] { return __libc_memalign(alignment, size); });
}

int posix_memalign(void** block, std::size_t alignment, std::size_t size)
{
    *block = allocate(__builtin_return_address(0), [&] { return __libc_memalign(alignment, size); });
    return *block ? 0 : 12;
}

void free(void* block)
{
    if (isArmed && block)
        --held;
    __libc_free(block);
}
}
#    pragma GCC visibility pop

#else

void* operator new(std::size_t size)
{
    ++takenCount;
    void* const block = failsNow() ? nullptr : std::malloc(size);
    if (block)
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

#endif
