#include <veldrin/algorithms/HalfEdgeDataStructure.h>

#include <nexil/parallel/Scan.h>
#include <veldrin/algorithms/internal/FaceCorners.h>
#include <veldrin/algorithms/internal/MeshFaces.h>
#include <veldrin/geometry/Prototypes.h>

#include <algorithm>
#include <vector>

// The table is a counting sort of all edge uses by owner: count per point, running sum, put in place. It is made in as many
// blocks of faces as there are threads, each with counts of its own: a block writes behind the blocks before it, so uses of
// one point stand in face order whatever the number of blocks, and nothing is shared that would have to be locked.
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
        constexpr std::uint64_t kFaces = 65536;
        constexpr std::size_t kPoints = 16384;
    } // namespace grain

    /// Below this many face-vertices blocks cost more than they win.
    constexpr std::uint64_t kParallelFaceVertices = 32768;
    constexpr std::uint64_t kMaxBlocks = 16;
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
        unsigned int const lower = std::min(from, to);
        unsigned int const upper = std::max(from, to);
        unsigned int const distance = upper - lower;
        if (distance > kHalfCircle) [[unlikely]]
            return {upper, ~distance << 1 | (from == lower)};
        return {lower, distance << 1 | (from == upper)};
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

    /// What one block of faces needs while the table is built.
    struct Block {
        std::uint64_t firstFace = 0;
        std::uint64_t endFace = 0;
        /// Per point: first the uses it owns in this block, then where the next of them goes.
        Nexil::Array<unsigned int> cursors;
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

        /// Calls visit(Use) for each, and remembers what is odd about the block's faces.
        template <class Visit>
        void first(Block& block, Visit const& visit) const
        {
            chunks(block, [&](std::uint64_t begin, std::uint64_t end) {
                for (std::uint64_t face = begin; face < end; ++face) {
                    IndexRange const range = ranges_[face];
                    if (isRegularFace(points_, range, pointCount_, block.scratch)) [[likely]] {
                        visitRegular(range, visit);
                    } else {
                        block.irregularFaces.push_back(static_cast<unsigned int>(face));
                        visitIrregular(range, block.scratch, visit,
                                       [&](std::uint64_t key) { block.folds.push_back(key); });
                    }
                }
            });
        }

        template <class Visit>
        void again(Block& block, Visit const& visit) const
        {
            std::size_t nextIrregular = 0;
            chunks(block, [&](std::uint64_t begin, std::uint64_t end) {
                while (begin < end) {
                    bool const hasIrregular =
                        nextIrregular < block.irregularFaces.size() && block.irregularFaces[nextIrregular] < end;
                    std::uint64_t const stop = hasIrregular ? block.irregularFaces[nextIrregular] : end;
                    for (std::uint64_t face = begin; face < stop; ++face)
                        visitRegular(ranges_[face], visit);
                    begin = stop;
                    if (hasIrregular) {
                        visitIrregular(ranges_[begin++], block.scratch, visit, [](std::uint64_t) {});
                        ++nextIrregular;
                    }
                }
            });
        }

    private:
        template <class Visit>
        void chunks(Block const& block, Visit const& visit) const
        {
            for (std::uint64_t begin = block.firstFace; begin < block.endFace; begin += grain::kFaces) {
                Nexil::Internal::throwIfJobCancelled();
                visit(begin, std::min(block.endFace, begin + grain::kFaces));
            }
        }

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

    template <class Ranges>
    std::uint64_t firstFaceFrom(std::uint64_t corner, std::uint64_t faceCount, Ranges const& ranges)
    {
        std::uint64_t low = 0;
        for (std::uint64_t high = faceCount; low < high;) {
            std::uint64_t const middle = low + (high - low) / 2;
            if (ranges[middle].begin < corner)
                low = middle + 1;
            else
                high = middle;
        }
        return low;
    }

    /// Blocks of whole faces with about as many corners each; no more than their counts may take of memory.
    template <class Ranges>
    std::vector<Block> makeBlocks(MeshFaces const& faces, Ranges const& ranges)
    {
        std::uint64_t const corners = faces.cornerCount();
        std::uint64_t blockCount = 1;
        if (corners >= kParallelFaceVertices) {
            std::uint64_t const affordable = 5 * corners / std::max<std::uint64_t>(1, faces.pointCount());
            blockCount =
                std::clamp<std::uint64_t>(std::min<std::uint64_t>(affordable, parallel::threadCount()), 1, kMaxBlocks);
        }
        std::vector<Block> blocks(blockCount);
        for (std::uint64_t b = 1; b < blockCount; ++b)
            blocks[b].firstFace = blocks[b - 1].endFace =
                firstFaceFrom(corners * b / blockCount, faces.faceCount(), ranges);
        blocks.back().endFace = faces.faceCount();
        return blocks;
    }

    template <class Visit>
    void forEachBlock(std::vector<Block>& blocks, Visit const& visit)
    {
        parallel::forRange(blocks.size(), 1, [&](std::size_t begin, std::size_t end) {
            for (std::size_t b = begin; b < end; ++b)
                visit(blocks[b]);
        });
    }

    /// Turns counts per block and point into the places where each block's uses of each point begin.
    void countsToCursors(std::vector<Block>& blocks, std::uint64_t pointCount, Nexil::Array<unsigned int>& uses)
    {
        std::vector<unsigned int*> cursors;
        for (Block& block : blocks)
            cursors.push_back(block.cursors.data());
        parallel::scanInOrder(
            pointCount, grain::kPoints, std::uint64_t(0),
            [&](std::size_t begin, std::size_t end) {
                std::uint64_t sum = 0;
                for (unsigned int const* const counts : cursors)
                    for (std::size_t p = begin; p < end; ++p)
                        sum += counts[p];
                return sum;
            },
            [&](std::uint64_t total) { Nexil::Internal::resizeUninitialized(uses, total); },
            [&](std::size_t begin, std::size_t end, std::uint64_t before) {
                auto at = static_cast<unsigned int>(before);
                for (std::size_t p = begin; p < end; ++p)
                    for (unsigned int* const counts : cursors)
                        at += std::exchange(counts[p], at);
            });
    }

    /// Groups all uses by owner. groupEnds: per point, one past its group.
    template <class Ranges>
    void groupUses(MeshFaces const& faces, Ranges const& ranges, Nexil::Array<unsigned int>& uses,
                   Nexil::Array<unsigned int>& groupEnds, Nexil::Array<std::uint64_t>& folds)
    {
        UseWalk<Ranges> const walk(faces, ranges);
        auto blocks = makeBlocks(faces, ranges);
        forEachBlock(blocks, [&](Block& block) {
            block.cursors.resize(faces.pointCount());
            walk.first(block, [counts = block.cursors.data()](Use use) { ++counts[use.owner]; });
        });
        countsToCursors(blocks, faces.pointCount(), uses);
        forEachBlock(blocks, [&](Block& block) {
            walk.again(block, [cursors = block.cursors.data(), target = uses.data()](Use use) {
                target[cursors[use.owner]++] = use.code;
            });
        });
        // Behind its last use the last block's cursor stands at the end of the group.
        groupEnds = std::move(blocks.back().cursors);
        std::uint64_t foldCount = 0;
        for (Block const& block : blocks)
            foldCount += block.folds.size();
        folds.reserve(foldCount);
        for (Block const& block : blocks)
            for (std::uint64_t const key : block.folds)
                folds.push_back(key);
        sortMany(folds.begin(), folds.end());
    }

    /// Distinct edges of a group; sorts a large one.
    std::uint64_t finishGroup(unsigned int* first, unsigned int* last)
    {
        auto const size = static_cast<std::uint64_t>(last - first);
        std::uint64_t repeated = 0;
        if (size <= kSmallGroup) {
            for (std::uint64_t i = 1; i < size; ++i) {
                unsigned int isRepeated = 0;
                for (std::uint64_t j = 0; j < i; ++j)
                    isRepeated |= isSameEdge(first[i], first[j]);
                repeated += isRepeated;
            }
            return size - repeated;
        }
        sortMany(first, last);
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
