#include <veldrin/algorithms/FaceVertexAdjacency.h>

#include <nexil/parallel/Parallel.h>
#include <veldrin/algorithms/internal/FaceBlocks.h>
#include <veldrin/algorithms/internal/PendingOutput.h>

#include <algorithm>
#include <array>
#include <atomic>
#include <vector>

// A counting sort puts the face-vertices of each point together. Then every point looks, among the edges that begin or end
// at it, for those that it owns as the lower of their two points: the two sides of an edge stand in the group of its owner,
// and so every side is found once, by one thread.
namespace Veldrin::GeometryAlgorithms {

namespace {

    using Geometry::FaceBlocks;
    using Geometry::kInvalidIndex;
    using Geometry::MeshFaces;
    using Geometry::Mesh::FaceEdge;

    namespace grain {
        constexpr std::size_t kPoints = 1024;
    } // namespace grain

    /// Groups up to this size are searched from end to end; larger ones are sorted.
    constexpr std::uint64_t kSmallGroup = 16;
    /// Groups from this size on are sorted by all threads.
    constexpr std::uint64_t kHugeGroup = 65536;

    constexpr std::uint64_t kPrefetchDistance = 32;

    /// One run of a face along an edge between the point whose group it is in and another.
    struct Run {
        unsigned int other;
        unsigned int index; ///< of the face-vertex that it starts from
        unsigned int face;
        unsigned int corner;

        [[nodiscard]] FaceEdge edge() const noexcept { return {face, corner}; }
    };

    /// The first two runs in face order that belong to different faces: whatever a face is looking for across the edge is
    /// one of them.
    class Candidates {
    public:
        void add(Run const& run) noexcept
        {
            if (count_ == 0 || (count_ == 1 && run.face != first_.face))
                (count_++ == 0 ? first_ : second_) = run.edge();
        }

        [[nodiscard]] FaceEdge across(FaceEdge const& edge) const noexcept
        {
            return edge.face != first_.face ? first_ : second_;
        }

    private:
        FaceEdge first_;
        FaceEdge second_;
        int count_ = 0;
    };

    template <class Ranges>
    class Opposites {
    public:
        Opposites(MeshFaces const& faces, Ranges const& ranges, FaceEdge const* pointFaces, FaceEdge* adjacentEdges)
            : points_(faces.points()), faceVertexCount_(faces.cornerCount()), ranges_(ranges), pointFaces_(pointFaces),
              adjacentEdges_(adjacentEdges)
        {
        }

        /// Writes both sides of all edges that a point owns; its face-vertices are pointFaces[begin, end).
        void find(unsigned int point, std::uint64_t begin, std::uint64_t end)
        {
            if (end - begin > kSmallGroup || !findInPlainGroup(point, begin, end))
                findInAnyGroup(point, begin, end);
        }

    private:
        /// The corners around one of a face, which is at `first + corner` itself.
        struct Around {
            unsigned int first;
            unsigned int before; ///< corner
            unsigned int next;   ///< point, as is the other
            unsigned int previous;
        };

        [[gnu::always_inline]] Around around(FaceEdge const& at) const noexcept
        {
            Geometry::IndexRange const range = ranges_[at.face];
            auto const first = static_cast<unsigned int>(range.begin);
            auto const last = static_cast<unsigned int>(range.end - range.begin) - 1;
            unsigned int const before = at.corner == 0 ? last : at.corner - 1;
            return {first, before, points_[first + (at.corner == last ? 0 : at.corner + 1)], points_[first + before]};
        }

        /// Runs of a small group between its point and others. How many there are is kept beside it, in a register.
        struct FewRuns {
            std::array<unsigned int, kSmallGroup> others;
            std::array<unsigned int, kSmallGroup> indices;
            std::array<FaceEdge, kSmallGroup> edges;

            [[gnu::always_inline]] void set(std::size_t at, unsigned int other, unsigned int index,
                                            FaceEdge const& edge) noexcept
            {
                others[at] = other;
                indices[at] = index;
                edges[at] = edge;
            }
        };

        /// For points that every face has once, between two different ones: false where it is otherwise.
        ///
        /// Faces come in order then, and the first run that fits is the right one. Without branches on what a mesh may have in
        /// any order, as half of them would be mispredicted.
        bool findInPlainGroup(unsigned int point, std::uint64_t begin, std::uint64_t end)
        {
            std::size_t leavingCount = 0;
            std::size_t arrivingCount = 0;
            bool isPlain = true;
            unsigned int lastFace = kInvalidIndex;
            for (std::uint64_t i = begin; i < end; ++i) {
                prefetch(i + kPrefetchDistance);
                FaceEdge const at = pointFaces_[i];
                Around const a = around(at);
                isPlain &= (at.face != lastFace) & (a.next != a.previous);
                lastFace = at.face;
                leavingFew_.set(leavingCount, a.next, a.first + at.corner, at);
                leavingCount += a.next > point ? 1 : 0;
                arrivingFew_.set(arrivingCount, a.previous, a.first + a.before, {at.face, a.before});
                arrivingCount += a.previous > point ? 1 : 0;
            }
            if (!isPlain)
                return false;
            write(leavingFew_, leavingCount, arrivingFew_, arrivingCount);
            write(arrivingFew_, arrivingCount, leavingFew_, leavingCount);
            return true;
        }

        /// For each of `runs` the first of `others` along the same edge.
        [[gnu::always_inline]] void write(FewRuns const& runs, std::size_t count, FewRuns const& others,
                                          std::size_t otherCount)
        {
            for (std::size_t i = 0; i < count; ++i) {
                std::size_t found = kSmallGroup;
                for (std::size_t j = otherCount; j-- > 0;)
                    found = others.others[j] == runs.others[i] ? j : found;
                adjacentEdges_[runs.indices[i]] = found == kSmallGroup ? FaceEdge{} : others.edges[found];
            }
        }

        void findInAnyGroup(unsigned int point, std::uint64_t begin, std::uint64_t end)
        {
            leaving_.clear();
            arriving_.clear();
            for (std::uint64_t i = begin; i < end; ++i) {
                prefetch(i + kPrefetchDistance);
                FaceEdge const at = pointFaces_[i];
                Around const a = around(at);
                if (a.next > point)
                    leaving_.push_back({a.next, a.first + at.corner, at.face, at.corner});
                else if (a.next == point)
                    adjacentEdges_[a.first + at.corner] = FaceEdge{};
                if (a.previous > point)
                    arriving_.push_back({a.previous, a.first + a.before, at.face, a.before});
            }
            sort(leaving_);
            sort(arriving_);
            write(leaving_, arriving_);
            write(arriving_, leaving_);
        }

        /// Where points are numbered without order, each face lies somewhere else in memory.
        [[gnu::always_inline]] void prefetch(std::uint64_t i) const noexcept
        {
            if (i < faceVertexCount_) {
                std::uint64_t const first = ranges_[pointFaces_[i].face].begin;
                __builtin_prefetch(points_ + first);
                __builtin_prefetch(adjacentEdges_ + first, 1);
            }
        }

        /// Without branches on what a mesh may have in any order: half of them would be mispredicted.
        static void sort(std::vector<Run>& runs)
        {
            auto const isBefore = [](Run const& a, Run const& b) {
                return a.other != b.other ? a.other < b.other : a.index < b.index;
            };
            if (runs.size() < kHugeGroup)
                std::sort(runs.begin(), runs.end(), isBefore);
            else
                Nexil::parallel::sort(runs.begin(), runs.end(), isBefore);
        }

        /// For each of the sorted `runs` the lowest of the sorted `others` along the same edge in another face.
        void write(std::vector<Run> const& runs, std::vector<Run> const& others)
        {
            std::size_t j = 0;
            for (std::size_t i = 0; i < runs.size();) {
                unsigned int const other = runs[i].other;
                while (j < others.size() && others[j].other < other)
                    ++j;
                Candidates candidates;
                for (; j < others.size() && others[j].other == other; ++j)
                    candidates.add(others[j]);
                for (; i < runs.size() && runs[i].other == other; ++i)
                    adjacentEdges_[runs[i].index] = candidates.across(runs[i].edge());
            }
        }

        unsigned int const* points_;
        std::uint64_t faceVertexCount_;
        Ranges const& ranges_;
        FaceEdge const* pointFaces_;
        FaceEdge* adjacentEdges_;
        // Kept from point to point: making them takes longer than finding what goes into them.
        FewRuns leavingFew_;
        FewRuns arrivingFew_;
        std::vector<Run> leaving_;
        std::vector<Run> arriving_;
    };

    /// Per point and block how many face-vertices there are; false when one names no point of the mesh.
    bool countFaceVertices(MeshFaces const& faces, FaceBlocks& blocks)
    {
        std::atomic<bool> isValid{true};
        blocks.forEach([&](std::size_t block) {
            blocks.counts(block).resize(faces.pointCount());
            unsigned int* const counts = blocks.counts(block).data();
            blocks.forEachChunk(block, [&](std::uint64_t begin, std::uint64_t end) {
                Geometry::IndexRange const corners = faces.corners(begin, end);
                for (std::uint64_t i = corners.begin; i < corners.end; ++i) {
                    unsigned int const point = faces.points()[i];
                    if (point >= faces.pointCount()) [[unlikely]] {
                        isValid.store(false, std::memory_order_relaxed);
                        return;
                    }
                    ++counts[point];
                }
            });
        });
        return isValid.load(std::memory_order_relaxed);
    }

} // namespace

bool buildFaceVertexAdjacency(Object const& mesh, Nexil::Array<FaceEdge>& adjacentEdges,
                              Nexil::Array<FaceEdge>& pointFaces, Nexil::Array<unsigned int>& pointFaceIndex,
                              Nexil::RuntimeServices const*)
{
    MeshFaces faces;
    if (!faces.read(mesh) || !faces.isPartition())
        return false;
    FaceBlocks blocks(faces);
    if (!countFaceVertices(faces, blocks))
        return false;

    PendingOutput<FaceEdge> groups(pointFaces, faces.cornerCount());
    PendingOutput<unsigned int> groupBegins(pointFaceIndex, faces.pointCount() + 1);
    PendingOutput<FaceEdge> opposites(adjacentEdges, faces.cornerCount());
    blocks.countsToPlaces(
        faces.pointCount(), [](std::uint64_t) {},
        [begins = groupBegins.data()](std::size_t point, unsigned int place) { begins[point] = place; });
    groupBegins.data()[faces.pointCount()] = static_cast<unsigned int>(faces.cornerCount());

    faces.withRanges([&](auto const& ranges) {
        blocks.forEach([&](std::size_t block) {
            blocks.forEachChunk(block, [&, points = faces.points(), places = blocks.counts(block).data(),
                                        target = groups.data(),
                                        last = faces.cornerCount()](std::uint64_t begin, std::uint64_t end) {
                for (std::uint64_t f = begin; f < end; ++f) {
                    Geometry::IndexRange const range = ranges[f];
                    unsigned int const* const corners = points + range.begin;
                    auto const count = static_cast<unsigned int>(range.end - range.begin);
                    if (count <= kPrefetchDistance && range.end + 2 * kPrefetchDistance < last)
                        for (unsigned int k = 0; k < count; ++k) {
                            __builtin_prefetch(places + corners[k + 2 * kPrefetchDistance], 1);
                            __builtin_prefetch(target + places[corners[k + kPrefetchDistance]], 1);
                        }
                    for (unsigned int k = 0; k < count; ++k)
                        target[places[corners[k]]++] = {static_cast<unsigned int>(f), k};
                }
            });
        });
        Nexil::parallel::forRange(faces.pointCount(), grain::kPoints, [&](std::size_t begin, std::size_t end) {
            Opposites finder(faces, ranges, groups.data(), opposites.data());
            for (std::size_t point = begin; point < end; ++point)
                finder.find(static_cast<unsigned int>(point), groupBegins.data()[point], groupBegins.data()[point + 1]);
        });
    });
    opposites.commit();
    groups.commit();
    groupBegins.commit();
    return true;
}

} // namespace Veldrin::GeometryAlgorithms
