#pragma once

#include <nexil/JobCancel.h>
#include <veldrin/algorithms/internal/MeshFaces.h>

#include <algorithm>
#include <atomic>
#include <cstddef>
#include <vector>

namespace Veldrin::GeometryAlgorithms {

/// The faces of a mesh cut into parts, one a thread, and which part may add to the sums of which points, so that threads
/// add at once and give the very bits of one loop over the faces in their order.
///
///     PointClaims claims(faces, partCount);
///     for each part, in parallel:
///         claims.forEachChunk(part, [&](begin, end) {
///             claims.claim(part, begin, end, clear);
///             add what the faces have for points with claims.owns(part, point);
///         });
///     if (claims.areTooManyShared())
///         begin again another way;
///     claims.clearRest(clear);
///     claims.forEachSharingBlock([&](begin, end) { add what the faces have for points with claims.isShared(point); });
///
/// A page of points belongs to the part that comes upon it first, and is shared once another part does: its sums are begun
/// again when all parts are through. So no point is touched by two threads at once, and each sees its faces in order,
/// whichever part came first. Where neighbours have near numbers, as in most meshes, only the pages where parts meet are
/// shared. Claiming reads a chunk just before its sums do, from the cache then.
class PointClaims {
public:
    static constexpr std::size_t kMostParts = 64;

    /// partCount: 1 to `kMostParts`. Memory: two bytes for 32 points, 8 for a chunk. Errors: std::bad_alloc.
    PointClaims(Geometry::MeshFaces const& faces, std::size_t partCount);

    [[nodiscard]] std::size_t partCount() const noexcept { return firstFaces_.size() - 1; }

    /// Calls body(begin, end) for the chunks of a part in order, and asks for cancellation before each. Stops once too many
    /// pages are shared.
    template <class Body>
    void forEachChunk(std::size_t part, Body const& body) const
    {
        for (std::uint64_t begin = firstFaces_[part], end = begin; begin < firstFaces_[part + 1]; begin = end) {
            end = std::min(begin + kChunkFaces, firstFaces_[part + 1]);
            Nexil::Internal::throwIfJobCancelled();
            if (areTooManyShared())
                return;
            body(begin, end);
        }
    }

    /// Claims the pages that the faces of a chunk need: true when the part has them all. Calls clear(firstPoint, count) for
    /// each that is its own from now on.
    template <class Clear>
    [[nodiscard]] bool claim(std::size_t part, std::uint64_t begin, std::uint64_t end, Clear const& clear)
    {
        Pages& pages = chunks_[begin / kChunkFaces];
        if (pages = pagesOf(begin, end); pages.isRange()) {
            bool hasAll = true;
            for (unsigned int page = pages.first; page <= pages.last; ++page)
                hasAll = claimPage(part, page, clear) && hasAll;
            return hasAll;
        }
        Geometry::IndexRange const corners = faces_.corners(begin, end);
        bool hasAll = true;
        for (std::uint64_t i = corners.begin; i < corners.end; ++i)
            if (unsigned int const point = faces_.points()[i]; point < faces_.pointCount())
                hasAll = claimPage(part, point >> kPageBits, clear) && hasAll;
        return hasAll;
    }

    /// Of a point whose page the part has tried to claim.
    [[nodiscard]] bool owns(std::size_t part, unsigned int point) const noexcept
    {
        return owners_[point >> kPageBits].load(std::memory_order_relaxed) == part + 1;
    }

    /// Whether so many pages are shared that another way is quicker.
    [[nodiscard]] bool areTooManyShared() const noexcept
    {
        return sharedCount_.load(std::memory_order_relaxed) > owners_.size() / 16;
    }

    // What follows is for when all parts are through.

    [[nodiscard]] bool isShared(unsigned int point) const noexcept
    {
        return areShared_[point >> kPageBits].load(std::memory_order_relaxed);
    }

    /// Calls clear(firstPoint, count) for the shared pages and those that no face needs.
    template <class Clear>
    void clearRest(Clear const& clear) const
    {
        for (unsigned int page = 0; page < owners_.size(); ++page)
            if (owners_[page].load(std::memory_order_relaxed) == 0 || isShared(page << kPageBits))
                clearPage(page, clear);
    }

    /// Calls body(begin, end) for the blocks of faces that have points in shared pages, in order, and asks for cancellation
    /// now and then.
    template <class Body>
    void forEachSharingBlock(Body const& body) const
    {
        std::vector<unsigned int> const shared = sharedPages();
        for (std::size_t chunk = 0; chunk < chunks_.size() && !shared.empty(); ++chunk) {
            Pages const& pages = chunks_[chunk];
            auto const found = std::lower_bound(shared.begin(), shared.end(), pages.first);
            if (pages.isRange() && (found == shared.end() || *found > pages.last))
                continue;
            Nexil::Internal::throwIfJobCancelled();
            std::uint64_t const chunkEnd = std::min((chunk + 1) * kChunkFaces, faces_.faceCount());
            for (std::uint64_t begin = chunk * kChunkFaces, end = begin; begin < chunkEnd; begin = end) {
                end = std::min(begin + kBlockFaces, chunkEnd);
                if (hasSharedPoint(begin, end))
                    body(begin, end);
            }
        }
    }

private:
    // Small enough for the owners to stay in the nearest caches.
    static constexpr unsigned int kPageBits = 5;
    static constexpr std::uint64_t kChunkFaces = 1024;
    static constexpr std::uint64_t kBlockFaces = 64;

    /// The pages that a chunk needs: all from the first to the last, or any when it has points far from each other.
    struct Pages {
        unsigned int first = 1;
        unsigned int last = 0;

        [[nodiscard]] bool isRange() const noexcept { return first <= last; }
    };

    [[nodiscard]] Pages pagesOf(std::uint64_t begin, std::uint64_t end) const noexcept;
    [[nodiscard]] std::vector<unsigned int> sharedPages() const;
    [[nodiscard]] bool hasSharedPoint(std::uint64_t begin, std::uint64_t end) const noexcept;

    template <class Clear>
    [[nodiscard]] bool claimPage(std::size_t part, unsigned int page, Clear const& clear)
    {
        auto const claimed = static_cast<unsigned char>(part + 1);
        unsigned char owner = owners_[page].load(std::memory_order_relaxed);
        if (owner == 0 && owners_[page].compare_exchange_strong(owner, claimed, std::memory_order_relaxed)) {
            clearPage(page, clear);
            return true;
        }
        if (owner == claimed)
            return true;
        if (!areShared_[page].exchange(true, std::memory_order_relaxed))
            sharedCount_.fetch_add(1, std::memory_order_relaxed);
        return false;
    }

    template <class Clear>
    void clearPage(unsigned int page, Clear const& clear) const
    {
        std::uint64_t const first = std::uint64_t(page) << kPageBits;
        clear(first, std::min<std::uint64_t>(std::uint64_t(1) << kPageBits, faces_.pointCount() - first));
    }

    Geometry::MeshFaces const& faces_;
    std::vector<std::uint64_t> firstFaces_;
    std::vector<std::atomic<unsigned char>> owners_; // the part's number and one, 0 for none
    std::vector<std::atomic<bool>> areShared_;
    std::vector<Pages> chunks_;
    std::atomic<std::size_t> sharedCount_ = 0;
};

} // namespace Veldrin::GeometryAlgorithms
