#include <veldrin/algorithms/MeshInvariants.h>

#include <lattix/DisjointSet.h>
#include <nexil/JobCancel.h>
#include <nexil/parallel/Parallel.h>
#include <nexil/parallel/Scan.h>
#include <veldrin/algorithms/internal/EdgePoints.h>
#include <veldrin/algorithms/internal/MeshFaces.h>
#include <veldrin/geometry/Prototypes.h>

#include <algorithm>
#include <cstdint>
#include <functional>

namespace Veldrin::Geometry::Mesh {

namespace {

    namespace parallel = Nexil::parallel;
    using Sets = Lattix::DisjointSet<unsigned int>;

    namespace grain {
        constexpr std::uint64_t kCorners = 49152;
        constexpr std::size_t kPoints = 16384;
    } // namespace grain

    // One thread unites fewer corners before another has woken up.
    constexpr std::uint64_t kParallelCorners = std::uint64_t(3) << 16;
    // A forest of so many points fits the cache that a core has for itself, and pays for other threads that stand by while
    // no more than so many corners are united.
    constexpr std::uint64_t kCachedPoints = std::uint64_t(1) << 18;
    constexpr std::uint64_t kMostCornersAlone = std::uint64_t(3) << 20;

    bool readMesh(Object const& mesh, MeshFaces& faces)
    {
        return Object::isA(mesh, *getMeshPrototype()) && faces.read(mesh);
    }

    int euler(MeshFaces const& faces, HalfEdgeDataStructure const& edges)
    {
        auto const cut = [](std::uint64_t count) { return static_cast<std::uint32_t>(count); };
        return static_cast<int>(cut(faces.faceCount()) + (cut(faces.pointCount()) - cut(edges.edgeCount())));
    }

    /// The number of sets, once unite(begin, end) has united [0, count) and told how many links that took. Where two threads
    /// got into each other's way, uniteLocked(begin, end) does it again. Asks for cancellation after each `grain`.
    template <class Unite, class UniteLocked>
    std::uint64_t countUnited(Sets const& sets, std::uint64_t count, std::size_t grain, bool isAlone,
                              Unite const& unite, UniteLocked const& uniteLocked)
    {
        std::uint64_t linkCount = 0;
        if (isAlone) {
            for (std::uint64_t begin = 0; begin < count; begin += grain) {
                Nexil::Internal::throwIfJobCancelled();
                linkCount += unite(begin, std::min<std::uint64_t>(count, begin + grain));
            }
        } else {
            linkCount = parallel::reduceInOrder(
                count, grain, std::uint64_t(0),
                [&](std::size_t begin, std::size_t end, std::uint64_t) { return unite(begin, end); }, std::plus<>());
        }
        std::uint64_t const rootCount = sets.rootCount();
        if (linkCount == sets.size() - rootCount)
            return rootCount;
        parallel::forRange(count, grain, uniteLocked);
        return sets.rootCount();
    }

    /// How the pairs of a face are united.
    enum class Way {
        AskFirst, ///< loosely, but looking first whether they hang under one parent: most do where faces are in order
        Loosely,  ///< without locks
        Locked    ///< for many threads that want the same roots
    };

    template <class Parents>
    bool hangTogether(Parents parents, unsigned int const* points, std::uint64_t count, std::uint64_t pointCount)
    {
        if (count == 0 || points[0] >= pointCount)
            return false;
        unsigned int const parent = parents[points[0]];
        for (std::uint64_t i = 1; i < count; ++i)
            if (points[i] >= pointCount || parents[points[i]] != parent)
                return false;
        return true;
    }

    /// Makes those of a face's points that there are one set, and adds how many links that took.
    template <Way way, class Parents>
    void uniteFace(Parents parents, unsigned int const* points, std::uint64_t count, std::uint64_t pointCount,
                   std::uint64_t& linkCount)
    {
        // Every other triangle of a mesh has no point that is new, but hardly a larger polygon has none.
        if (way == Way::AskFirst && count == 3 && hangTogether(parents, points, count, pointCount))
            return;
        std::uint64_t first = 0;
        while (first < count && points[first] >= pointCount)
            ++first;
        if (first == count)
            return;
        unsigned int near = way == Way::AskFirst ? parents[points[first]] : points[first];
        for (std::uint64_t i = first + 1; i < count; ++i) {
            unsigned int const point = points[i];
            if (point >= pointCount || (way == Way::AskFirst && parents[point] == near))
                continue;
            near = way == Way::Locked ? parents.unite(near, point, linkCount)
                                      : parents.uniteLoosely(near, point, linkCount);
        }
    }

    /// Returns how many links that took.
    template <Way way, class Parents, class Ranges>
    std::uint64_t uniteFaces(Parents parents, MeshFaces const& faces, Ranges ranges, std::uint64_t begin,
                             std::uint64_t end)
    {
        unsigned int const* const points = faces.points();
        std::uint64_t const pointCount = faces.pointCount();
        std::uint64_t linkCount = 0;
        for (std::uint64_t face = begin; face < end; ++face) {
            auto const [first, last] = ranges[face];
            uniteFace<way>(parents, points + first, last - first, pointCount, linkCount);
        }
        return linkCount;
    }

    /// How a mesh lies in memory, judged by a few of its faces.
    struct Order {
        bool isByFace = false;  ///< faces share points with the next one more often than chance has it
        bool isByPoint = false; ///< most faces have points with near numbers
    };

    template <class Ranges>
    Order judgeOrder(MeshFaces const& faces, Ranges const& ranges)
    {
        constexpr std::uint64_t kLookedAt = 64;
        constexpr unsigned int kFar = 1024;
        unsigned int const* const points = faces.points();
        std::uint64_t sharingCount = 0;
        std::uint64_t nearCount = 0;
        for (std::uint64_t i = 0; i < kLookedAt && faces.faceCount() > 1; ++i) {
            std::uint64_t const face = (faces.faceCount() - 1) * i / kLookedAt;
            IndexRange const range = ranges[face];
            IndexRange const next = ranges[face + 1];
            if (range.end - range.begin < 2 || next.end - next.begin < 2)
                continue;
            auto const [lower, upper] = std::minmax(points[range.begin], points[range.begin + 1]);
            nearCount += upper - lower <= kFar ? 1 : 0;
            auto const* const end = points + std::min(range.end, range.begin + 4);
            auto const* const nextEnd = points + std::min(next.end, next.begin + 4);
            sharingCount += std::find_first_of(points + range.begin, end, points + next.begin, nextEnd) != end ? 1 : 0;
        }
        return {sharingCount > kLookedAt / 8, nearCount > kLookedAt / 2};
    }

    template <class Ranges>
    std::uint64_t components(MeshFaces const& faces, Ranges const& ranges)
    {
        Sets sets(faces.pointCount());
        Order const order = judgeOrder(faces, ranges);
        // Threads that want the same cache lines all the time are slower than one that has them all to itself.
        bool const isAlone =
            parallel::threadCount() == 1 || faces.cornerCount() < kParallelCorners ||
            (!order.isByPoint && faces.pointCount() <= kCachedPoints && faces.cornerCount() <= kMostCornersAlone);
        auto const uniteLocked = [&](std::uint64_t begin, std::uint64_t end) {
            return uniteFaces<Way::Locked>(sets.parents(), faces, ranges, begin, end);
        };
        auto const uniteBest = [&](std::uint64_t begin, std::uint64_t end) {
            if (order.isByFace)
                return isAlone ? uniteFaces<Way::AskFirst>(sets.parentsOfOneThread(), faces, ranges, begin, end)
                               : uniteFaces<Way::AskFirst>(sets.parents(), faces, ranges, begin, end);
            return isAlone ? uniteFaces<Way::Loosely>(sets.parentsOfOneThread(), faces, ranges, begin, end)
                           : uniteLocked(begin, end);
        };
        std::uint64_t const cornersOfFace = faces.cornerCount() / std::max<std::uint64_t>(1, faces.faceCount());
        return countUnited(sets, faces.faceCount(),
                           grain::kCorners / std::clamp<std::uint64_t>(cornersOfFace, 3, grain::kCorners), isAlone,
                           uniteBest, uniteLocked);
    }

    int components(MeshFaces const& faces)
    {
        std::uint64_t const count = faces.withRanges([&](auto const& ranges) { return components(faces, ranges); });
        return static_cast<int>(static_cast<std::uint32_t>(count));
    }

    /// Components that have edges and no border: all else is joined with one more element, which stands for the border.
    int closedComponents(HalfEdgeDataStructure const& edges)
    {
        std::uint64_t const pointCount = edges.pointCount();
        auto const border = static_cast<unsigned int>(pointCount);
        auto const isOnEdge = pointsOnEdges(edges);
        Sets sets(pointCount + 1);
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
        std::uint64_t const count = countUnited(sets, pointCount, grain::kPoints, false, uniteLoosely, uniteLocked);
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
