#include <veldrin/algorithms/internal/FaceBlocks.h>

namespace Veldrin::Geometry {

namespace {

    /// Below this many corners blocks cost more than they win.
    constexpr std::uint64_t kParallelCorners = 32768;
    constexpr std::uint64_t kMostBlocks = 16;

    std::size_t blockCount(MeshFaces const& faces)
    {
        if (faces.cornerCount() < kParallelCorners)
            return 1;
        std::uint64_t const affordable = 3 * faces.cornerCount() / std::max<std::uint64_t>(1, faces.pointCount());
        return std::clamp<std::uint64_t>(std::min<std::uint64_t>(affordable, Nexil::parallel::threadCount()), 1,
                                         kMostBlocks);
    }

} // namespace

FaceBlocks::FaceBlocks(MeshFaces const& faces) : firstFaces_(blockCount(faces) + 1), counts_(firstFaces_.size() - 1)
{
    for (std::size_t block = 1; block < size(); ++block)
        firstFaces_[block] = faces.firstFaceFrom(faces.cornerCount() * block / size());
    firstFaces_.back() = faces.faceCount();
}

} // namespace Veldrin::Geometry
