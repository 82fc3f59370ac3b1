#include "EdgeOracle.h"

#include <support/Labels.h>

#include <veldrin/algorithms/FaceVertexAdjacency.h>
#include <veldrin/algorithms/HalfEdgeDataStructure.h>
#include <veldrin/algorithms/MeshDiagnostic.h>
#include <veldrin/algorithms/MeshInvariants.h>

#include <gtest/gtest.h>

#include <limits>
#include <tuple>

namespace {

using namespace Veldrin::Geometry::Mesh;
using Edge = HalfEdgeDataStructure::Edge;
using support::Polygons;
using Veldrin::Math::int3;

auto tied(Edge const& edge)
{
    return std::tie(edge.lower, edge.upper, edge.faceCount, edge.isForward, edge.isBackward);
}

/// What there is to know of a mesh's topology, by definition and edge by edge.
struct Counted {
    std::vector<Edge> edges;
    Diagnostic found; ///< but for areas
    int euler = 0;
    int3 betti{};
    std::vector<FaceEdge> across, pointFaces;
    std::vector<unsigned int> pointFaceIndex;
    bool isWhole = true;

    Counted(unsigned int pointCount, Polygons const& faces)
    {
        auto const map = support::edgesOf(pointCount, faces);
        support::Pairs joined, touching;
        std::set<unsigned int> onEdges, nonManifold, inconsistent, borders;
        for (auto const& [points, uses] : map) {
            auto const users = uses.faces();
            auto const count = static_cast<unsigned int>(users.size());
            edges.push_back({points.first, points.second, count, !uses.forward.empty(), !uses.backward.empty()});
            touching.push_back(points);
            onEdges.insert({points.first, points.second});
            if (count == 1)
                borders.insert(points.first);
            if (count > 2)
                nonManifold.insert(users.begin(), users.end());
            if (count == 2 && uses.forward.empty() != uses.backward.empty())
                inconsistent.insert(users.begin(), users.end());
        }
        std::vector<std::vector<FaceEdge>> around(pointCount);
        for (unsigned int f = 0; f < faces.size(); ++f) {
            std::set<unsigned int> const corners(faces[f].begin(), faces[f].end());
            if (corners.size() < 3 || corners.size() < faces[f].size() || *corners.rbegin() >= pointCount)
                found.degenerateFaces.push_back(f);
            if (nonManifold.count(f))
                found.nonManifoldFaces.push_back(f);
            if (inconsistent.count(f))
                found.inconsistentFaces.push_back(f);
            isWhole = isWhole && (corners.empty() || *corners.rbegin() < pointCount);
            for (unsigned int k = 0; k < faces[f].size(); ++k) {
                unsigned int const a = faces[f][k];
                unsigned int const b = faces[f][(k + 1) % faces[f].size()];
                if (a < pointCount) {
                    joined.emplace_back(*corners.begin(), a);
                    around[a].push_back({f, k});
                }
                across.emplace_back();
                if (auto const edge = map.find(std::minmax(a, b)); edge != map.end())
                    for (auto const& use : a < b ? edge->second.backward : edge->second.forward)
                        if (across.back().face == Veldrin::Geometry::kInvalidIndex && use.face != f)
                            across.back() = use;
            }
        }
        for (unsigned int p = 0; p < pointCount; ++p) {
            if (!onEdges.count(p))
                found.isolatedPoints.push_back(p);
            pointFaceIndex.push_back(static_cast<unsigned int>(pointFaces.size()));
            pointFaces.insert(pointFaces.end(), around[p].begin(), around[p].end());
        }
        pointFaceIndex.push_back(static_cast<unsigned int>(pointFaces.size()));

        auto const labels = support::leastLabels(pointCount, joined);
        int const components = static_cast<int>(std::set<unsigned int>(labels.begin(), labels.end()).size());
        // Hollows: what edges connect, without everything that a border touches.
        auto const pieces = support::leastLabels(pointCount, touching);
        std::set<unsigned int> closed;
        for (unsigned int const p : onEdges)
            closed.insert(pieces[p]);
        for (unsigned int const p : borders)
            closed.erase(pieces[p]);
        int const hollows = static_cast<int>(closed.size());
        euler = static_cast<int>(pointCount) - static_cast<int>(edges.size()) + static_cast<int>(faces.size());
        betti = {components, components + hollows - euler, hollows};
    }
};

/// The table holds these edges, in both ways of asking, and no others.
void expectEdges(HalfEdgeDataStructure const& table, unsigned int pointCount, std::vector<Edge> const& expected)
{
    ASSERT_EQ(table.edgeCount(), expected.size());
    std::vector<Edge> found;
    table.forEachEdge(0, table.pointCount(), [&](Edge const& edge) { found.push_back(edge); });
    auto const isLess = [](Edge const& a, Edge const& b) { return tied(a) < tied(b); };
    auto const isSame = [](Edge const& a, Edge const& b) { return tied(a) == tied(b); };
    std::ranges::sort(found, isLess);
    EXPECT_TRUE(std::ranges::equal(found, expected, isSame));
    for (Edge const& edge : expected)
        ASSERT_TRUE(isSame(table.findEdge(edge.upper, edge.lower), edge));
    std::size_t ofFirst = 0;
    for (unsigned int b = 0; b < pointCount + 2; ++b)
        ofFirst += table.findEdge(0, b).faceCount > 0 ? 1 : 0;
    EXPECT_EQ(ofFirst, std::ranges::count(expected, 0u, &Edge::lower));
}

void expectCounted(unsigned int pointCount, Polygons const& faces)
{
    auto const mesh = support::meshOn(pointCount, faces);
    if (Veldrin::Geometry::getElementCount(*mesh, Veldrin::Geometry::sPointComp) == 0)
        return; // no corners, no mesh
    Counted counted(pointCount, faces);
    counted.found.zeroAreaFaces = diagnose(*mesh).zeroAreaFaces;
    support::onThreadCounts([&] {
        HalfEdgeDataStructure const table(*mesh);
        ASSERT_NO_FATAL_FAILURE(expectEdges(table, pointCount, counted.edges));
        EXPECT_TRUE(diagnose(*mesh) == counted.found);
        EXPECT_EQ(eulerCharacteristic(*mesh), counted.euler);
        EXPECT_EQ(eulerCharacteristic(*mesh, table), counted.euler);
        EXPECT_EQ(connectedComponents(*mesh), counted.betti.x);
        EXPECT_EQ(bettiNumbers(*mesh), counted.betti);
        Nexil::Array<FaceEdge> across, pointFaces;
        Nexil::Array<unsigned int> index;
        ASSERT_EQ(Veldrin::GeometryAlgorithms::buildFaceVertexAdjacency(*mesh, across, pointFaces, index, nullptr),
                  counted.isWhole);
        if (counted.isWhole) {
            EXPECT_TRUE(std::ranges::equal(across, counted.across));
            EXPECT_TRUE(std::ranges::equal(pointFaces, counted.pointFaces));
            EXPECT_TRUE(std::ranges::equal(index, counted.pointFaceIndex));
        }
    });
}

TEST(MeshTopology, IsWhatCountingByDefinitionGivesOnEveryThreadCount)
{
    for (unsigned int const faceSize : {0u, 3u, 4u})
        for (unsigned int const pointCount : {1u, 4u, 9u, 60u, 500u})
            for (unsigned int seed = 0; seed < 6; ++seed) {
                SCOPED_TRACE(testing::Message() << faceSize << ' ' << pointCount << ' ' << seed);
                auto faces = support::randomFaces(pointCount, 1 + pointCount * (1 + seed) / 3, faceSize, seed);
                for (auto& face : faces)
                    for (unsigned int& corner : face)
                        corner = seed % 2 ? corner % pointCount : corner;
                expectCounted(pointCount, faces);
            }
    // Enough faces for one block a thread, and a polygon that fills most of a block.
    unsigned int const pointCount = 20000;
    auto faces = support::randomFaces(pointCount - 2, 30000, 0, 7);
    std::vector<unsigned int> large(40000);
    for (unsigned int i = 0; i < large.size(); ++i)
        large[i] = (i * 7919u) % pointCount;
    faces.insert(faces.begin() + 9000, large);
    expectCounted(pointCount, faces);
}

/// Two copies side by side, the second with its first `shared` points taken from the first.
Polygons twice(unsigned int pointCount, unsigned int shared, Polygons faces)
{
    std::size_t const count = faces.size();
    for (std::size_t f = 0; f < count; ++f) {
        auto face = faces[f];
        for (unsigned int& corner : face)
            if (corner >= shared)
                corner += pointCount - shared;
        faces.push_back(face);
    }
    return faces;
}

TEST(MeshTopology, KnownSurfacesHaveTheirKnownNumbers)
{
    Polygons const cube{{0, 1, 3, 2}, {4, 6, 7, 5}, {0, 4, 5, 1}, {2, 3, 7, 6}, {0, 2, 6, 4}, {1, 5, 7, 3}};
    // Ten triangles on six points, every two of which share an edge: half an icosahedron.
    Polygons const projectivePlane{{0, 1, 2}, {0, 2, 3}, {0, 3, 4}, {0, 4, 5}, {0, 5, 1},
                                   {1, 2, 4}, {2, 3, 5}, {3, 4, 1}, {4, 5, 2}, {5, 1, 3}};
    struct Case {
        char const* name;
        unsigned int pointCount;
        Polygons faces;
        int euler;
        int3 betti;
    };
    for (auto const& [name, pointCount, faces, euler, betti] : std::vector<Case>{
             {"two triangles apart", 6, {{0, 1, 2}, {3, 4, 5}}, 2, {2, 0, 0}},
             {"cube", 8, cube, 2, {1, 0, 1}},
             {"cube and a point", 9, cube, 3, {2, 0, 1}},
             {"cube without a face", 8, {cube.begin(), cube.end() - 1}, 1, {1, 0, 0}},
             {"two cubes", 16, twice(8, 0, cube), 4, {2, 0, 2}},
             {"two cubes with a common corner", 15, twice(8, 1, cube), 3, {1, -1, 1}},
             {"torus", 25, support::torusFaces(5), 0, {1, 2, 1}},
             {"Moebius strip", 6, {{0, 1, 3, 2}, {2, 3, 5, 4}, {4, 5, 0, 1}}, 0, {1, 1, 0}},
             {"projective plane", 6, projectivePlane, 1, {1, 1, 1}},
         }) {
        auto const mesh = support::meshOn(pointCount, faces);
        EXPECT_EQ(eulerCharacteristic(*mesh), euler) << name;
        EXPECT_EQ(bettiNumbers(*mesh), betti) << name;
    }
    auto const plane = support::filled([](auto& object) { Veldrin::Geometry::populatePlaneMesh(1, 7, object); });
    EXPECT_EQ(bettiNumbers(*plane), (int3{1, 0, 0}));
}

TEST(MeshTopology, ComponentsAreTheSameWhereThreadsMeetAtOneRoot)
{
    // With points in falling order each face links the root that the one before it made: along a strip, whose points are
    // near each other, and around one point, from which all others are far.
    unsigned int const many = 200000;
    Polygons strip, fan;
    for (unsigned int i = many; i > 1; --i) {
        strip.push_back({i, i - 1, i % 1000 == 0 ? many + 9 : i - 2});
        fan.push_back({many, i - 1, i - 2});
    }
    // Points and faces in an order that makes threads work everywhere at once, and too many for one of them to do it alone.
    auto shuffled = support::torusFaces(600, 7919);
    std::shuffle(shuffled.begin(), shuffled.end(), std::mt19937(5));
    auto const fallingStrip = support::meshOn(many + 1, strip);
    auto const fallingFan = support::meshOn(many + 1, fan);
    auto const torus = support::meshOn(600 * 600, shuffled);
    support::onThreadCounts([&] {
        for (int round = 0; round < 5; ++round) {
            EXPECT_EQ(connectedComponents(*fallingStrip), 1);
            EXPECT_EQ(connectedComponents(*fallingFan), 1);
            EXPECT_EQ(connectedComponents(*torus), 1);
        }
    });
}

TEST(MeshTopology, AreasAreJudgedByTheirVectors)
{
    float const nan = std::numeric_limits<float>::quiet_NaN();
    // Along a line; a bow tie whose halves cancel; sides so short that nothing is left; one side short; no number; clean; degenerate.
    auto const mesh = support::mesh(
        {{0, 0, 0}, {1, 0, 0}, {2, 0, 0}, {0, 1, 0}, {1, 1, 0}, {1e-20f, 0, 0}, {0, 1e-20f, 0}, {nan, 0, 0}},
        {{0, 1, 2}, {0, 1, 3, 4}, {0, 5, 6}, {0, 5, 3}, {0, 1, 7}, {2, 3, 4}, {0, 0, 1}});
    EXPECT_EQ(diagnose(*mesh).zeroAreaFaces, (Nexil::Array<unsigned int>{0, 1, 2, 4}));
    EXPECT_EQ(diagnose(*mesh).degenerateFaces, (Nexil::Array<unsigned int>{6}));
}

} // namespace
