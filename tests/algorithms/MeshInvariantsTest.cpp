#include "EdgeOracle.h"

#include <veldrin/algorithms/MeshInvariants.h>

#include <gtest/gtest.h>

#include <numeric>

namespace {

using namespace Veldrin::Geometry::Mesh;
using support::Polygons;
using Veldrin::Math::int3;

/// Components by lowering labels until nothing changes, and what follows from them and the edges by definition.
struct Counted {
    int euler = 0;
    int components = 0;
    int3 betti{};

    Counted(unsigned int pointCount, Polygons const& faces)
    {
        auto const edges = support::edgesOf(pointCount, faces);
        std::vector<unsigned int> labels(pointCount);
        std::iota(labels.begin(), labels.end(), 0u);
        for (bool isChanged = true; isChanged;) {
            isChanged = false;
            for (auto const& face : faces) {
                unsigned int least = pointCount;
                for (unsigned int const corner : face)
                    if (corner < pointCount)
                        least = std::min(least, labels[corner]);
                for (unsigned int const corner : face)
                    if (corner < pointCount && labels[corner] != least) {
                        labels[corner] = least;
                        isChanged = true;
                    }
            }
        }
        euler = static_cast<int>(pointCount) - static_cast<int>(edges.size()) + static_cast<int>(faces.size());
        components = static_cast<int>(std::set<unsigned int>(labels.begin(), labels.end()).size());
        // Hollows: what edges connect, without everything that a border or an absence of edges touches.
        std::vector<unsigned int> pieces(pointCount);
        std::iota(pieces.begin(), pieces.end(), 0u);
        for (bool isChanged = true; isChanged;) {
            isChanged = false;
            for (auto const& [points, uses] : edges) {
                unsigned int const least = std::min(pieces[points.first], pieces[points.second]);
                isChanged |= pieces[points.first] != least || pieces[points.second] != least;
                pieces[points.first] = pieces[points.second] = least;
            }
        }
        std::set<unsigned int> closed;
        for (auto const& [points, uses] : edges)
            closed.insert(pieces[points.first]);
        for (auto const& [points, uses] : edges)
            if (uses.faces.size() == 1)
                closed.erase(pieces[points.first]);
        int const hollows = static_cast<int>(closed.size());
        betti = {components, components + hollows - euler, hollows};
    }
};

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

TEST(MeshInvariants, KnownSurfacesHaveTheirKnownNumbers)
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
        int components;
        int3 betti;
    };
    for (auto const& [name, pointCount, faces, euler, components, betti] : std::vector<Case>{
             {"triangle", 3, {{0, 1, 2}}, 1, 1, {1, 0, 0}},
             {"two triangles apart", 6, {{0, 1, 2}, {3, 4, 5}}, 2, 2, {2, 0, 0}},
             {"cube", 8, cube, 2, 1, {1, 0, 1}},
             {"cube and a point", 9, cube, 3, 2, {2, 0, 1}},
             {"cube without a face", 8, {cube.begin(), cube.end() - 1}, 1, 1, {1, 0, 0}},
             {"two cubes", 16, twice(8, 0, cube), 4, 2, {2, 0, 2}},
             {"two cubes with a common corner", 15, twice(8, 1, cube), 3, 1, {1, -1, 1}},
             {"torus", 25, support::torusFaces(5), 0, 1, {1, 2, 1}},
             {"Moebius strip", 6, {{0, 1, 3, 2}, {2, 3, 5, 4}, {4, 5, 0, 1}}, 0, 1, {1, 1, 0}},
             {"projective plane", 6, projectivePlane, 1, 1, {1, 1, 1}},
             {"ring of quads", 8, {{0, 1, 5, 4}, {1, 2, 6, 5}, {2, 3, 7, 6}, {3, 0, 4, 7}}, 0, 1, {1, 1, 0}},
         }) {
        auto const mesh = support::meshOn(pointCount, faces);
        EXPECT_EQ(eulerCharacteristic(*mesh), euler) << name;
        EXPECT_EQ(connectedComponents(*mesh), components) << name;
        EXPECT_EQ(bettiNumbers(*mesh), betti) << name;
    }
    auto const sphere = support::filled([](auto& object) { Veldrin::Geometry::populateSphereMesh(1, object); });
    EXPECT_EQ(bettiNumbers(*sphere), (int3{1, 0, 1}));
    auto const plane = support::filled([](auto& object) { Veldrin::Geometry::populatePlaneMesh(1, 7, object); });
    EXPECT_EQ(bettiNumbers(*plane), (int3{1, 0, 0}));
}

TEST(MeshInvariants, RandomMeshesAgreeWithCountingByDefinition)
{
    for (unsigned int const faceSize : {0u, 3u, 4u})
        for (unsigned int const pointCount : {1u, 6u, 40u, 300u})
            for (unsigned int seed = 0; seed < 10; ++seed) {
                auto const faces = support::randomFaces(pointCount, pointCount / 4 + seed, faceSize, seed);
                auto const mesh = support::meshOn(pointCount, faces);
                if (faces.empty() || Veldrin::Geometry::getElementCount(*mesh, Veldrin::Geometry::sPointComp) == 0)
                    continue;
                Counted const counted(pointCount, faces);
                EXPECT_EQ(eulerCharacteristic(*mesh), counted.euler);
                EXPECT_EQ(eulerCharacteristic(*mesh, HalfEdgeDataStructure(*mesh)), counted.euler);
                EXPECT_EQ(connectedComponents(*mesh), counted.components);
                EXPECT_EQ(bettiNumbers(*mesh), counted.betti);
            }
}

TEST(MeshInvariants, AreTheSameOnEveryThreadCountAlsoWhereThreadsMeetAtOneRoot)
{
    // Around the last point, with neighbours in falling order, each face links the root that the one before it made.
    unsigned int const many = 200000;
    Polygons fallingFan;
    for (unsigned int i = many - 1; i > 0; --i)
        fallingFan.push_back({many, i, i - 1});
    // Points in random order, faces in random order: threads work everywhere at once.
    auto shuffled = support::torusFaces(300);
    std::vector<unsigned int> names(300 * 300);
    std::iota(names.begin(), names.end(), 0u);
    std::mt19937 random(5);
    std::shuffle(names.begin(), names.end(), random);
    std::shuffle(shuffled.begin(), shuffled.end(), random);
    for (auto& face : shuffled)
        for (unsigned int& corner : face)
            corner = names[corner];
    auto const fan = support::meshOn(many + 1, fallingFan);
    auto const torus = support::meshOn(300 * 300, shuffled);
    support::onThreadCounts([&] {
        for (int round = 0; round < 10; ++round) {
            EXPECT_EQ(connectedComponents(*fan), 1);
            EXPECT_EQ(connectedComponents(*torus), 1);
        }
        EXPECT_EQ(bettiNumbers(*torus), (int3{1, 2, 1}));
    });
}

TEST(MeshInvariants, WhereThereIsNoMeshEachSaysSo)
{
    auto const empty = support::filled([](auto& object) { Veldrin::Geometry::populateMesh(object); });
    EXPECT_EQ(eulerCharacteristic(*empty), 0);
    EXPECT_EQ(connectedComponents(*empty), 0);
    EXPECT_EQ(bettiNumbers(*empty), (int3{0, 0, 0}));
    auto const cloud = support::filled([](auto& object) { Veldrin::Geometry::populatePointCloud(object); });
    auto shortOffsets = support::meshOn(3, {{0, 1, 2}});
    Veldrin::Geometry::setElementCount(Veldrin::Geometry::sFaceComp, 2, *shortOffsets);
    auto withoutCorners = support::meshOn(3, {{0, 1, 2}});
    withoutCorners->eraseProperty(Veldrin::Geometry::sFaceVertex);
    for (auto const* object : {&*cloud, &*shortOffsets, &*withoutCorners}) {
        EXPECT_EQ(eulerCharacteristic(*object), 0);
        EXPECT_EQ(connectedComponents(*object), -1);
        EXPECT_EQ(bettiNumbers(*object), (int3{0, 0, 0}));
    }
}

} // namespace
