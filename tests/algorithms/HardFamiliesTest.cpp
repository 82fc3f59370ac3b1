#include "EdgeOracle.h"

#include <veldrin/algorithms/ComponentConversion.h>
#include <veldrin/algorithms/FaceVertexAdjacency.h>
#include <veldrin/algorithms/HalfEdgeDataStructure.h>
#include <veldrin/algorithms/MeshDiagnostic.h>

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
using support::Indices;
using support::Polygons;

constexpr unsigned int kMany = 100000;

constexpr unsigned int kGiant = 1000000;

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
        EXPECT_EQ(acrossOf(*mesh)[0], (FaceEdge{kMany - 1, 2}));
    }
}

TEST(HardFamilies, Books)
{
    Polygons book;
    for (unsigned int k = 0; k < kMany; ++k)
        book.push_back(k % 2 == 0 ? Indices{0, 1, 2 + k} : Indices{1, 0, 2 + k});
    auto const mesh = support::meshOn(kMany + 2, book);
    EXPECT_EQ(HalfEdgeDataStructure(*mesh).findEdge(0, 1).faceCount, kMany);
    EXPECT_TRUE(std::ranges::equal(Geometry::Mesh::diagnose(*mesh).nonManifoldFaces, countingUp(kMany)));
    EXPECT_EQ(acrossOf(*mesh)[0], (FaceEdge{1, 0})) << "the lowest that runs the other way";
}

TEST(HardFamilies, GiantPolygons)
{
    auto polygon = countingUp(kGiant);
    auto const giant = support::meshOn(kGiant, {polygon});
    EXPECT_EQ(acrossOf(*giant)[kGiant - 1].face, kInvalidIndex);
    EXPECT_EQ(HalfEdgeDataStructure(*giant).edgeCount(), kGiant);
    // There and back along one line.
    polygon.insert(polygon.end(), polygon.rbegin() + 1, polygon.rend() - 1);
    EXPECT_EQ(HalfEdgeDataStructure(*support::meshOn(kGiant, {polygon})).edgeCount(), kGiant - 1);
}

TEST(HardFamilies, OffsetsOfWhichEveryOtherFaceOwnsAllCorners)
{
    constexpr unsigned int kCount = 1000000;
    Indices offsets(kCount + 1);
    for (unsigned int f = 0; f <= kCount; ++f)
        offsets[f] = f % 2 * kCount;
    auto const mesh = support::mesh(std::vector<float3>(kCount), countingUp(kCount), offsets);
    auto const selected = support::array(std::vector<bool>(kCount, true));
    auto const faces = Geometry::pointsToFaces(*mesh, *selected, Geometry::TagConversionStyle::AllElements, nullptr);
    EXPECT_TRUE((*faces)[0]);
    EXPECT_FALSE((*faces)[1]);
    EXPECT_TRUE((*Geometry::facesToPoints(*mesh, *selected, nullptr))[kCount - 1]);
}

} // namespace
