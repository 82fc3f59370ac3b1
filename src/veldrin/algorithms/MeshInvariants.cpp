#include <veldrin/algorithms/MeshInvariants.h>

#include <veldrin/algorithms/internal/CountUnited.h>
#include <veldrin/algorithms/internal/EdgePoints.h>
#include <veldrin/algorithms/internal/FaceComponents.h>
#include <veldrin/algorithms/internal/MeshFaces.h>
#include <veldrin/geometry/Prototypes.h>

#include <cstdint>

namespace Veldrin::Geometry::Mesh {

namespace {

    constexpr std::size_t kGrainPoints = 16384;

    bool readMesh(Object const& mesh, MeshFaces& faces)
    {
        return Object::isA(mesh, *getMeshPrototype()) && faces.read(mesh);
    }

    int euler(MeshFaces const& faces, HalfEdgeDataStructure const& edges)
    {
        auto const cut = [](std::uint64_t count) { return static_cast<std::uint32_t>(count); };
        return static_cast<int>(cut(faces.faceCount()) + (cut(faces.pointCount()) - cut(edges.edgeCount())));
    }

    int components(MeshFaces const& faces)
    {
        return static_cast<int>(static_cast<std::uint32_t>(faceComponentCount(faces)));
    }

    /// Components that have edges and no border: all else is joined with one more element, which stands for the border.
    int closedComponents(HalfEdgeDataStructure const& edges)
    {
        std::uint64_t const pointCount = edges.pointCount();
        auto const border = static_cast<unsigned int>(pointCount);
        auto const isOnEdge = pointsOnEdges(edges);
        PointSets sets(pointCount + 1);
        auto const unitePoints = [&](std::uint64_t begin, std::uint64_t end, auto const& unite) {
            edges.forEachEdge(begin, end, [&](HalfEdgeDataStructure::Edge const& edge) {
                unite(edge.lower, edge.upper);
                if (edge.isBoundary())
                    unite(edge.lower, border);
            });
            for (std::uint64_t point = begin; point < end; ++point)
                if (!isOnEdge[point])
                    unite(static_cast<unsigned int>(point), border);
        };
        auto const uniteLoosely = [&](std::uint64_t begin, std::uint64_t end) {
            std::uint64_t linkCount = 0;
            unitePoints(begin, end, [&, parents = sets.parents()](unsigned int a, unsigned int b) {
                parents.uniteLoosely(a, b, linkCount);
            });
            return linkCount;
        };
        auto const uniteLocked = [&](std::uint64_t begin, std::uint64_t end) {
            unitePoints(begin, end, [&](unsigned int a, unsigned int b) { sets.unite(a, b); });
        };
        std::uint64_t const count = countUnited(sets, pointCount, kGrainPoints, false, uniteLoosely, uniteLocked);
        return static_cast<int>(static_cast<std::uint32_t>(count - 1));
    }

} // namespace

int eulerCharacteristic(Object const& mesh)
{
    return eulerCharacteristic(mesh, HalfEdgeDataStructure(mesh));
}

int eulerCharacteristic(Object const& mesh, HalfEdgeDataStructure const& edges)
{
    MeshFaces faces;
    return readMesh(mesh, faces) ? euler(faces, edges) : 0;
}

int connectedComponents(Object const& mesh)
{
    MeshFaces faces;
    return readMesh(mesh, faces) ? components(faces) : -1;
}

Math::int3 bettiNumbers(Object const& mesh)
{
    MeshFaces faces;
    if (!readMesh(mesh, faces))
        return {0, 0, 0};
    HalfEdgeDataStructure const edges(mesh);
    int const b0 = components(faces);
    int const b2 = closedComponents(edges);
    return {b0, b0 + b2 - euler(faces, edges), b2};
}

} // namespace Veldrin::Geometry::Mesh
