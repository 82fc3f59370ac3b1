#include <veldrin/algorithms/MeshInvariants.h>

#include <lattix/DisjointSet.h>
#include <nexil/parallel/Parallel.h>
#include <veldrin/algorithms/internal/EdgePoints.h>
#include <veldrin/algorithms/internal/MeshFaces.h>
#include <veldrin/geometry/Prototypes.h>

#include <algorithm>
#include <vector>

namespace Veldrin::Geometry::Mesh {

namespace {

    namespace parallel = Nexil::parallel;
    using Sets = Lattix::DisjointSet<unsigned int>;

    namespace grain {
        constexpr std::size_t kFaces = 16384;
        constexpr std::size_t kPoints = 16384;
    } // namespace grain

    bool readMesh(Object const& mesh, MeshFaces& faces)
    {
        return Object::isA(mesh, *getMeshPrototype()) && faces.read(mesh);
    }

    int euler(MeshFaces const& faces, HalfEdgeDataStructure const& edges)
    {
        auto const cut = [](std::uint64_t count) { return static_cast<std::uint32_t>(count); };
        return static_cast<int>(cut(faces.faceCount()) + (cut(faces.pointCount()) - cut(edges.edgeCount())));
    }

    struct Link {
        unsigned int root;
        unsigned int lesserRoot;
    };

    /// Unites all pairs that unitePairs(begin, end, unite) hands to unite(a, b) over [0, count), and returns the number of
    /// sets. What unite(a, b) returns may stand for either in the next call. Sets are linked without locks; only what was
    /// linked is united once more, and only where two threads got into each other's way.
    template <class UnitePairs>
    std::uint64_t uniteAll(Sets& sets, std::uint64_t count, std::size_t grain, UnitePairs const& unitePairs)
    {
        std::vector<std::vector<Link>> links(count / grain + 1);
        parallel::forRange(links.size(), 1, [&](std::size_t firstRange, std::size_t endRange) {
            for (std::size_t range = firstRange; range < endRange; ++range) {
                auto const onLink = [&found = links[range]](unsigned int root, unsigned int lesserRoot) {
                    found.push_back({root, lesserRoot});
                };
                unitePairs(range * grain, std::min<std::uint64_t>(count, (range + 1) * grain),
                           [&](unsigned int a, unsigned int b) { return sets.uniteLoosely(a, b, onLink); });
            }
        });
        std::uint64_t linkCount = 0;
        for (auto const& found : links)
            linkCount += found.size();
        std::uint64_t const roots = sets.rootCount();
        if (linkCount == sets.size() - roots)
            return roots;
        parallel::forRange(links.size(), 1, [&](std::size_t firstRange, std::size_t endRange) {
            for (std::size_t range = firstRange; range < endRange; ++range)
                for (Link const& link : links[range])
                    sets.unite(link.root, link.lesserRoot);
        });
        return sets.rootCount();
    }

    int components(MeshFaces const& faces)
    {
        unsigned int const* const points = faces.points();
        std::uint64_t const pointCount = faces.pointCount();
        Sets sets(pointCount);
        std::uint64_t const count = faces.withRanges([&](auto const& ranges) {
            return uniteAll(sets, faces.faceCount(), grain::kFaces,
                            [&](std::size_t begin, std::size_t end, auto const& unite) {
                                for (std::size_t face = begin; face < end; ++face) {
                                    IndexRange const range = ranges[face];
                                    std::uint64_t i = range.begin;
                                    while (i < range.end && points[i] >= pointCount)
                                        ++i;
                                    if (i == range.end)
                                        continue;
                                    for (unsigned int first = points[i++]; i < range.end; ++i)
                                        if (points[i] < pointCount)
                                            first = unite(first, points[i]);
                                }
                            });
        });
        return static_cast<int>(static_cast<std::uint32_t>(count));
    }

    /// Components that have edges and no border: all else is joined with one more element, which stands for the border.
    int closedComponents(HalfEdgeDataStructure const& edges)
    {
        std::uint64_t const pointCount = edges.pointCount();
        auto const border = static_cast<unsigned int>(pointCount);
        auto const isOnEdge = pointsOnEdges(edges);
        Sets sets(pointCount + 1);
        std::uint64_t const count =
            uniteAll(sets, pointCount, grain::kPoints, [&](std::size_t begin, std::size_t end, auto const& unite) {
                edges.forEachEdge(begin, end, [&](HalfEdgeDataStructure::Edge const& edge) {
                    unite(edge.lower, edge.upper);
                    if (edge.isBoundary())
                        unite(edge.lower, border);
                });
                for (std::size_t point = begin; point < end; ++point)
                    if (!isOnEdge[point])
                        unite(static_cast<unsigned int>(point), border);
            });
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
