#include "EdgeOracle.h"

#include <veldrin/algorithms/HalfEdgeDataStructure.h>

#include <nexil/JobCancel.h>

#include <gtest/gtest.h>

#include <atomic>
#include <chrono>
#include <stdexcept>
#include <tuple>

namespace {

using Veldrin::Geometry::Mesh::HalfEdgeDataStructure;
using Edge = HalfEdgeDataStructure::Edge;
using support::Polygons;

std::vector<Edge> edgesOf(HalfEdgeDataStructure const& table)
{
    std::vector<Edge> edges;
    table.forEachEdge(0, table.pointCount(), [&](Edge const& edge) { edges.push_back(edge); });
    return edges;
}

auto tied(Edge const& edge)
{
    return std::tie(edge.lower, edge.upper, edge.faceCount, edge.isForward, edge.isBackward);
}

/// The table holds exactly what is counted face by face, in both ways of asking.
void expectEdges(HalfEdgeDataStructure const& table, unsigned int pointCount, Polygons const& faces)
{
    auto const expected = support::edgesOf(pointCount, faces);
    auto found = edgesOf(table);
    ASSERT_EQ(table.edgeCount(), expected.size());
    ASSERT_EQ(found.size(), expected.size());
    std::sort(found.begin(), found.end(), [](Edge const& a, Edge const& b) { return tied(a) < tied(b); });
    std::size_t next = 0;
    for (auto const& [points, uses] : expected) {
        Edge const& edge = found[next++];
        Edge const wanted{points.first, points.second, static_cast<unsigned int>(uses.faces.size()), uses.isForward,
                          uses.isBackward};
        ASSERT_EQ(tied(edge), tied(wanted)) << points.first << ' ' << points.second;
        ASSERT_EQ(tied(edge), tied(static_cast<Edge const&>(table.findEdge(points.second, points.first))));
    }
}

TEST(HalfEdgeDataStructure, HoldsWhatCountingFaceByFaceGives)
{
    for (unsigned int const faceSize : {0u, 3u, 4u})
        for (unsigned int const pointCount : {4u, 9u, 60u, 500u})
            for (unsigned int seed = 0; seed < 8; ++seed) {
                auto const faces = support::randomFaces(pointCount, 2 * pointCount, faceSize, seed);
                HalfEdgeDataStructure const table(*support::meshOn(pointCount, faces));
                expectEdges(table, pointCount, faces);
                std::set<std::pair<unsigned int, unsigned int>> there;
                for (auto const& edge : edgesOf(table))
                    there.insert({edge.lower, edge.upper});
                for (unsigned int a = 0; a < std::min(pointCount, 60u); ++a)
                    for (unsigned int b = 0; b < pointCount + 2; ++b)
                        ASSERT_EQ(table.findEdge(a, b).faceCount > 0, there.count(std::minmax(a, b)) > 0)
                            << a << ' ' << b;
            }
}

TEST(HalfEdgeDataStructure, BlocksOfFacesGiveTheSameTableOnEveryThreadCount)
{
    // Enough faces for one block a thread, repeated corners and faces without any among them, and a polygon that fills
    // most of a block.
    unsigned int const pointCount = 20000;
    auto faces = support::randomFaces(pointCount, 30000, 0, 7);
    std::vector<unsigned int> large(40000);
    for (unsigned int i = 0; i < large.size(); ++i)
        large[i] = (i * 7919u) % pointCount;
    faces.insert(faces.begin() + 9000, large);
    auto const mesh = support::meshOn(pointCount, faces);
    std::vector<Edge> first;
    support::onThreadCounts([&] {
        HalfEdgeDataStructure const table(*mesh);
        auto const edges = edgesOf(table);
        if (first.empty()) {
            expectEdges(table, pointCount, faces);
            first = edges;
        }
        EXPECT_TRUE(std::equal(edges.begin(), edges.end(), first.begin(), first.end(),
                               [](Edge const& a, Edge const& b) { return tied(a) == tied(b); }));
    });
}

TEST(HalfEdgeDataStructure, HubsAndGiantFacesTakeNoMoreThanAGrid)
{
    // Any of these takes hours where work grows with the square of a hub.
    unsigned int const many = 100000;
    Polygons fan;
    Polygons fanAtTheTop;
    Polygons book;
    for (unsigned int i = 0; i < many; ++i) {
        fan.push_back({0, 1 + i, 1 + (i + 1) % many});
        fanAtTheTop.push_back({many, i, (i + 1) % many});
        book.push_back({0, 1, 2 + i});
    }
    EXPECT_EQ(HalfEdgeDataStructure(*support::meshOn(many + 1, fan)).edgeCount(), 2 * many);
    EXPECT_EQ(HalfEdgeDataStructure(*support::meshOn(many + 1, fanAtTheTop)).edgeCount(), 2 * many);
    HalfEdgeDataStructure const bookEdges(*support::meshOn(many + 2, book));
    EXPECT_EQ(bookEdges.edgeCount(), 2 * many + 1);
    EXPECT_EQ(bookEdges.findEdge(0, 1).faceCount, many);
    std::uint64_t faceUses = 0;
    bookEdges.forEachEdge(0, bookEdges.pointCount(), [&](Edge const& edge) { faceUses += edge.faceCount; });
    EXPECT_EQ(faceUses, 3u * many);

    std::vector<unsigned int> ring(1000000);
    for (unsigned int i = 0; i < ring.size(); ++i)
        ring[i] = i;
    EXPECT_EQ(HalfEdgeDataStructure(*support::meshOn(1000000, {ring})).edgeCount(), 1000000u);
    auto thereAndBack = ring;
    thereAndBack.insert(thereAndBack.end(), ring.rbegin() + 1, ring.rend() - 1);
    HalfEdgeDataStructure const line(*support::meshOn(1000000, {thereAndBack}));
    EXPECT_EQ(line.edgeCount(), 999999u);
    EXPECT_EQ(tied(line.findEdge(5, 6)), std::make_tuple(5u, 6u, 1u, true, true));
}

TEST(HalfEdgeDataStructure, TopologyThatIsMissingShortOrFallsIsNeverReadBeyondItsEnd)
{
    auto const withFaces = [](std::vector<unsigned int> const& offsets, unsigned int faceCount) {
        auto mesh = Veldrin::createObject();
        Veldrin::Geometry::populateMesh(support::array(std::vector<Veldrin::Math::float3>(4)),
                                        support::array<unsigned int>({0, 1, 2, 0, 2, 3}), support::array(offsets),
                                        *mesh);
        Veldrin::Geometry::setElementCount(Veldrin::Geometry::sFaceComp, faceCount, *mesh);
        return HalfEdgeDataStructure(*mesh).edgeCount();
    };
    EXPECT_EQ(withFaces({0, 3, 6}, 2), 5u);
    EXPECT_EQ(withFaces({0, 3, 4000000000u}, 2), 5u);
    EXPECT_EQ(withFaces({0, 6, 3, 6, 3, 6}, 5), 5u) << "overlapping faces";
    EXPECT_EQ(withFaces({3, 0, 0}, 2), 0u);
    EXPECT_EQ(withFaces({0, 3}, 2), 0u) << "fewer offsets than faces";
    EXPECT_EQ(HalfEdgeDataStructure(*Veldrin::createObject()).edgeCount(), 0u);
    EXPECT_EQ(HalfEdgeDataStructure(*Veldrin::createObject()).findEdge(0, 1).faceCount, 0u);
}

TEST(HalfEdgeDataStructure, ACancelledJobEndsWithinAChunk)
{
    auto const mesh = support::meshOn(1000 * 1000, support::torusFaces(1000));
    static std::atomic<int> questions;
    questions = 0;
    Nexil::setJobCancelHook([] { return ++questions > 3; });
    EXPECT_THROW(HalfEdgeDataStructure{*mesh}, std::runtime_error);
    Nexil::setJobCancelHook(nullptr);
    // Every thread may be in a chunk of its own when the answer comes.
    EXPECT_LT(questions, 100);
}

} // namespace
