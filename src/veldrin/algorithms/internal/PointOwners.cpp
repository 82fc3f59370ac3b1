#include <veldrin/algorithms/internal/PointOwners.h>

#include <nexil/parallel/Parallel.h>

#include <atomic>

namespace Veldrin::GeometryAlgorithms {

namespace {

    void lower(unsigned char& owner, unsigned char part) noexcept
    {
        std::atomic_ref<unsigned char> shared(owner);
        unsigned char current = shared.load(std::memory_order_relaxed);
        while (part < current && !shared.compare_exchange_weak(current, part, std::memory_order_relaxed)) {
        }
    }

    template <class Body>
    void forEachPart(std::size_t partCount, Body const& body)
    {
        Nexil::parallel::forRange(partCount, 1, [&](std::size_t begin, std::size_t end) {
            for (std::size_t part = begin; part < end; ++part)
                body(part);
        });
    }

} // namespace

struct PointOwners::Bounds {
    unsigned int lowest = ~0u;
    unsigned int highest = 0;

    [[nodiscard]] std::size_t pageCount() const noexcept
    {
        return (highest >> kPageBits) - (lowest >> kPageBits) + std::size_t(1);
    }
};

/// What bits all points have in common says where they lie, four times as fast as comparing them; next to a number that is
/// divided by a high power of two it says little.
PointOwners::Bounds PointOwners::looseBounds(unsigned int const* points, Geometry::IndexRange corners) noexcept
{
    Bounds bounds;
    for (std::uint64_t i = corners.begin; i < corners.end; ++i) {
        bounds.lowest &= points[i];
        bounds.highest |= points[i];
    }
    return bounds;
}

PointOwners::Bounds PointOwners::exactBounds(unsigned int const* points, Geometry::IndexRange corners) noexcept
{
    Bounds bounds;
    for (std::uint64_t i = corners.begin; i < corners.end; ++i) {
        bounds.lowest = std::min(bounds.lowest, points[i]);
        bounds.highest = std::max(bounds.highest, points[i]);
    }
    return bounds;
}

void PointOwners::meet(std::size_t part, std::uint64_t begin, std::uint64_t end)
{
    Geometry::IndexRange const corners = faces_.corners(begin, end);
    unsigned int const* const points = faces_.points();
    // Marking a page that no face meets costs a second look at most; marking each corner takes far longer.
    constexpr std::size_t kMostPages = kChunkFaces / 4;
    Bounds bounds = looseBounds(points, corners);
    if (bounds.highest >= faces_.pointCount() || bounds.pageCount() > std::min(kMostPages, owners_.size() / 64))
        bounds = exactBounds(points, corners);
    if (bounds.lowest <= bounds.highest && bounds.highest < faces_.pointCount() && bounds.pageCount() <= kMostPages) {
        Chunk& chunk = chunks_[chunkOf(begin)];
        chunk.lowestPage = bounds.lowest >> kPageBits;
        chunk.highestPage = bounds.highest >> kPageBits;
        for (std::size_t page = chunk.lowestPage; page <= chunk.highestPage; ++page)
            lower(owners_[page], static_cast<unsigned char>(part));
    } else {
        for (std::uint64_t i = corners.begin; i < corners.end; ++i)
            if (points[i] < faces_.pointCount())
                lower(owners_[points[i] >> kPageBits], static_cast<unsigned char>(part));
    }
}

bool PointOwners::ownsAll(std::size_t part, std::uint64_t begin, std::uint64_t end) const noexcept
{
    Chunk const& chunk = chunks_[chunkOf(begin)];
    for (std::size_t page = chunk.lowestPage; page <= chunk.highestPage; ++page)
        if (owners_[page] != part)
            return false;
    if (chunk.lowestPage <= chunk.highestPage)
        return true;
    Geometry::IndexRange const corners = faces_.corners(begin, end);
    for (std::uint64_t i = corners.begin; i < corners.end; ++i)
        if (faces_.points()[i] < faces_.pointCount() && !owns(part, faces_.points()[i]))
            return false;
    return true;
}

PointOwners::PointOwners(Geometry::MeshFaces const& faces, std::size_t partCount)
    : faces_(faces), firstFaces_(partCount + 1), owners_((faces.pointCount() >> kPageBits) + 1, kMostParts),
      chunks_(chunkOf(faces.faceCount()) + 1)
{
    // Parts have like numbers of corners, and begin with a chunk.
    for (std::size_t part = 1; part < partCount; ++part)
        firstFaces_[part] = faces.firstFaceFrom(faces.cornerCount() * part / partCount) / kChunkFaces * kChunkFaces;
    firstFaces_[partCount] = faces.faceCount();
    forEachPart(partCount, [&](std::size_t part) {
        forEachChunk(part, [&](std::uint64_t begin, std::uint64_t end) { meet(part, begin, end); });
    });
    std::vector<std::uint64_t> cornersToShare(partCount);
    forEachPart(partCount, [&](std::size_t part) {
        forEachChunk(part, [&](std::uint64_t begin, std::uint64_t end) {
            bool const isOwn = ownsAll(part, begin, end);
            chunks_[chunkOf(begin)].isOwn = isOwn;
            Geometry::IndexRange const corners = faces.corners(begin, end);
            cornersToShare[part] += isOwn ? 0 : corners.end - corners.begin;
        });
    });
    std::uint64_t toShare = 0;
    for (std::uint64_t const corners : cornersToShare)
        toShare += corners;
    areMostlyApart_ = toShare < faces.cornerCount() / 16;
}

} // namespace Veldrin::GeometryAlgorithms
