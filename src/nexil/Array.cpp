#include <nexil/Array.h>

#include <cstdlib>
#include <limits>
#include <new>

#if defined(__linux__)
#    include <sys/mman.h>
#    include <unistd.h>
#endif

namespace Nexil::Internal {

namespace {

    constexpr std::size_t kHugePageBytes = std::size_t(2) << 20;
    // Smaller blocks come from memory that is in use already.
    constexpr std::size_t kTakePagesFromBytes = std::size_t(64) << 10;

    // Fresh huge pages take 0.6 of the time of ordinary ones to fill from a file. They are not asked for while an array
    // grows by doubling: from one run to the next, blocks that soon go back made that twice as quick or thrice as slow.
    void* allocateOnHugePages(std::size_t byteCount)
    {
        std::size_t const rounded = (byteCount + kHugePageBytes - 1) / kHugePageBytes * kHugePageBytes;
        void* const block = std::aligned_alloc(kHugePageBytes, rounded);
#if defined(__linux__) && defined(MADV_HUGEPAGE)
        // Advice only: a refusal leaves ordinary pages.
        if (block)
            madvise(block, rounded, MADV_HUGEPAGE);
#endif
        return block;
    }

    std::size_t checkedByteCount(UntypedTypeRep const& type, std::uint64_t count)
    {
        if (count > (std::numeric_limits<std::size_t>::max() / 2 - kHugePageBytes) / type.size)
            throw std::bad_alloc();
        return static_cast<std::size_t>(count) * type.size;
    }

} // namespace

void* UntypedTypeRep::allocate(std::uint64_t count) const
{
    std::size_t const byteCount = checkedByteCount(*this, count);
    if (byteCount < kHugePagesFromBytes || alignment > kHugePageBytes)
        return allocateWhileGrowing(count);
    void* const block = allocateOnHugePages(byteCount);
    if (!block)
        throw std::bad_alloc();
    return block;
}

void* UntypedTypeRep::allocateWhileGrowing(std::uint64_t count) const
{
    std::size_t const byteCount = checkedByteCount(*this, count);
    if (byteCount == 0)
        return nullptr;
    void* const block = alignment <= alignof(std::max_align_t)
                            ? std::malloc(byteCount)
                            : std::aligned_alloc(alignment, (byteCount + alignment - 1) / alignment * alignment);
    if (!block)
        throw std::bad_alloc();
    return block;
}

void UntypedTypeRep::deallocate(void* pointer, std::uint64_t) const noexcept
{
    std::free(pointer);
}

void takePages([[maybe_unused]] void* block, [[maybe_unused]] std::size_t byteCount) noexcept
{
#if defined(__linux__) && defined(MADV_POPULATE_WRITE)
    if (byteCount < kTakePagesFromBytes)
        return;
    auto const pageBytes = static_cast<std::uintptr_t>(sysconf(_SC_PAGESIZE));
    auto const begin = (reinterpret_cast<std::uintptr_t>(block) + pageBytes - 1) / pageBytes * pageBytes;
    auto const end = (reinterpret_cast<std::uintptr_t>(block) + byteCount) / pageBytes * pageBytes;
    if (begin >= end)
        return;
    // The last page tells for all: memory is taken from the front.
    unsigned char isPresent = 0;
    if (mincore(reinterpret_cast<void*>(end - pageBytes), pageBytes, &isPresent) != 0 || (isPresent & 1) != 0)
        return;
    // Advice only: a system that refuses gives the pages one by one.
    madvise(reinterpret_cast<void*>(begin), end - begin, MADV_POPULATE_WRITE);
#endif
}

} // namespace Nexil::Internal
