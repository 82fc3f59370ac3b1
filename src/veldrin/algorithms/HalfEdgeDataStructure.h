#pragma once

#include <nexil/Array.h>
#include <veldrin/geometry/Export.h>
#include <veldrin/object/Object.h>

#include <cstdint>

/// The edges of a mesh, and which of its faces use them.
///
///     Geometry::Mesh::HalfEdgeDataStructure const edges(*mesh);
///     edges.edgeCount();
///     if (edges.findEdge(3, 7).faceCount == 1)
///         ... // 3 and 7 lie on a border
namespace Veldrin::Geometry::Mesh {

/// Every undirected edge of a mesh once, with how many faces use it and in which directions.
///
/// A face uses the edges between its consecutive corners, the last and the first included. A repeated corner makes no edge,
/// and neither does one whose index is not below the element count of "point_component". A face counts once for an edge,
/// however often it runs along it.
///
/// Memory:  4 bytes an edge use and 4 bytes a point; while it is built, at most 24 bytes a face-vertex and 4 bytes a point.
/// Cost:    linear in face-vertices and points, n log n in the edges that one point owns (of two points the lower one owns
///          the edge) and in the corners of one face, so fans, books and giant polygons are no harder than a grid.
/// Threads: built in parallel, the same for every thread count; reading is safe from many threads at once.
class VELDRIN_API HalfEdgeDataStructure {
public:
    struct Edge {
        unsigned int lower = 0; ///< the smaller point index
        unsigned int upper = 0;
        unsigned int faceCount = 0; ///< distinct faces that use the edge
        bool isForward = false;     ///< some face runs it from `lower` to `upper`
        bool isBackward = false;    ///< some face runs it from `upper` to `lower`

        /// One face alone uses it.
        [[nodiscard]] bool isBoundary() const noexcept { return faceCount == 1; }
        [[nodiscard]] bool isNonManifold() const noexcept { return faceCount > 2; }
        /// Two faces run it in the same direction: their sides do not agree.
        [[nodiscard]] bool isInconsistent() const noexcept { return faceCount == 2 && isForward != isBackward; }
    };

    /// An object that is no mesh, or lacks topology for its faces, has no edges.
    /// Errors: std::bad_alloc; std::runtime_error when the job is cancelled.
    explicit HalfEdgeDataStructure(Object const& mesh);

    [[nodiscard]] std::uint64_t edgeCount() const noexcept { return edgeCount_; }

    /// The element count of "point_component"; 0 where there can be no edges.
    [[nodiscard]] std::uint64_t pointCount() const noexcept { return groupEnds_.size(); }

    /// The edge between two points; its `faceCount` is 0 when there is none. Cost: log n in the edges of the lower point.
    [[nodiscard]] Edge findEdge(unsigned int a, unsigned int b) const noexcept;

    /// Calls visit(Edge) for the edges that the points [begin, end) own, in a fixed order: over [0, pointCount()) for each
    /// edge once. Disjoint ranges may be visited at once.
    template <class Visit>
    void forEachEdge(std::uint64_t begin, std::uint64_t end, Visit const& visit) const
    {
        for (std::uint64_t owner = begin; owner < end; ++owner)
            for (std::uint64_t at = groupBegin(owner); at < groupEnds_[owner];) {
                Edge edge;
                at = readEdge(static_cast<unsigned int>(owner), at, edge);
                if (edge.faceCount > 0)
                    visit(edge);
            }
    }

private:
    [[nodiscard]] std::uint64_t groupBegin(std::uint64_t owner) const noexcept
    {
        return owner == 0 ? 0 : groupEnds_[owner - 1];
    }
    /// Reads the edge whose first use stands at `at`, or one without faces when its first use stands earlier in the group;
    /// returns where to go on.
    std::uint64_t readEdge(unsigned int owner, std::uint64_t at, Edge& edge) const noexcept;
    [[nodiscard]] Edge makeEdge(unsigned int owner, unsigned int use, std::uint64_t useCount, bool isAlong,
                                bool isAgainst) const noexcept;

    Nexil::Array<unsigned int> uses_;      // grouped by owner; how they are coded stands in the source
    Nexil::Array<unsigned int> groupEnds_; // one past the last use of each point's group
    Nexil::Array<std::uint64_t>
        folds_; // lower << 32 | upper, increasing, once for each face that runs the edge both ways
    std::uint64_t edgeCount_ = 0;
};

} // namespace Veldrin::Geometry::Mesh
