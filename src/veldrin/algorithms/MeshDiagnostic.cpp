#include <veldrin/algorithms/MeshDiagnostic.h>

#include <nexil/parallel/Scan.h>
#include <veldrin/algorithms/HalfEdgeDataStructure.h>
#include <veldrin/algorithms/internal/EdgePoints.h>
#include <veldrin/algorithms/internal/FaceCorners.h>
#include <veldrin/algorithms/internal/FaceNormal.h>
#include <veldrin/algorithms/internal/MeshFaces.h>
#include <veldrin/geometry/Prototypes.h>

#include <cmath>
#include <limits>
#include <vector>

namespace Veldrin::Geometry::Mesh {

namespace {

    namespace parallel = Nexil::parallel;
    using Edge = HalfEdgeDataStructure::Edge;

    namespace grain {
        constexpr std::size_t kFaces = 16384;
        constexpr std::size_t kPoints = 16384;
    } // namespace grain

    enum Fault : unsigned char { Degenerate = 1, ZeroArea = 2, NonManifold = 4, Inconsistent = 8 };

    using Faults = Nexil::Array<unsigned char>;

    bool hasNoArea(GeometryAlgorithms::Positions const& positions, unsigned int const* corners, std::uint64_t count)
    {
        Math::float3 const v = GeometryAlgorithms::fanVector(positions, corners, count);
        return !(std::sqrt(v.x * v.x + v.y * v.y + v.z * v.z) > std::numeric_limits<float>::min());
    }

    template <class Ranges>
    void findFaultyShapes(MeshFaces const& faces, Ranges const& ranges, GeometryAlgorithms::Positions const& positions,
                          Faults& faults)
    {
        unsigned int const* const points = faces.points();
        parallel::forRange(faces.faceCount(), grain::kFaces, [&](std::size_t begin, std::size_t end) {
            std::vector<std::uint64_t> scratch;
            for (std::size_t face = begin; face < end; ++face) {
                IndexRange const range = ranges[face];
                if (!isRegularFace(points, range, faces.pointCount(), scratch))
                    faults[face] = Degenerate;
                else if (hasNoArea(positions, points + range.begin, range.end - range.begin))
                    faults[face] = ZeroArea;
                else
                    faults[face] = 0;
            }
        });
    }

    bool hasFaultyEdge(HalfEdgeDataStructure const& edges)
    {
        return parallel::reduceInOrder(
            edges.pointCount(), grain::kPoints, false,
            [&](std::size_t begin, std::size_t end, bool isFound) {
                edges.forEachEdge(begin, end,
                                  [&](Edge const& edge) { isFound |= edge.isNonManifold() || edge.isInconsistent(); });
                return isFound;
            },
            [](bool left, bool right) { return left || right; });
    }

    template <class Ranges>
    void addFaultyEdges(MeshFaces const& faces, Ranges const& ranges, HalfEdgeDataStructure const& edges,
                        Faults& faults)
    {
        unsigned int const* const points = faces.points();
        parallel::forRange(faces.faceCount(), grain::kFaces, [&](std::size_t begin, std::size_t end) {
            for (std::size_t face = begin; face < end; ++face) {
                IndexRange const range = ranges[face];
                unsigned int found = faults[face];
                for (std::uint64_t i = range.begin; i < range.end; ++i) {
                    Edge const edge = edges.findEdge(points[i], points[i + 1 < range.end ? i + 1 : range.begin]);
                    found |= edge.isNonManifold() ? unsigned(NonManifold) : 0u;
                    found |= edge.isInconsistent() ? unsigned(Inconsistent) : 0u;
                }
                faults[face] = static_cast<unsigned char>(found);
            }
        });
    }

    Nexil::Array<unsigned int> facesWith(Fault fault, Faults const& faults)
    {
        return parallel::indicesWhere<unsigned int>(
            faults.size(), grain::kFaces, [&, fault](std::size_t face) { return (faults[face] & fault) != 0; });
    }

} // namespace

Diagnostic diagnose(Object const& mesh)
{
    MeshFaces faces;
    auto const positions = dataOf<Math::float3>(mesh, sPointPosition);
    if (!Object::isA(mesh, *getMeshPrototype()) || !positions || !faces.read(mesh) ||
        positions->size() < faces.pointCount())
        return {};
    HalfEdgeDataStructure const edges(mesh);
    Faults faults;
    Nexil::Internal::resizeUninitialized(faults, faces.faceCount());
    faces.withRanges([&](auto const& ranges) {
        findFaultyShapes(faces, ranges, {positions->data(), positions->size()}, faults);
        if (hasFaultyEdge(edges))
            addFaultyEdges(faces, ranges, edges, faults);
    });
    auto const isOnEdge = pointsOnEdges(edges);
    Diagnostic found;
    found.isolatedPoints = parallel::indicesWhere<unsigned int>(isOnEdge.size(), grain::kPoints,
                                                                [&](std::size_t point) { return !isOnEdge[point]; });
    found.degenerateFaces = facesWith(Degenerate, faults);
    found.zeroAreaFaces = facesWith(ZeroArea, faults);
    found.nonManifoldFaces = facesWith(NonManifold, faults);
    found.inconsistentFaces = facesWith(Inconsistent, faults);
    return found;
}

} // namespace Veldrin::Geometry::Mesh
