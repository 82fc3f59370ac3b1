#include <veldrin/algorithms/internal/PointClaims.h>

#include <veldrin/algorithms/internal/VectorClones.h>

namespace Veldrin::GeometryAlgorithms {

namespace {

    struct Bounds {
        unsigned int lowest = ~0u;
        unsigned int highest = 0;
    };

    VELDRIN_VECTOR_CLONES Bounds boundsOf(unsigned int const* points, std::size_t count) noexcept
    {
        unsigned int lowest = ~0u;
        unsigned int highest = 0;
        for (std::size_t i = 0; i < count; ++i) {
            lowest = std::min(lowest, points[i]);
            highest = std::max(highest, points[i]);
        }
        return {lowest, highest};
    }

} // namespace

PointClaims::PointClaims(Geometry::MeshFaces const& faces, std::size_t partCount)
    : faces_(faces), firstFaces_(partCount + 1),
      owners_((faces.pointCount() + (std::uint64_t(1) << kPageBits) - 1) >> kPageBits), areShared_(owners_.size()),
      chunks_((faces.faceCount() + kChunkFaces - 1) / kChunkFaces)
{
    // Parts have like numbers of corners, and begin with a chunk.
    for (std::size_t part = 1; part < partCount; ++part)
        firstFaces_[part] = faces.firstFaceFrom(faces.cornerCount() * part / partCount) / kChunkFaces * kChunkFaces;
    firstFaces_[partCount] = faces.faceCount();
}

PointClaims::Pages PointClaims::pagesOf(std::uint64_t begin, std::uint64_t end) const noexcept
{
    // Claiming a page that no face needs costs a second look at most; claiming for each corner takes far longer.
    constexpr std::size_t kMostPages = kChunkFaces / 4;
    Geometry::IndexRange const corners = faces_.corners(begin, end);
    Bounds const bounds = boundsOf(faces_.points() + corners.begin, corners.end - corners.begin);
    if (bounds.lowest > bounds.highest || bounds.highest >= faces_.pointCount() ||
        (bounds.highest >> kPageBits) - (bounds.lowest >> kPageBits) >= kMostPages)
        return {};
    return {bounds.lowest >> kPageBits, bounds.highest >> kPageBits};
}

std::vector<unsigned int> PointClaims::sharedPages() const
{
    std::vector<unsigned int> pages;
    for (unsigned int page = 0; page < areShared_.size(); ++page)
        if (isShared(page << kPageBits))
            pages.push_back(page);
    return pages;
}

bool PointClaims::hasSharedPoint(std::uint64_t begin, std::uint64_t end) const noexcept
{
    Geometry::IndexRange const corners = faces_.corners(begin, end);
    unsigned int const* const points = faces_.points();
    return std::any_of(points + corners.begin, points + corners.end,
                       [this](unsigned int point) { return point < faces_.pointCount() && isShared(point); });
}

} // namespace Veldrin::GeometryAlgorithms
