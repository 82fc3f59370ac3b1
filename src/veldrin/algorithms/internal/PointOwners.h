#pragma once

#include <nexil/JobCancel.h>
#include <veldrin/algorithms/internal/MeshFaces.h>

#include <cstddef>
#include <vector>

namespace Veldrin::GeometryAlgorithms {

/// The faces of a mesh cut into parts, one a thread, and which part each point belongs to, so that threads can add to
/// sums at points and give the very bits of one loop over the faces in their order.
///
/// A page of points belongs to the first part, in face order, that meets it. A part adds what its faces have for points of
/// its own; what a later part has for them is added when all parts are through, part by part. So every point sees its
/// faces in order, and no point is touched by two threads at once. Parts are cut into chunks: one whose points are all its
/// part's own needs no second look. Where neighbours have near numbers, as in most meshes, next to all chunks are so.
class PointOwners {
public:
    /// partCount: 1 to `kMostParts`. Cost: one pass over the corners. Memory: one byte for 32 points, 12 for a chunk.
    /// Errors: std::bad_alloc; std::runtime_error when the job is cancelled.
    PointOwners(Geometry::MeshFaces const& faces, std::size_t partCount);

    static constexpr std::size_t kMostParts = 64;
    static constexpr std::uint64_t kChunkFaces = 1024;

    [[nodiscard]] std::size_t partCount() const noexcept { return firstFaces_.size() - 1; }
    [[nodiscard]] std::uint64_t firstFace(std::size_t part) const noexcept { return firstFaces_[part]; }

    /// Point of the mesh.
    [[nodiscard]] bool owns(std::size_t part, unsigned int point) const noexcept
    {
        return owners_[point >> kPageBits] == part;
    }

    /// Whether all points of the chunk that begins at `face` are its part's own.
    [[nodiscard]] bool isOwnChunk(std::uint64_t face) const noexcept { return chunks_[chunkOf(face)].isOwn; }

    /// Whether most of the work is in chunks whose points are their part's own.
    [[nodiscard]] bool areMostlyApart() const noexcept { return areMostlyApart_; }

    /// Calls body(begin, end) for the chunks of a part in order, and asks for cancellation before each.
    template <class Body>
    void forEachChunk(std::size_t part, Body const& body) const
    {
        for (std::uint64_t begin = firstFace(part), end = begin; begin < firstFace(part + 1); begin = end) {
            end = std::min((begin / kChunkFaces + 1) * kChunkFaces, firstFace(part + 1));
            Nexil::Internal::throwIfJobCancelled();
            body(begin, end);
        }
    }

private:
    // Small enough for the owners to stay in the nearest caches.
    static constexpr unsigned int kPageBits = 5;

    /// Pages that a chunk counts as meeting: all from the lowest to the highest when its points lie close together.
    struct Chunk {
        unsigned int lowestPage = 1;
        unsigned int highestPage = 0;
        bool isOwn = false;
    };

    struct Bounds;
    static Bounds looseBounds(unsigned int const* points, Geometry::IndexRange corners) noexcept;
    static Bounds exactBounds(unsigned int const* points, Geometry::IndexRange corners) noexcept;

    static std::size_t chunkOf(std::uint64_t face) noexcept { return face / kChunkFaces; }
    void meet(std::size_t part, std::uint64_t begin, std::uint64_t end);
    [[nodiscard]] bool ownsAll(std::size_t part, std::uint64_t begin, std::uint64_t end) const noexcept;

    Geometry::MeshFaces const& faces_;
    std::vector<std::uint64_t> firstFaces_;
    std::vector<unsigned char> owners_;
    std::vector<Chunk> chunks_;
    bool areMostlyApart_ = false;
};

} // namespace Veldrin::GeometryAlgorithms
