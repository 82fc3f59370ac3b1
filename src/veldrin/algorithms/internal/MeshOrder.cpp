#include <veldrin/algorithms/internal/MeshOrder.h>

#include <algorithm>

namespace Veldrin::Geometry {

MeshOrder judgeOrder(MeshFaces const& faces) noexcept
{
    constexpr std::uint64_t kLookedAt = 64;
    std::uint64_t const far = std::max<std::uint64_t>(1024, faces.pointCount() / 64);
    auto const areNear = [far](std::uint64_t a, std::uint64_t b) { return (a < b ? b - a : a - b) <= far; };
    unsigned int const* const points = faces.points();
    std::uint64_t sharingCount = 0;
    std::uint64_t nearCount = 0;
    std::uint64_t localCount = 0;
    for (std::uint64_t i = 0; i < kLookedAt && faces.faceCount() > 1; ++i) {
        // Spread by the golden ratio: even steps may meet every other face only, of which some meshes have two kinds.
        std::uint64_t const share = i * 0x9E3779B9u & 0xFFFFFFFFu;
        std::uint64_t const face = share * (faces.faceCount() - 1) >> 32;
        IndexRange const range = faces.corners(face, face + 1);
        IndexRange const next = faces.corners(face + 1, face + 2);
        if (range.end - range.begin < 2 || next.end - next.begin < 2)
            continue;
        bool const hasNearPoints = areNear(points[range.begin], points[range.begin + 1]);
        nearCount += hasNearPoints ? 1 : 0;
        localCount += hasNearPoints && areNear(points[range.begin], points[next.begin]) ? 1 : 0;
        auto const* const end = points + std::min(range.end, range.begin + 4);
        auto const* const nextEnd = points + std::min(next.end, next.begin + 4);
        sharingCount += std::find_first_of(points + range.begin, end, points + next.begin, nextEnd) != end ? 1 : 0;
    }
    return {sharingCount > kLookedAt / 8, nearCount > kLookedAt / 2, localCount > kLookedAt / 2};
}

} // namespace Veldrin::Geometry
