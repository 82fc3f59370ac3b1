#include "EdgeOracle.h"

#include <veldrin/algorithms/ComponentConversion.h>
#include <veldrin/algorithms/FaceVertexAdjacency.h>
#include <veldrin/algorithms/HalfEdgeDataStructure.h>
#include <veldrin/algorithms/MeshDiagnostic.h>
#include <veldrin/algorithms/MeshNormals.h>
#include <veldrin/algorithms/StrandMeasures.h>

#include <gtest/gtest.h>

#include <numeric>

// Geometry on which work that grows with the square of a hub, a range or a polygon would take hours.

namespace {

using namespace Veldrin;
using namespace Veldrin::GeometryAlgorithms;
using Geometry::kInvalidIndex;
using Geometry::Mesh::HalfEdgeDataStructure;
using Math::float3;
using support::FaceEdge;
using support::Polygons;
using Indices = std::vector<unsigned int>;

constexpr unsigned int kMany = 100000;

/// Corners of the largest face, points of the longest strand; fewer under sanitizers, which take ten times as long.
#if defined(__SANITIZE_ADDRESS__) || defined(__SANITIZE_THREAD__)
constexpr unsigned int kGiant = 1000000;
#else
constexpr unsigned int kGiant = 10000000;
#endif

Indices countingUp(unsigned int count)
{
    Indices indices(count);
    std::iota(indices.begin(), indices.end(), 0u);
    return indices;
}

Nexil::Array<FaceEdge> acrossOf(Object const& mesh)
{
    Nexil::Array<FaceEdge> across, pointFaces;
    Nexil::Array<unsigned int> index;
    EXPECT_TRUE(buildFaceVertexAdjacency(mesh, across, pointFaces, index, nullptr));
    return across;
}

TEST(HardFamilies, Fans)
{
    for (unsigned int const hub : {0u, kMany}) {
        auto const rim = [&](unsigned int k) { return k % kMany + (hub == 0 ? 1 : 0); };
        Polygons fan;
        for (unsigned int k = 0; k < kMany; ++k)
            fan.push_back({hub, rim(k), rim(k + 1)});
        auto const mesh = support::meshOn(kMany + 1, fan);
        EXPECT_EQ(HalfEdgeDataStructure(*mesh).edgeCount(), 2 * kMany);
        auto const across = acrossOf(*mesh);
        EXPECT_EQ(across[0], (FaceEdge{kMany - 1, 2}));
        EXPECT_EQ(across[2], (FaceEdge{1, 0}));
        EXPECT_EQ(across[1].face, kInvalidIndex);
    }
}

TEST(HardFamilies, Books)
{
    Polygons book;
    for (unsigned int k = 0; k < kMany; ++k)
        book.push_back(k % 2 == 0 ? Indices{0, 1, 2 + k} : Indices{1, 0, 2 + k});
    auto const mesh = support::meshOn(kMany + 2, book);
    HalfEdgeDataStructure const table(*mesh);
    EXPECT_EQ(table.edgeCount(), 2 * kMany + 1);
    EXPECT_EQ(table.findEdge(0, 1).faceCount, kMany);
    EXPECT_TRUE(std::ranges::equal(Geometry::Mesh::diagnose(*mesh).nonManifoldFaces, countingUp(kMany)));
    auto const across = acrossOf(*mesh);
    EXPECT_EQ(across[0], (FaceEdge{1, 0})) << "the lowest that runs the other way";
    EXPECT_EQ(across[3], (FaceEdge{0, 0}));
}

TEST(HardFamilies, GiantPolygons)
{
    auto polygon = countingUp(kGiant);
    auto const giant = support::meshOn(kGiant, {polygon});
    EXPECT_EQ(acrossOf(*giant)[kGiant - 1].face, kInvalidIndex);
    Nexil::Array<float3> faceNormal, normals;
    computeMeshFaceNormals(*giant, faceNormal);
    for (bool const byAngle : {false, true}) {
        computeMeshVertexNormals(*giant, byAngle, true, normals);
        // Scaling to length 1 a second time may change the last bit.
        EXPECT_NEAR(dot(normals[kGiant / 2], faceNormal[0]), 1, 1e-6);
    }
    polygon.resize(1000000);
    EXPECT_EQ(HalfEdgeDataStructure(*support::meshOn(1000000, {polygon})).edgeCount(), 1000000u);
    // There and back along one line.
    polygon.insert(polygon.end(), polygon.rbegin() + 1, polygon.rend() - 1);
    HalfEdgeDataStructure const line(*support::meshOn(1000000, {polygon}));
    EXPECT_EQ(line.edgeCount(), 999999u);
    auto const edge = line.findEdge(5, 6);
    EXPECT_TRUE(edge.faceCount == 1 && edge.isForward && edge.isBackward);
}

TEST(HardFamilies, OneGiantStrandAndAMillionOfOnePoint)
{
    Nexil::Array<float> lengths, segments, ratios;
    Nexil::Array<float3> tangents;
    auto const measure = [&](std::vector<float3> const& points, Indices const& offsets) {
        auto const strands = createObject();
        Geometry::populateStrand(support::array(points), support::array(offsets), *strands);
        EXPECT_TRUE(computeStrandLength(*strands, lengths, segments, nullptr));
        EXPECT_TRUE(computeStrandRatio(*strands, ratios, nullptr));
        EXPECT_TRUE(computeStrandTangents(*strands, tangents, nullptr));
        return std::tuple(lengths[lengths.size() - 1], ratios[ratios.size() - 1], tangents[tangents.size() - 1]);
    };
    std::vector<float3> points(kGiant);
    for (unsigned int i = 0; i < kGiant; ++i)
        points[i] = {static_cast<float>(i % 2), 0, 0};
    EXPECT_EQ(measure(points, {0, kGiant}), std::tuple(static_cast<float>(kGiant - 1), 1.0f, float3{1, 0, 0}));
    points.resize(1000000);
    EXPECT_EQ(measure(points, countingUp(1000001)), std::tuple(0.0f, 0.0f, float3{0, 1, 0}));
}

TEST(HardFamilies, OffsetsOfWhichEveryOtherFaceOwnsAllCorners)
{
    constexpr unsigned int kCount = 1000000;
    Indices offsets(kCount + 1);
    for (unsigned int f = 0; f <= kCount; ++f)
        offsets[f] = f % 2 * kCount;
    auto const mesh = support::filled([&](Object& object) {
        Geometry::populateMesh(support::array(std::vector<float3>(kCount)), support::array(countingUp(kCount)),
                               support::array(offsets), object);
    });
    Nexil::Array<bool> selected;
    selected.resize(kCount);
    std::ranges::fill(selected, true);
    auto const all = Geometry::TagConversionStyle::AllElements;
    auto const faces = Geometry::pointsToFaces(*mesh, selected, all, nullptr);
    EXPECT_TRUE((*faces)[0]);
    EXPECT_FALSE((*faces)[1]);
    EXPECT_TRUE((*Geometry::facesToPoints(*mesh, selected, nullptr))[kCount - 1]);
    selected[kCount - 1] = false;
    EXPECT_FALSE((*Geometry::faceVerticesToFaces(*mesh, selected, all, nullptr))[0]);
}

} // namespace
