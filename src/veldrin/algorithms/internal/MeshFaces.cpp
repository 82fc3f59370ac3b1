#include <veldrin/algorithms/internal/MeshFaces.h>

namespace Veldrin::Geometry {

bool MeshFaces::read(Object const& mesh)
{
    auto offsets = dataOf<unsigned int>(mesh, sFaceOffset);
    auto points = dataOf<unsigned int>(mesh, sFaceVertex);
    std::uint64_t const faceCount = getElementCount(mesh, sFaceComp);
    if (!offsets || !points || (faceCount > 0 && offsets->size() < faceCount + 1))
        return false;
    RisingOffsets rising(std::move(offsets), faceCount);
    std::uint64_t const cornerCount = std::min<std::uint64_t>(rising.last(), getElementCount(mesh, sFaceVertexComp));
    if (points->size() < cornerCount)
        return false;
    offsets_ = std::move(rising);
    points_ = std::move(points);
    pointCount_ = getElementCount(mesh, sPointComp);
    cornerCount_ = cornerCount;
    return true;
}

std::uint64_t MeshFaces::firstFaceFrom(std::uint64_t corner) const noexcept
{
    if (faceCount() == 0)
        return 0;
    unsigned int const* const offsets = offsets_.data();
    return static_cast<std::uint64_t>(std::lower_bound(offsets, offsets + faceCount(), corner) - offsets);
}

} // namespace Veldrin::Geometry
