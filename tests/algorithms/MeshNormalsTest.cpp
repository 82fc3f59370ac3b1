#include "EdgeOracle.h"

#include <support/Labels.h>

#include <veldrin/algorithms/FaceVertexAdjacency.h>
#include <veldrin/algorithms/MeshNormals.h>
#include <veldrin/algorithms/NormalsTopology.h>

#include <gtest/gtest.h>

#include <cmath>
#include <cstring>
#include <limits>

namespace {

using namespace Veldrin::GeometryAlgorithms;
using support::FaceEdge;
using support::Polygons;
using Veldrin::Geometry::kInvalidIndex;
using Veldrin::Math::float3;
using Normals = Nexil::Array<float3>;

float3 unitOr(float3 const& v, float3 const& fallback)
{
    return length(v) > std::numeric_limits<float>::min() ? v * (1 / length(v)) : fallback;
}

/// The oracle, with the promised order of operations.
struct Polygon {
    std::vector<float3> const& points;
    std::vector<unsigned int> const& face;

    bool isWhole() const { return face.size() > 2 && *std::ranges::max_element(face) < points.size(); }
    float3 at(std::size_t k) const { return points[face[k % face.size()]]; }

    float3 normal() const
    {
        float3 fan{};
        for (std::size_t k = 2; isWhole() && k < face.size(); ++k)
            fan = fan + cross(at(k - 1) - at(0), at(k) - at(0));
        return unitOr(fan, {0, 1, 0});
    }

    float area() const
    {
        float3 loop{};
        for (std::size_t k = 0; k < face.size(); ++k)
            loop = loop + cross(at(k), at(k + 1));
        return 0.5f * length(loop);
    }

    float angle(std::size_t k) const
    {
        auto const edge = [&](std::size_t to) { return unitOr(at(to) - at(k), at(to) - at(k)); };
        return std::acos(std::clamp(dot(edge(k + face.size() - 1), edge(k + 1)), -1.0f, 1.0f));
    }
};

/// Sums over the faces in their order, at each point; and what their rounding grows with.
struct Sums {
    std::vector<float3> normals;
    std::vector<float> weights;

    Sums(std::vector<float3> const& points, Polygons const& faces, bool byAngle, bool byArea)
        : normals(points.size()), weights(points.size())
    {
        for (auto const& face : faces) {
            Polygon const polygon{points, face};
            if (!polygon.isWhole())
                continue;
            float const area = byArea ? polygon.area() : 1;
            for (std::size_t k = 0; k < face.size(); ++k) {
                float const angle = byAngle ? polygon.angle(k) : 1;
                normals[face[k]] = normals[face[k]] + polygon.normal() * area * angle;
                weights[face[k]] += area * (angle + 1); // an angle near 0 is as uncertain as the root of its cosine
            }
        }
    }
};

bool haveSameBits(float3 const& found, float3 const& expected)
{
    return std::memcmp(&found, &expected, sizeof found) == 0;
}

/// Leaves what is no number in the memory that is handed out next.
void soilFreeMemory(std::size_t floatCount)
{
    std::vector<std::vector<float>> const soil(4, std::vector<float>(floatCount, std::nanf("")));
}

/// Random faces whose corners lie within `spread` points of each other, all along the points of a mesh; only the last quarter
/// has points that are not there.
Polygons facesAlong(unsigned int pointCount, unsigned int spread, unsigned int faceSize)
{
    auto faces = support::randomFaces(spread, 20000, faceSize, spread);
    for (std::size_t f = 0; f < faces.size(); ++f)
        for (unsigned int& corner : faces[f])
            if (corner < spread || f < faces.size() / 4 * 3)
                corner = static_cast<unsigned int>((corner % spread + f * (pointCount - spread) / faces.size()) %
                                                   pointCount);
            else
                corner = corner - spread + pointCount;
    return faces;
}

void expectSums(unsigned int pointCount, unsigned int spread, unsigned int faceSize)
{
    auto const faces = facesAlong(pointCount, spread, faceSize);
    std::mt19937 random(spread);
    std::vector<float3> points(pointCount);
    for (float3& p : points)
        p = {float(random() % 1000) / 7, float(random() % 1000) / 7, float(random() % 1000) / 7};
    auto const mesh = support::mesh(points, faces);
    Normals ofFaces;
    computeMeshFaceNormals(*mesh, ofFaces);
    for (std::size_t f = 0; f < faces.size(); ++f)
        ASSERT_TRUE(haveSameBits(ofFaces[f], Polygon{points, faces[f]}.normal())) << f;
    for (int variant = 0; variant < 4; ++variant) {
        bool const byAngle = variant >= 2;
        bool const byArea = variant % 2 == 1;
        SCOPED_TRACE(testing::Message() << "variant " << variant << ", spread " << spread << " of " << pointCount);
        Normals first;
        computeMeshVertexNormals(*mesh, byAngle, byArea, first);
        ASSERT_EQ(first.size(), pointCount);
        Sums const sums(points, faces, byAngle, byArea);
        for (std::size_t p = 0; p < pointCount; ++p) {
            auto const error = first[p] * length(sums.normals[p]) - sums.normals[p];
            // Angles come from an arc cosine of our own.
            ASSERT_TRUE(byAngle ? length(error) <= 2e-6f * sums.weights[p]
                                : haveSameBits(first[p], unitOr(sums.normals[p], {0, 1, 0})))
                << p;
        }
        support::onThreadCounts([&] {
            soilFreeMemory(4 * faces.size());
            Normals normals;
            computeMeshVertexNormals(*mesh, byAngle, byArea, normals);
            ASSERT_EQ(normals.size(), first.size());
            EXPECT_EQ(std::memcmp(normals.data(), first.data(), first.size() * sizeof(float3)), 0);
        });
    }
}

TEST(MeshNormals, AreTheSumsOverTheFacesInTheirOrderAndTheSameBitsOnAllThreads)
{
    // Degenerate faces, repeated corners and points that are not there; sums that fit a cache and sums that do not, among
    // neighbours with near numbers and far ones; one thread below the threshold.
    static_assert(kParallelMeshVertexNormalsThreshold == 16384);
    for (unsigned int const pointCount : {1000u, 16389u, 131077u})
        for (unsigned int const spread : {40u, pointCount})
            for (unsigned int const faceSize : {0u, 3u, 4u})
                expectSums(pointCount, spread, faceSize);
}

TEST(MeshNormals, PointsWithoutAnyFaceGetTheFallback)
{
    for (std::size_t const pointCount : {20000u, 200000u}) {
        auto const object = support::mesh(std::vector<float3>(pointCount), {{0, 1, 2}});
        ASSERT_TRUE(Veldrin::Geometry::setElementCount(Veldrin::Geometry::sFaceComp, 0, *object));
        support::onThreadCounts([&] {
            Normals normals;
            computeMeshVertexNormals(*object, true, false, normals);
            EXPECT_EQ(normals, *support::array(std::vector<float3>(pointCount, {0, 1, 0})));
        });
    }
}

TEST(MeshNormals, OffsetsThatWrapAmongOnesThatRiseStayWithinTheirArrays)
{
    // Whole runs of offsets are looked at together: the second one has steps of 3 and wraps.
    constexpr unsigned int kRun = 16384;
    std::vector<unsigned int> offsets(4 * kRun, 0u);
    for (unsigned int i = 0; i < offsets.size(); ++i)
        offsets[i] = i < kRun ? 3 * i : i < 2 * kRun ? 3 * (i - kRun) - 2 : 2 * i - kRun - 2;
    offsets.push_back(3 * 4 * kRun);
    auto const object =
        support::mesh(std::vector<float3>(1000), std::vector<unsigned int>(offsets.back(), 999), offsets);
    Normals normals;
    computeMeshFaceNormals(*object, normals);
    EXPECT_EQ(normals.size(), offsets.size() - 1);
    computeMeshVertexNormals(*object, true, true, normals);
    EXPECT_EQ(normals.size(), 1000u);
}

TEST(NormalsTopology, GroupsAreWhatSmoothEdgesJoin)
{
    // A bumpy torus with a hole, a face turned over and one twice.
    constexpr unsigned int kSide = 24;
    std::vector<float3> points(kSide * kSide);
    for (unsigned int p = 0; p < points.size(); ++p) {
        float const u = 6.2831853f * float(p / kSide) / float(kSide);
        float const v = 6.2831853f * float(p % kSide) / float(kSide);
        float const r = 1 + 0.1f * std::sin(5 * u) * std::cos(3 * v);
        points[p * 5 % points.size()] = {(3 + r * std::cos(v)) * std::cos(u), (3 + r * std::cos(v)) * std::sin(u),
                                         r * std::sin(v)};
    }
    auto faces = support::torusFaces(kSide, 5);
    faces.erase(faces.begin() + 40, faces.begin() + 43);
    std::ranges::reverse(faces[100]);
    faces.push_back(faces[10]);
    auto const mesh = support::mesh(points, faces);
    Nexil::Array<FaceEdge> across, pointFaces;
    Nexil::Array<unsigned int> pointFaceIndex;
    ASSERT_TRUE(buildFaceVertexAdjacency(*mesh, across, pointFaces, pointFaceIndex, nullptr));
    auto const normalOf = [&](std::size_t f) { return Polygon{points, faces[f]}.normal(); };
    for (float const maxAngle : {0.0f, 0.05f, 0.2f, 4.0f}) {
        // Face-vertices that smooth edges join; all faces are quads.
        support::Pairs joined;
        for (unsigned int i = 0; i < across.size(); ++i) {
            auto const [face, corner] = across[i];
            if (face != kInvalidIndex && across[4 * face + corner] == FaceEdge{i / 4, i % 4} &&
                std::acos(std::min(dot(normalOf(i / 4), normalOf(face)), 1.0f)) < maxAngle)
                joined.emplace_back(i, 4 * face + (corner + 1) % 4);
        }
        // Numbered in the order of their first face-vertex.
        auto expected = support::leastLabels(static_cast<unsigned int>(across.size()), joined);
        unsigned int expectedCount = 0;
        for (unsigned int i = 0; i < expected.size(); ++i)
            expected[i] = expected[i] == i ? expectedCount++ : expected[expected[i]];
        support::onThreadCounts([&] {
            Nexil::Array<unsigned int> groups;
            unsigned int count = 0;
            computeMeshNormalsTopology(*mesh, {}, maxAngle, groups, count, nullptr);
            EXPECT_TRUE(std::ranges::equal(groups, expected)) << maxAngle;
            EXPECT_EQ(count, expectedCount) << maxAngle;
        });
    }
}

unsigned int groupCountOf(Veldrin::Object const& mesh, Nexil::Array<unsigned int> const& normals, float maxAngle)
{
    Nexil::Array<unsigned int> groups;
    unsigned int count = 0;
    computeMeshNormalsTopology(mesh, normals, maxAngle, groups, count, nullptr);
    return count;
}

TEST(NormalsTopology, AnEdgeOfThreeFacesIsHardThoughTwoOfThemLieFlat)
{
    auto const book =
        support::mesh({{0, 0, 0}, {1, 0, 0}, {0, 0, 1}, {0, -1, 0}, {0, 1, 0}}, {{1, 0, 2}, {1, 0, 3}, {0, 1, 4}});
    EXPECT_EQ(groupCountOf(*book, {}, 0.1f), 9u);
}

TEST(NormalsTopology, KnownNormalsDecideBeforeAngles)
{
    // Two quads side by side, with the edge from 1 to 4 between them.
    auto const object =
        support::mesh({{0, 0, 0}, {1, 0, 0}, {2, 0, 0}, {0, 1, 0}, {1, 1, 0}, {2, 1, 0}}, {{0, 1, 4, 3}, {1, 2, 5, 4}});
    unsigned int const unknown = kInvalidIndex;
    struct {
        Nexil::Array<unsigned int> normals;
        float maxAngle;
        unsigned int groups;
    } const rows[] = {
        {{0, 1, 2, 3, 1, 5, 6, 2}, 0.0f, 6},       // the same on both sides: smooth whatever the angle
        {{0, 1, 2, 3, 9, 5, 6, 2}, 3.0f, 8},       // another at one end: hard
        {{0, unknown, 2, 3, 9, 5, 6, 2}, 3.0f, 6}, // one not known: by angle
        {{0, 1, 2, 3}, 0.0f, 8},                   // what is missing is not known
    };
    for (auto const& [normals, maxAngle, expected] : rows) {
        EXPECT_EQ(groupCountOf(*object, normals, maxAngle), expected);
    }
}

} // namespace
