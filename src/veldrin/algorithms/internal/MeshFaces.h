#pragma once

#include <veldrin/algorithms/internal/RisingOffsets.h>

namespace Veldrin::Geometry {

/// Face f owns the corners [f N, (f + 1) N): a mesh of triangles, or of quads, needs no offsets.
template <unsigned int N>
struct UniformRanges {
    [[nodiscard]] constexpr IndexRange operator[](std::uint64_t f) const noexcept { return {f * N, f * N + N}; }
};

/// The faces of a mesh as algorithms walk them: corner ranges that rise and stay within "face_vertex".
///
///     MeshFaces faces;
///     if (!faces.read(mesh))
///         return;
///     faces.withRanges([&](auto const& ranges) { ... ranges[f].begin ... });
///
/// Points of corners are as the mesh has them: a kernel compares each with `pointCount()` before it uses it.
class MeshFaces {
public:
    /// False when "face_offset" or "face_vertex" is missing, or shorter than the faces ask for. Arrays are shared.
    [[nodiscard]] bool read(Object const& mesh);

    [[nodiscard]] std::uint64_t faceCount() const noexcept { return offsets_.count(); }
    [[nodiscard]] std::uint64_t pointCount() const noexcept { return pointCount_; }
    /// Corners that faces may own: the last offset, or the element count of "face_vertex_component" where that is less.
    [[nodiscard]] std::uint64_t cornerCount() const noexcept { return cornerCount_; }
    /// Point of each corner.
    [[nodiscard]] unsigned int const* points() const noexcept { return points_->data(); }
    /// Whether the ranges are those of the mesh's own offsets, beginning at 0: each corner belongs to one face.
    [[nodiscard]] bool isPartition() const noexcept { return offsets_.isUnchanged() && offsets_.first() == 0; }

    /// The corners of the faces [begin, end).
    [[nodiscard]] IndexRange corners(std::uint64_t begin, std::uint64_t end) const noexcept
    {
        if (begin == end)
            return {};
        unsigned int const* const offsets = offsets_.data();
        return {std::min<std::uint64_t>(offsets[begin], cornerCount_),
                std::min<std::uint64_t>(offsets[end], cornerCount_)};
    }

    /// The first face that begins at or behind a corner, to cut the faces into parts of like work.
    [[nodiscard]] std::uint64_t firstFaceFrom(std::uint64_t corner) const noexcept;

    /// Calls visit(ranges), whose operator[] gives the corners of a face; the compiler knows how many in a mesh of
    /// triangles or of quads only.
    template <class Visit>
    decltype(auto) withRanges(Visit const& visit) const
    {
        bool const isWhole = cornerCount_ == offsets_.last();
        if (isWhole && offsets_.uniformSize() == 3)
            return visit(UniformRanges<3>{});
        if (isWhole && offsets_.uniformSize() == 4)
            return visit(UniformRanges<4>{});
        return visit(OffsetRanges(offsets_.data(), offsets_.count(), cornerCount_));
    }

private:
    RisingOffsets offsets_;
    IndexArray points_;
    std::uint64_t pointCount_ = 0;
    std::uint64_t cornerCount_ = 0;
};

} // namespace Veldrin::Geometry
