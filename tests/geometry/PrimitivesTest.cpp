#include <support/Geometry.h>
#include <veldrin/algorithms/MeshDiagnostic.h>
#include <veldrin/algorithms/MeshInvariants.h>
#include <veldrin/geometry/Prototypes.h>

#include <gmock/gmock.h>

namespace {

using namespace Veldrin;
using namespace Veldrin::Geometry;
using Math::float3;

/// The area vector of a polygon around its first corner: twice its area long, towards where it is counter-clockwise.
float3 areaVector(std::vector<float3> const& points, std::vector<unsigned int> const& face)
{
    float3 sum;
    for (std::size_t i = 2; i < face.size(); ++i)
        sum = sum + cross(points[face[i - 1]] - points[face[0]], points[face[i]] - points[face[0]]);
    return sum;
}

float3 center(std::vector<float3> const& points, std::vector<unsigned int> const& face)
{
    float3 sum;
    for (unsigned int corner : face)
        sum = sum + points[corner];
    return sum * (1.0f / static_cast<float>(face.size()));
}

/// Every edge has one face on either side, running against each other, and the surface is a sphere's.
void expectClosedSphere(Object const& mesh, unsigned int pointCount, unsigned int faceCount)
{
    EXPECT_TRUE(Object::isA(mesh, *getMeshPrototype()));
    EXPECT_EQ(getElementCount(mesh, sPointComp), pointCount);
    EXPECT_EQ(getElementCount(mesh, sFaceComp), faceCount);
    EXPECT_EQ(Mesh::bettiNumbers(mesh), (Math::int3{1, 0, 1}));
    EXPECT_TRUE(Mesh::diagnose(mesh) == Mesh::Diagnostic{});
}

TEST(Primitives, ACubeHasItsTablesAndFacesOutwards)
{
    auto const cube = support::filled([](Object& object) { populateCubeMesh(2, object); });
    expectClosedSphere(*cube, 8, 6);
    auto const points = support::valuesIn<float3>(*cube, sPointPosition);
    std::vector<float3> const expected{{-1, -1, -1}, {1, -1, -1}, {1, -1, 1}, {-1, -1, 1},
                                       {-1, 1, -1},  {1, 1, -1},  {1, 1, 1},  {-1, 1, 1}};
    EXPECT_EQ(points, expected);
    support::Polygons const faces{{0, 1, 2, 3}, {4, 7, 6, 5}, {2, 6, 7, 3}, {0, 4, 5, 1}, {4, 0, 3, 7}, {1, 5, 6, 2}};
    EXPECT_EQ(support::facesOf(*cube), faces);

    auto const normals = support::valuesIn<float3>(*cube, sFaceVertexNormal);
    auto const indices = support::valuesIn<unsigned int>(*cube, "face_vertex_normal_index", sIndices);
    ASSERT_EQ(normals.size(), 6u);
    ASSERT_EQ(indices.size(), 24u);
    for (unsigned int face = 0; face < 6; ++face) {
        // A face's area is 4.
        EXPECT_EQ(areaVector(points, faces[face]), normals[face] * 8.0f) << face;
        EXPECT_EQ(center(points, faces[face]), normals[face]) << face;
        for (unsigned int corner = 4 * face; corner < 4 * face + 4; ++corner)
            EXPECT_EQ(indices[corner], face);
    }
    EXPECT_EQ(support::names(getTargetChain(*cube, sFaceVertexNormal)),
              (std::vector<std::string>{"face_vertex_normal", "face_vertex_normal_index", "face_vertex_component"}));
    EXPECT_EQ(support::names(cube->keys()).back(), "face_vertex_normal");
    EXPECT_TRUE(getRangeGeoProperty(*cube, "face_vertex_normal_index"));
}

TEST(Primitives, APlaneIsAtLeastOneQuadAndAtMostWhatItsCountsHold)
{
    for (unsigned int subdivisions : {0u, 1u}) {
        auto const plane = createObject();
        ASSERT_TRUE(populatePlaneMesh(2, subdivisions, *plane));
        EXPECT_EQ(support::valuesIn<float3>(*plane, sPointPosition),
                  (std::vector<float3>{{-1, 0, 1}, {1, 0, 1}, {-1, 0, -1}, {1, 0, -1}}));
        EXPECT_EQ(support::facesOf(*plane), (support::Polygons{{0, 1, 3, 2}}));
        EXPECT_EQ(plane->size(), 6u);
    }
    // 32768: corners. 65535: points. 65536 and more: products that wrap around in 32 and in 64 bits.
    auto const untouched = createObject();
    for (unsigned int subdivisions : {32768u, 65535u, 65536u, 0x80000000u, 0xFFFFFFFFu})
        EXPECT_FALSE(populatePlaneMesh(1, subdivisions, *untouched)) << subdivisions;
    EXPECT_TRUE(untouched->empty());
}

TEST(Primitives, APlaneHasTheSameBitsOnEveryThreadCount)
{
    constexpr unsigned int n = 700; // not a divisor of any grain
    support::onThreadCounts([&] {
        auto const plane = createObject();
        ASSERT_TRUE(populatePlaneMesh(3.7f, n, *plane));
        auto const points = support::valuesIn<Math::float3>(*plane, sPointPosition);
        auto const faces = support::facesOf(*plane);
        ASSERT_EQ(points.size(), (n + 1) * (n + 1));
        ASSERT_EQ(faces.size(), n * n);
        float const step = 3.7f / n;
        for (unsigned int i = 0; i < points.size(); ++i)
            ASSERT_EQ(points[i], (Math::float3{-1.85f + static_cast<float>(i % (n + 1)) * step, 0,
                                               1.85f + static_cast<float>(i / (n + 1)) * -step}));
        for (unsigned int i = 0; i < faces.size(); ++i) {
            unsigned int const a = i / n * (n + 1) + i % n;
            ASSERT_EQ(faces[i], (std::vector<unsigned int>{a, a + 1, a + n + 2, a + n + 1}));
        }
    });
}

TEST(Primitives, ASphereIsClosedFacesOutwardsAndCarriesItsNormals)
{
    auto const sphere = support::filled([](Object& object) { populateSphereMesh(2, object); });
    expectClosedSphere(*sphere, 22, 25);
    auto const points = support::valuesIn<float3>(*sphere, sPointPosition);
    auto const faces = support::facesOf(*sphere);
    for (std::size_t face = 0; face < faces.size(); ++face) {
        EXPECT_EQ(faces[face].size(), face < 15 ? 4u : 3u);
        EXPECT_GT(dot(areaVector(points, faces[face]), center(points, faces[face])), 0.1f) << face;
    }
    auto const normals = support::valuesIn<float3>(*sphere, sPointNormal);
    ASSERT_EQ(normals.size(), 22u);
    for (std::size_t i = 0; i < 22; ++i) {
        EXPECT_NEAR(length(points[i]), 2, 2e-6f) << i;
        EXPECT_NEAR(length(normals[i]), 1, 2e-6f) << i;
        EXPECT_GT(dot(points[i], normals[i]), 1.95f) << i;
    }
    // Entries that break the table's symmetry, or that no invariant above would miss.
    EXPECT_EQ(points[1], (float3{-0.475528f, -0.809017f, -0.345492f} * 2.0f));
    EXPECT_EQ(points[17], (float3{-0.475528f, 0.809017f, 0.345491f} * 2.0f));
    EXPECT_EQ(normals[2], (float3{-0.564703f, -0.716086f, 0.410281f}));
    EXPECT_EQ(normals[9], (float3{0.961091f, -0.276231f, 0}));
    EXPECT_EQ(getTargetComponent(*sphere, sPointNormal), "point_component");
}

TEST(Primitives, ANegativeRadiusMirrorsPointsAndNegatesNormals)
{
    auto const sphere = [](float radius, char const* name) {
        return support::valuesIn<float3>(*support::filled([=](Object& object) { populateSphereMesh(radius, object); }),
                                         name);
    };
    for (char const* name : {sPointPosition, sPointNormal}) {
        auto const outside = sphere(1, name);
        auto const inside = sphere(-1, name);
        ASSERT_EQ(outside.size(), 22u);
        for (std::size_t i = 0; i < outside.size(); ++i)
            EXPECT_EQ(outside[i] * -1.0f, inside[i]) << name << " " << i;
    }
    EXPECT_EQ(sphere(0, sPointNormal), sphere(1, sPointNormal));
}

} // namespace
