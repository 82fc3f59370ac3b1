#include "EdgeOracle.h"

#include <veldrin/algorithms/FaceVertexAdjacency.h>
#include <veldrin/algorithms/MeshDiagnostic.h>
#include <veldrin/algorithms/MeshInvariants.h>
#include <veldrin/algorithms/MeshNormals.h>
#include <veldrin/algorithms/NormalsTopology.h>
#include <veldrin/geometry/FaceEdge.h>

#include <gtest/gtest.h>

#include <numeric>

// What must stay, and what must follow, when points are numbered otherwise or all faces are turned over.

namespace {

using namespace Veldrin::GeometryAlgorithms;
using namespace Veldrin::Geometry::Mesh;
using support::Polygons;
using Veldrin::Math::float3;

constexpr unsigned int kPointCount = 60;

/// All that is computed of a mesh.
struct Answers {
    Nexil::Array<float3> faceNormals, pointNormals[4];
    Nexil::Array<FaceEdge> edges, pointFaces;
    Nexil::Array<unsigned int> pointFaceIndex, groups;
    unsigned int groupCount = 0;
    int euler = 0;
    Veldrin::Math::int3 betti;
    Diagnostic found;

    Answers(std::vector<float3> const& points, Polygons const& faces)
    {
        auto const mesh = support::mesh(points, faces);
        computeMeshFaceNormals(*mesh, faceNormals);
        for (int variant = 0; variant < 4; ++variant)
            computeMeshVertexNormals(*mesh, variant >= 2, variant % 2 == 1, pointNormals[variant]);
        EXPECT_TRUE(buildFaceVertexAdjacency(*mesh, edges, pointFaces, pointFaceIndex, nullptr));
        computeMeshNormalsTopology(*mesh, {}, 1.0f, groups, groupCount, nullptr);
        euler = eulerCharacteristic(*mesh);
        betti = bettiNumbers(*mesh);
        found = diagnose(*mesh);
    }

    [[nodiscard]] std::vector<FaceEdge> facesOf(unsigned int point) const
    {
        return {pointFaces.begin() + pointFaceIndex[point], pointFaces.begin() + pointFaceIndex[point + 1]};
    }
};

/// Random points, and faces over most of them.
struct Sample {
    std::vector<float3> points = std::vector<float3>(kPointCount);
    Polygons faces;

    Sample(std::mt19937& random, unsigned int faceSize)
        : faces(support::randomFaces(kPointCount - 5, 100, faceSize, static_cast<unsigned int>(random())))
    {
        auto const coordinate = [&] { return static_cast<float>(random() % 2001) / 100 - 10; };
        for (float3& p : points)
            p = {coordinate(), coordinate(), coordinate()};
        for (auto& face : faces)
            for (unsigned int& corner : face)
                corner = std::min(corner, kPointCount - 1);
    }
};

TEST(Symmetry, NumberingPointsOtherwiseOnlyNumbersResultsOtherwise)
{
    std::mt19937 random(1);
    for (unsigned int const faceSize : {0u, 3u, 4u, 0u, 3u, 4u}) {
        Sample const sample(random, faceSize);
        std::vector<unsigned int> number(kPointCount);
        std::iota(number.begin(), number.end(), 0u);
        std::shuffle(number.begin(), number.end(), random);
        auto renumbered = sample;
        for (unsigned int p = 0; p < kPointCount; ++p)
            renumbered.points[number[p]] = sample.points[p];
        for (auto& face : renumbered.faces)
            for (unsigned int& corner : face)
                corner = number[corner];

        Answers const before(sample.points, sample.faces);
        Answers after(renumbered.points, renumbered.faces);
        EXPECT_EQ(after.faceNormals, before.faceNormals);
        EXPECT_EQ(after.edges, before.edges);
        EXPECT_EQ(after.groups, before.groups);
        EXPECT_EQ(after.groupCount, before.groupCount);
        EXPECT_TRUE(after.euler == before.euler && after.betti == before.betti);
        EXPECT_EQ(after.found.isolatedPoints.size(), before.found.isolatedPoints.size());
        after.found.isolatedPoints = before.found.isolatedPoints;
        EXPECT_TRUE(after.found == before.found);
        for (unsigned int p = 0; p < kPointCount; ++p) {
            EXPECT_EQ(after.facesOf(number[p]), before.facesOf(p));
            for (int variant = 0; variant < 4; ++variant)
                EXPECT_EQ(after.pointNormals[variant][number[p]], before.pointNormals[variant][p]) << variant;
        }
    }
}

TEST(Symmetry, TurningAllFacesOverTurnsNormalsAndDirectionsOnly)
{
    std::mt19937 random(2);
    for (int round = 0; round < 6; ++round) {
        Sample sample(random, 3);
        std::erase_if(sample.faces, [](auto const& f) { return f[0] == f[1] || f[1] == f[2] || f[2] == f[0]; });
        auto turned = sample.faces;
        for (auto& face : turned)
            std::swap(face[1], face[2]);

        Answers const before(sample.points, sample.faces);
        Answers const after(sample.points, turned);
        auto const expectTurned = [](float3 const& now, float3 const& then) {
            EXPECT_EQ(now, (then == float3{0, 1, 0} ? then : then * -1.0f));
        };
        for (std::size_t f = 0; f < turned.size(); ++f) {
            expectTurned(after.faceNormals[f], before.faceNormals[f]);
            // The side from corner k to the next is the one that ends at corner k now.
            for (std::size_t k = 0; k < 3; ++k)
                EXPECT_EQ(after.edges[3 * f + 2 - k].face, before.edges[3 * f + k].face);
        }
        for (unsigned int p = 0; p < kPointCount; ++p)
            expectTurned(after.pointNormals[0][p], before.pointNormals[0][p]);
        EXPECT_TRUE(after.euler == before.euler && after.betti == before.betti && after.found == before.found);
    }
}

} // namespace
