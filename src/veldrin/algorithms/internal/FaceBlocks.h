#pragma once

#include <nexil/parallel/Scan.h>
#include <veldrin/algorithms/internal/MeshFaces.h>

#include <utility>
#include <vector>

namespace Veldrin::Geometry {

/// The faces of a mesh cut into blocks, for a counting sort by point that needs no locks: each block counts and places
/// what its own faces have, behind what the blocks before it have, so that the order is that of the faces whatever the
/// number of blocks.
class FaceBlocks {
public:
    /// Blocks of whole faces with about as many corners each, one for a thread; a single one for a small mesh. Their
    /// counts together take at most 12 bytes a corner, or 4 bytes a point.
    explicit FaceBlocks(MeshFaces const& faces);

    [[nodiscard]] std::size_t size() const noexcept { return firstFaces_.size() - 1; }
    [[nodiscard]] std::uint64_t firstFace(std::size_t block) const noexcept { return firstFaces_[block]; }
    [[nodiscard]] std::uint64_t endFace(std::size_t block) const noexcept { return firstFaces_[block + 1]; }

    /// Per point: what a block has for it, and after `countsToPlaces` where the next of that goes.
    [[nodiscard]] Nexil::Array<unsigned int>& counts(std::size_t block) noexcept { return counts_[block]; }

    /// Calls visit(block) for each, in parallel.
    template <class Visit>
    void forEach(Visit const& visit)
    {
        Nexil::parallel::forRange(size(), 1, [&](std::size_t begin, std::size_t end) {
            for (std::size_t block = begin; block < end; ++block)
                visit(block);
        });
    }

    /// Calls visit(begin, end) for the faces of a block in order, asking for cancellation in between.
    template <class Visit>
    void forEachChunk(std::size_t block, Visit const& visit) const
    {
        constexpr std::uint64_t kChunkFaces = 65536;
        for (std::uint64_t begin = firstFace(block); begin < endFace(block); begin += kChunkFaces) {
            Nexil::Internal::throwIfJobCancelled();
            visit(begin, std::min(endFace(block), begin + kChunkFaces));
        }
    }

    /// Turns counts into places: point after point, and for each point block after block.
    /// Calls prepare(sum of all counts) first, and begins(point, its first place) for each point.
    template <class Prepare, class Begins>
    void countsToPlaces(std::uint64_t pointCount, Prepare const& prepare, Begins const& begins)
    {
        constexpr std::size_t kGrain = 16384;
        Nexil::parallel::scanInOrder(
            pointCount, kGrain, std::uint64_t(0),
            [&](std::size_t begin, std::size_t end) {
                std::uint64_t sum = 0;
                for (auto const& counts : counts_)
                    for (std::size_t p = begin; p < end; ++p)
                        sum += counts[p];
                return sum;
            },
            prepare,
            [&](std::size_t begin, std::size_t end, std::uint64_t before) {
                auto at = static_cast<unsigned int>(before);
                for (std::size_t p = begin; p < end; ++p) {
                    begins(p, at);
                    for (auto& counts : counts_)
                        at += std::exchange(counts[p], at);
                }
            });
    }

private:
    std::vector<std::uint64_t> firstFaces_;
    std::vector<Nexil::Array<unsigned int>> counts_;
};

} // namespace Veldrin::Geometry
