#include <veldrin/algorithms/HalfEdgeDataStructure.h>

#include <nexil/parallel/Parallel.h>
#include <veldrin/algorithms/internal/FaceBlocks.h>
#include <veldrin/algorithms/internal/FaceCorners.h>
#include <veldrin/algorithms/internal/MeshFaces.h>
#include <veldrin/geometry/Prototypes.h>

#include <algorithm>
#include <type_traits>
#include <vector>

// The table is a counting sort of all edge uses by owner, in blocks of faces: count per point, running sum, put in place.
//
// A use is one face's run along one edge, in 32 bits: the distance from its owner to the other point, and in the lowest bit
// whether the face runs against it, from the other point to the owner. Distances are taken on a circle of 2^32 - 1 points,
// from the owner upwards, and the owner is the one of both that has less than half the circle to go. In a mesh of up to 2^31
// points that is always the lower one.
namespace Veldrin::Geometry::Mesh {

namespace {

    namespace parallel = Nexil::parallel;
    using Edge = HalfEdgeDataStructure::Edge;

    namespace grain {
        constexpr std::size_t kPoints = 16384;
    } // namespace grain

    /// Groups up to this size stay in face order and are searched from end to end; larger ones are sorted.
    constexpr std::uint64_t kSmallGroup = 24;
    constexpr unsigned int kHalfCircle = 0x7FFFFFFFu;

    struct Use {
        unsigned int owner;
        unsigned int code;
    };

    /// From one point to a different one.
    inline Use makeUse(unsigned int from, unsigned int to)
    {
        // In arithmetic without branches: which point is the lower one is anybody's guess where points lie anywhere.
        std::int64_t const step = std::int64_t(to) - std::int64_t(from);
        std::int64_t const isDown = step >> 63; // all bits, or none
        auto const lower = static_cast<unsigned int>(from + (step & isDown));
        auto const distance = static_cast<unsigned int>((step ^ isDown) - isDown);
        auto const isAgainst = static_cast<unsigned int>(isDown & 1);
        if (distance > kHalfCircle) [[unlikely]]
            return {lower + distance, ~distance << 1 | (isAgainst ^ 1)};
        return {lower, distance << 1 | isAgainst};
    }

    inline unsigned int otherPoint(unsigned int owner, unsigned int code)
    {
        constexpr std::uint64_t kCircle = 0xFFFFFFFFu;
        std::uint64_t const other = std::uint64_t(owner) + (code >> 1);
        return static_cast<unsigned int>(other < kCircle ? other : other - kCircle);
    }

    inline bool isSameEdge(unsigned int code, unsigned int other)
    {
        return (code ^ other) < 2;
    }

    constexpr std::uint64_t edgeKey(std::uint64_t from, std::uint64_t to)
    {
        return from << 32 | to;
    }

    /// What the first walk over a block of faces finds out for the second.
    struct Findings {
        /// Faces with a repeated or invalid corner, or fewer than three, in increasing order.
        std::vector<unsigned int> irregularFaces;
        std::vector<std::uint64_t> folds;
        std::vector<std::uint64_t> scratch;
    };

    /// Walks the edge uses of a block's faces, twice the same way.
    template <class Ranges>
    class UseWalk {
    public:
        UseWalk(MeshFaces const& faces, Ranges const& ranges)
            : ranges_(ranges), points_(faces.points()), pointCount_(faces.pointCount())
        {
        }

        /// Calls visit(Use) for each, and remembers what is odd about the faces.
        template <class Visit>
        void first(FaceBlocks const& blocks, std::size_t block, Findings& found, Visit const& visit) const
        {
            blocks.forEachChunk(block, [&](std::uint64_t begin, std::uint64_t end) {
                for (std::uint64_t face = begin; face < end; ++face) {
                    IndexRange const range = ranges_[face];
                    if (isRegularFace(points_, range, pointCount_, found.scratch)) [[likely]] {
                        visitRegular(range, visit);
                    } else {
                        found.irregularFaces.push_back(static_cast<unsigned int>(face));
                        visitIrregular(range, found.scratch, visit,
                                       [&](std::uint64_t key) { found.folds.push_back(key); });
                    }
                }
            });
        }

        template <class Visit>
        void again(FaceBlocks const& blocks, std::size_t block, Findings& found, Visit const& visit) const
        {
            std::size_t nextIrregular = 0;
            blocks.forEachChunk(block, [&](std::uint64_t begin, std::uint64_t end) {
                while (begin < end) {
                    bool const hasIrregular =
                        nextIrregular < found.irregularFaces.size() && found.irregularFaces[nextIrregular] < end;
                    std::uint64_t const stop = hasIrregular ? found.irregularFaces[nextIrregular] : end;
                    for (std::uint64_t face = begin; face < stop; ++face)
                        visitRegular(ranges_[face], visit);
                    begin = stop;
                    if (hasIrregular) {
                        visitIrregular(ranges_[begin++], found.scratch, visit, [](std::uint64_t) {});
                        ++nextIrregular;
                    }
                }
            });
        }

    private:
        template <class Visit>
        void visitRegular(IndexRange range, Visit const& visit) const
        {
            unsigned int const* const corners = points_ + range.begin;
            std::uint64_t const last = range.end - range.begin - 1;
            for (std::uint64_t i = 0; i < last; ++i)
                visit(makeUse(corners[i], corners[i + 1]));
            visit(makeUse(corners[last], corners[0]));
        }

        /// Each edge once in each direction that the face runs it in; visitFold(key) for those it runs both ways.
        template <class Visit, class VisitFold>
        void visitIrregular(IndexRange range, std::vector<std::uint64_t>& runs, Visit const& visit,
                            VisitFold const& visitFold) const
        {
            runs.clear();
            for (std::uint64_t i = range.begin; i < range.end; ++i) {
                unsigned int const from = points_[i];
                unsigned int const to = points_[i + 1 < range.end ? i + 1 : range.begin];
                if (from < pointCount_ && to < pointCount_ && from != to)
                    runs.push_back(edgeKey(from, to));
            }
            sortMany(runs.data(), runs.data() + runs.size());
            runs.erase(std::unique(runs.begin(), runs.end()), runs.end());
            for (std::uint64_t const run : runs) {
                std::uint64_t const from = run >> 32;
                std::uint64_t const to = run & 0xFFFFFFFFu;
                visit(makeUse(static_cast<unsigned int>(from), static_cast<unsigned int>(to)));
                if (from < to && std::binary_search(runs.begin(), runs.end(), edgeKey(to, from)))
                    visitFold(run);
            }
        }

        Ranges const& ranges_;
        unsigned int const* points_;
        std::uint64_t pointCount_;
    };

    /// Groups all uses by owner. groupEnds: per point, one past its group.
    template <class Ranges>
    void groupUses(MeshFaces const& faces, Ranges const& ranges, Nexil::Array<unsigned int>& uses,
                   Nexil::Array<unsigned int>& groupEnds, Nexil::Array<std::uint64_t>& folds)
    {
        UseWalk<Ranges> const walk(faces, ranges);
        FaceBlocks blocks(faces);
        std::vector<Findings> found(blocks.size());
        blocks.forEach([&](std::size_t block) {
            blocks.counts(block).resize(faces.pointCount());
            walk.first(blocks, block, found[block],
                       [counts = blocks.counts(block).data()](Use use) { ++counts[use.owner]; });
        });
        blocks.countsToPlaces(
            faces.pointCount(), [&](std::uint64_t total) { Nexil::Internal::resizeUninitialized(uses, total); },
            [](std::size_t, unsigned int) {});
        blocks.forEach([&](std::size_t block) {
            walk.again(blocks, block, found[block],
                       [places = blocks.counts(block).data(), target = uses.data()](Use use) {
                           target[places[use.owner]++] = use.code;
                       });
        });
        // Behind its last use the last block's place is the end of the group.
        groupEnds = std::move(blocks.counts(blocks.size() - 1));
        std::uint64_t foldCount = 0;
        for (Findings const& each : found)
            foldCount += each.folds.size();
        folds.reserve(foldCount);
        for (Findings const& each : found)
            for (std::uint64_t const key : each.folds)
                folds.push_back(key);
        sortMany(folds.begin(), folds.end());
    }

    /// Distinct edges among `size` uses; a size that is a std::integral_constant takes half the time.
    template <class Size>
    inline unsigned int distinctAmong(unsigned int const* uses, Size size)
    {
        unsigned int repeated = 0;
        for (unsigned int i = 1; i < size; ++i) {
            unsigned int isRepeated = 0;
            for (unsigned int j = 0; j < i; ++j)
                isRepeated |= isSameEdge(uses[i], uses[j]);
            repeated += isRepeated;
        }
        return size - repeated;
    }

    template <unsigned int size>
    inline unsigned int distinctAmong(unsigned int const* uses)
    {
        return distinctAmong(uses, std::integral_constant<unsigned int, size>());
    }

    /// Distinct edges of a group; sorts a large one.
    inline std::uint64_t finishGroup(unsigned int* first, unsigned int* last)
    {
        auto const size = static_cast<std::uint64_t>(last - first);
        switch (size) {
        case 0:
        case 1: return size;
        case 2: return distinctAmong<2>(first);
        case 3: return distinctAmong<3>(first);
        case 4: return distinctAmong<4>(first);
        case 5: return distinctAmong<5>(first);
        case 6: return distinctAmong<6>(first);
        default: break;
        }
        if (size <= kSmallGroup)
            return distinctAmong(first, static_cast<unsigned int>(size));
        sortMany(first, last);
        std::uint64_t repeated = 0;
        for (std::uint64_t i = 1; i < size; ++i)
            repeated += isSameEdge(first[i], first[i - 1]);
        return size - repeated;
    }

} // namespace

HalfEdgeDataStructure::HalfEdgeDataStructure(Object const& mesh)
{
    MeshFaces faces;
    if (!Object::isA(mesh, *getMeshPrototype()) || !faces.read(mesh))
        return;
    faces.withRanges([&](auto const& ranges) { groupUses(faces, ranges, uses_, groupEnds_, folds_); });
    edgeCount_ = parallel::reduceInOrder(
        groupEnds_.size(), grain::kPoints, std::uint64_t(0),
        [&](std::size_t begin, std::size_t end, std::uint64_t count) {
            unsigned int* first = uses_.data() + groupBegin(begin);
            for (std::size_t p = begin; p < end; ++p) {
                unsigned int* const last = uses_.data() + groupEnds_[p];
                count += finishGroup(first, last);
                first = last;
            }
            return count;
        },
        [](std::uint64_t left, std::uint64_t right) { return left + right; });
}

Edge HalfEdgeDataStructure::makeEdge(unsigned int owner, unsigned int use, std::uint64_t useCount, bool isAlong,
                                     bool isAgainst) const noexcept
{
    unsigned int const other = otherPoint(owner, use);
    Edge edge;
    edge.lower = std::min(owner, other);
    edge.upper = std::max(owner, other);
    edge.isForward = owner < other ? isAlong : isAgainst;
    edge.isBackward = owner < other ? isAgainst : isAlong;
    if (!folds_.empty()) {
        auto const [first, last] = std::equal_range(folds_.begin(), folds_.end(), edgeKey(edge.lower, edge.upper));
        useCount -= static_cast<std::uint64_t>(last - first);
    }
    edge.faceCount = static_cast<unsigned int>(useCount);
    return edge;
}

std::uint64_t HalfEdgeDataStructure::readEdge(unsigned int owner, std::uint64_t at, Edge& edge) const noexcept
{
    unsigned int const* const uses = uses_.data();
    std::uint64_t const begin = groupBegin(owner);
    std::uint64_t const end = groupEnds_[owner];
    unsigned int const use = uses[at];
    if (end - begin > kSmallGroup) {
        unsigned int const* const firstAgainst = std::lower_bound(uses + at, uses + end, use | 1);
        unsigned int const* const last = std::upper_bound(firstAgainst, uses + end, use | 1);
        edge = makeEdge(owner, use, static_cast<std::uint64_t>(last - (uses + at)), firstAgainst != uses + at,
                        last != firstAgainst);
        return static_cast<std::uint64_t>(last - uses);
    }
    for (std::uint64_t i = begin; i < at; ++i)
        if (isSameEdge(uses[i], use))
            return at + 1;
    std::uint64_t counts[2] = {0, 0};
    for (std::uint64_t i = at; i < end; ++i)
        if (isSameEdge(uses[i], use))
            ++counts[uses[i] & 1];
    edge = makeEdge(owner, use, counts[0] + counts[1], counts[0] > 0, counts[1] > 0);
    return at + 1;
}

Edge HalfEdgeDataStructure::findEdge(unsigned int a, unsigned int b) const noexcept
{
    if (a == b || a >= groupEnds_.size() || b >= groupEnds_.size())
        return {};
    auto const [owner, code] = makeUse(a, b);
    unsigned int const* const first = uses_.data() + groupBegin(owner);
    unsigned int const* const last = uses_.data() + groupEnds_[owner];
    unsigned int const* const found =
        last - first > static_cast<std::ptrdiff_t>(kSmallGroup)
            ? std::lower_bound(first, last, code & ~1u)
            : std::find_if(first, last, [code = code](unsigned int use) { return isSameEdge(use, code); });
    Edge edge;
    if (found != last && isSameEdge(*found, code))
        readEdge(owner, static_cast<std::uint64_t>(found - uses_.data()), edge);
    return edge;
}

} // namespace Veldrin::Geometry::Mesh
