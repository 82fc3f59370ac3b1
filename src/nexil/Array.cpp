#include <nexil/Array.h>

#include <cstdlib>
#include <limits>
#include <new>

#if defined(__linux__)
#    include <sys/mman.h>
#endif

namespace Nexil::Internal {

namespace {

    constexpr std::size_t kHugePageBytes = std::size_t(2) << 20;
    // Below this an array gains nothing from huge pages, and the padding to whole ones would be a large share.
    constexpr std::size_t kHugePagesFromBytes = std::size_t(16) << 20;

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

} // namespace

void* UntypedTypeRep::allocate(std::uint64_t count) const
{
    if (count == 0)
        return nullptr;
    if (count > (std::numeric_limits<std::size_t>::max() / 2 - kHugePageBytes) / size)
        throw std::bad_alloc();
    std::size_t const byteCount = static_cast<std::size_t>(count) * size;
    void* block = nullptr;
    if (byteCount >= kHugePagesFromBytes && alignment <= kHugePageBytes)
        block = allocateOnHugePages(byteCount);
    else if (alignment <= alignof(std::max_align_t))
        block = std::malloc(byteCount);
    else
        block = std::aligned_alloc(alignment, (byteCount + alignment - 1) / alignment * alignment);
    if (!block)
        throw std::bad_alloc();
    return block;
}

void UntypedTypeRep::deallocate(void* pointer, std::uint64_t) const noexcept
{
    std::free(pointer);
}

} // namespace Nexil::Internal
