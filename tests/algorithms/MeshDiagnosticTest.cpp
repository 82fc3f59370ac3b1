#include "EdgeOracle.h"

#include <veldrin/algorithms/MeshDiagnostic.h>

#include <gtest/gtest.h>

#include <cmath>
#include <limits>

namespace {

using Veldrin::Geometry::Mesh::diagnose;
using Veldrin::Geometry::Mesh::Diagnostic;
using Indices = std::vector<unsigned int>;
using support::Polygons;
using Veldrin::Math::float3;

Indices list(Nexil::Array<unsigned int> const& array)
{
    return {array.begin(), array.end()};
}

struct Expected {
    Indices isolatedPoints, degenerateFaces, zeroAreaFaces, nonManifoldFaces, inconsistentFaces;
};

void expectFound(Diagnostic const& found, Expected const& expected, char const* name)
{
    EXPECT_EQ(list(found.isolatedPoints), expected.isolatedPoints) << name;
    EXPECT_EQ(list(found.degenerateFaces), expected.degenerateFaces) << name;
    EXPECT_EQ(list(found.zeroAreaFaces), expected.zeroAreaFaces) << name;
    EXPECT_EQ(list(found.nonManifoldFaces), expected.nonManifoldFaces) << name;
    EXPECT_EQ(list(found.inconsistentFaces), expected.inconsistentFaces) << name;
}

TEST(MeshDiagnostic, EachFaultIsFoundWhereItIs)
{
    struct Case {
        char const* name;
        unsigned int pointCount;
        Polygons faces;
        Expected expected;
    };
    for (auto const& [name, pointCount, faces, expected] : std::vector<Case>{
             {"clean", 4, {{0, 1, 2}, {0, 2, 3}}, {}},
             {"points apart", 6, {{1, 2, 4}}, {{0, 3, 5}, {}, {}, {}, {}}},
             {"two corners", 3, {{0, 1, 2}, {0, 1}}, {{}, {1}, {}, {}, {}}},
             {"a corner twice", 4, {{0, 1, 2}, {0, 2, 0, 3}}, {{}, {1}, {}, {}, {}}},
             {"a point only as a repeated corner", 4, {{0, 1, 2}, {3, 3, 3}}, {{3}, {1}, {}, {}, {}}},
             {"out of range", 3, {{0, 1, 2}, {0, 2, 9}}, {{}, {1}, {}, {}, {}}},
             {"a third face", 5, {{0, 1, 2}, {1, 0, 3}, {0, 1, 4}}, {{}, {}, {}, {0, 1, 2}, {}}},
             {"turned over", 5, {{0, 1, 2}, {0, 1, 3}, {1, 2, 4}}, {{}, {}, {}, {}, {0, 1, 2}}},
             {"neighbours that agree", 4, {{0, 1, 2}, {1, 0, 3}}, {}},
         })
        expectFound(diagnose(*support::meshOn(pointCount, faces)), expected, name);
}

TEST(MeshDiagnostic, AreasAreJudgedByTheirVectors)
{
    float const nan = std::numeric_limits<float>::quiet_NaN();
    // Along a line; a bow tie whose halves cancel; sides so short that nothing is left; one side short; no number; clean.
    auto const mesh = support::mesh(
        {{0, 0, 0}, {1, 0, 0}, {2, 0, 0}, {0, 1, 0}, {1, 1, 0}, {1e-20f, 0, 0}, {0, 1e-20f, 0}, {nan, 0, 0}},
        {{0, 1, 2}, {0, 1, 3, 4}, {0, 5, 6}, {0, 5, 3}, {0, 1, 7}, {2, 3, 4}});
    EXPECT_EQ(list(diagnose(*mesh).zeroAreaFaces), (Indices{0, 1, 2, 4}));
    EXPECT_TRUE(list(diagnose(*mesh).degenerateFaces).empty());
}

TEST(MeshDiagnostic, RandomMeshesAgreeWithCountingByDefinitionOnEveryThreadCount)
{
    for (unsigned int const faceSize : {0u, 3u, 4u})
        for (unsigned int const pointCount : {5u, 50u, 5000u}) {
            auto const faces = support::randomFaces(pointCount, 3 * pointCount, faceSize, pointCount + faceSize);
            auto const edges = support::edgesOf(pointCount, faces);
            Expected expected;
            std::set<unsigned int> onEdges;
            std::set<std::size_t> nonManifold;
            std::set<std::size_t> inconsistent;
            for (auto const& [points, uses] : edges) {
                onEdges.insert({points.first, points.second});
                if (uses.faces.size() > 2)
                    nonManifold.insert(uses.faces.begin(), uses.faces.end());
                if (uses.faces.size() == 2 && uses.isForward != uses.isBackward)
                    inconsistent.insert(uses.faces.begin(), uses.faces.end());
            }
            for (unsigned int p = 0; p < pointCount; ++p)
                if (!onEdges.count(p))
                    expected.isolatedPoints.push_back(p);
            for (unsigned int f = 0; f < faces.size(); ++f) {
                std::set<unsigned int> const corners(faces[f].begin(), faces[f].end());
                if (corners.size() < 3 || corners.size() < faces[f].size() || *corners.rbegin() >= pointCount)
                    expected.degenerateFaces.push_back(f);
                if (nonManifold.count(f))
                    expected.nonManifoldFaces.push_back(f);
                if (inconsistent.count(f))
                    expected.inconsistentFaces.push_back(f);
            }
            auto const mesh = support::meshOn(pointCount, faces);
            auto const first = diagnose(*mesh);
            expected.zeroAreaFaces = list(first.zeroAreaFaces);
            expectFound(first, expected, "random");
            support::onThreadCounts([&] { EXPECT_TRUE(diagnose(*mesh) == first); });
        }
}

TEST(MeshDiagnostic, ABookOfManyFacesIsLookedThroughInNoTime)
{
    // Takes hours where each face counts the others on its edge.
    Polygons book;
    Indices all;
    for (unsigned int i = 0; i < 100000; ++i) {
        book.push_back({0, 1, 2 + i});
        all.push_back(i);
    }
    EXPECT_EQ(list(diagnose(*support::meshOn(100002, book)).nonManifoldFaces), all);
}

TEST(MeshDiagnostic, WhatIsNoWholeMeshGivesAnEmptyRecord)
{
    auto const faulty = [] { return support::meshOn(4, {{0, 1}, {0, 1, 9}}); };
    EXPECT_FALSE(diagnose(*faulty()) == Diagnostic{});
    for (char const* const name :
         {Veldrin::Geometry::sPointPosition, Veldrin::Geometry::sFaceVertex, Veldrin::Geometry::sFaceOffset}) {
        auto mesh = faulty();
        mesh->eraseProperty(name);
        EXPECT_TRUE(diagnose(*mesh) == Diagnostic{}) << name;
    }
    auto morePoints = faulty();
    Veldrin::Geometry::setElementCount(Veldrin::Geometry::sPointComp, 5, *morePoints);
    EXPECT_TRUE(diagnose(*morePoints) == Diagnostic{});
    EXPECT_TRUE(diagnose(*Veldrin::createObject()) == Diagnostic{});
}

} // namespace
