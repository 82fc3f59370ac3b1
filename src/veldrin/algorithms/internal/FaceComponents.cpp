#include <veldrin/algorithms/internal/FaceComponents.h>

#include <nexil/parallel/Parallel.h>
#include <veldrin/algorithms/internal/CountUnited.h>
#include <veldrin/algorithms/internal/MeshOrder.h>
#include <veldrin/algorithms/internal/Prefetch.h>

#include <algorithm>

namespace Veldrin::Geometry::Mesh {

namespace {

    namespace parallel = Nexil::parallel;

    constexpr std::uint64_t kGrainCorners = 49152;
    // One thread unites fewer corners before another has woken up.
    constexpr std::uint64_t kParallelCorners = std::uint64_t(3) << 16;
    // A forest of so many points fits the cache that a core has for itself, and pays for other threads that stand by while
    // no more than so many corners are united.
    constexpr std::uint64_t kCachedPoints = std::uint64_t(1) << 18;
    constexpr std::uint64_t kMostCornersAlone = std::uint64_t(3) << 20;

    /// How the pairs of a face are united.
    enum class Way {
        AskFirst, ///< loosely, but looking first whether they hang under one parent: most do where faces are in order
        Loosely,  ///< without locks
        Locked    ///< for many threads that want the same roots
    };

    template <class Parents>
    [[gnu::always_inline]] inline bool hangTogether(Parents parents, unsigned int const* points, std::uint64_t count,
                                                    std::uint64_t pointCount)
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
    [[gnu::always_inline]] inline void uniteFace(Parents parents, unsigned int const* points, std::uint64_t count,
                                                 std::uint64_t pointCount, std::uint64_t& linkCount)
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

    /// Has brought to the cache what faces some way behind need: corners, and the parents of some of these.
    template <unsigned int parentCount, class Parents>
    [[gnu::always_inline]] inline void prefetchAhead(Parents parents, unsigned int const* points, std::uint64_t first,
                                                     std::uint64_t cornerCount)
    {
        constexpr std::uint64_t kCornersAhead = 2048;
        constexpr std::uint64_t kParentsAhead = 48;
        prefetch(points, first + kCornersAhead);
        if (first + kParentsAhead + parentCount > cornerCount)
            return;
        for (unsigned int k = 0; k < parentCount; ++k)
            parents.prefetch(points[first + kParentsAhead + k]);
    }

    /// Returns how many links that took.
    template <Way way, unsigned int parentsAhead, class Parents, class Ranges>
    std::uint64_t uniteFaces(Parents parents, MeshFaces const& faces, Ranges ranges, std::uint64_t begin,
                             std::uint64_t end)
    {
        unsigned int const* const points = faces.points();
        std::uint64_t const pointCount = faces.pointCount();
        std::uint64_t const cornerCount = faces.cornerCount();
        std::uint64_t linkCount = 0;
        for (std::uint64_t face = begin; face < end; ++face) {
            auto const [first, last] = ranges[face];
            prefetchAhead<parentsAhead>(parents, points, first, cornerCount);
            uniteFace<way>(parents, points + first, last - first, pointCount, linkCount);
        }
        return linkCount;
    }

    template <class Ranges>
    std::uint64_t componentCount(MeshFaces const& faces, Ranges const& ranges)
    {
        PointSets sets(faces.pointCount());
        MeshOrder const order = judgeOrder(faces);
        // Threads that want the same cache lines all the time are slower than one that has them all to itself.
        bool const isAlone =
            parallel::threadCount() == 1 || faces.cornerCount() < kParallelCorners ||
            (!order.isByPoint && faces.pointCount() <= kCachedPoints && faces.cornerCount() <= kMostCornersAlone);
        auto const uniteLocked = [&](std::uint64_t begin, std::uint64_t end) {
            return uniteFaces<Way::Locked, 3>(sets.parents(), faces, ranges, begin, end);
        };
        auto const uniteBest = [&]<unsigned int parentsAhead>(std::uint64_t begin, std::uint64_t end) {
            if (order.isByFace)
                return isAlone ? uniteFaces<Way::AskFirst, parentsAhead>(sets.parentsOfOneThread(), faces, ranges,
                                                                         begin, end)
                               : uniteFaces<Way::AskFirst, parentsAhead>(sets.parents(), faces, ranges, begin, end);
            return isAlone
                       ? uniteFaces<Way::Loosely, parentsAhead>(sets.parentsOfOneThread(), faces, ranges, begin, end)
                       : uniteLocked(begin, end);
        };
        bool const isNear = order.isByPoint || faces.pointCount() <= kCachedPoints;
        auto const unite = [&](std::uint64_t begin, std::uint64_t end) {
            return isNear ? uniteBest.template operator()<1>(begin, end) : uniteBest.template operator()<3>(begin, end);
        };
        std::uint64_t const cornersOfFace = faces.cornerCount() / std::max<std::uint64_t>(1, faces.faceCount());
        return countUnited(sets, faces.faceCount(),
                           kGrainCorners / std::clamp<std::uint64_t>(cornersOfFace, 3, kGrainCorners), isAlone, unite,
                           uniteLocked);
    }

} // namespace

std::uint64_t faceComponentCount(MeshFaces const& faces)
{
    return faces.withRanges([&faces](auto const& ranges) { return componentCount(faces, ranges); });
}

} // namespace Veldrin::Geometry::Mesh
