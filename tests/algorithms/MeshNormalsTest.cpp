#include "EdgeOracle.h"

#include <veldrin/algorithms/FaceVertexAdjacency.h>
#include <veldrin/algorithms/MeshNormals.h>
#include <veldrin/algorithms/NormalsTopology.h>

#include <gtest/gtest.h>

#include <cmath>
#include <cstring>
#include <limits>
#include <utility>

namespace {

using namespace Veldrin::GeometryAlgorithms;
using support::FaceEdge;
using support::Polygons;
using Veldrin::Geometry::kInvalidIndex;
using Veldrin::Math::float3;
using Face = std::vector<unsigned int>;
using Normals = Nexil::Array<float3>;

// The oracle, in single precision with the promised order of operations, or in double.

template <class Real>
using Vector = Veldrin::Math::Vector<Real, 3>;

template <class Real>
Vector<Real> unitOr(Vector<Real> const& v, Vector<Real> const& fallback)
{
    return length(v) > Real(std::numeric_limits<float>::min()) ? v * (1 / length(v)) : fallback;
}

template <class Real>
struct Polygon {
    std::vector<float3> const& points;
    Face const& face;

    Vector<Real> at(std::size_t k) const
    {
        float3 const& p = points[face[k % face.size()]];
        return {Real(p.x), Real(p.y), Real(p.z)};
    }

    Vector<Real> normal() const
    {
        Vector<Real> fan{};
        for (std::size_t k = 2; k < face.size(); ++k)
            fan = fan + cross(at(k - 1) - at(0), at(k) - at(0));
        return unitOr(fan, {0, 1, 0});
    }

    Real area() const
    {
        Vector<Real> loop{};
        for (std::size_t k = 0; k < face.size(); ++k)
            loop = loop + cross(at(k), at(k + 1));
        return Real(0.5) * length(loop);
    }

    Real angle(std::size_t k) const
    {
        auto const edge = [&](std::size_t to) { return unitOr(at(to) - at(k), at(to) - at(k)); };
        return std::acos(std::clamp(dot(edge(k + face.size() - 1), edge(k + 1)), Real(-1), Real(1)));
    }

    bool isWhole() const { return face.size() > 2 && *std::ranges::max_element(face) < points.size(); }
};

/// Sums over the faces in their order, at each point; and what their rounding grows with.
template <class Real>
struct Sums {
    std::vector<Vector<Real>> normals;
    std::vector<Real> weights;

    Sums(std::vector<float3> const& points, Polygons const& faces, bool byAngle, bool byArea)
        : normals(points.size()), weights(points.size())
    {
        for (auto const& face : faces) {
            Polygon<Real> const polygon{points, face};
            if (!polygon.isWhole())
                continue;
            Real const area = byArea ? polygon.area() : 1;
            for (std::size_t k = 0; k < face.size(); ++k) {
                Real const angle = byAngle ? polygon.angle(k) : 1;
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

/// Random faces whose corners lie within `spread` points of each other, all along the points of a mesh.
Polygons facesAlong(unsigned int pointCount, unsigned int spread, unsigned int faceSize)
{
    auto faces = support::randomFaces(spread, 20000, faceSize, spread);
    for (std::size_t f = 0; f < faces.size(); ++f)
        for (unsigned int& corner : faces[f])
            if (corner < spread)
                corner = static_cast<unsigned int>((corner + f * (pointCount - spread) / faces.size()) % pointCount);
            else
                corner = corner - spread + pointCount;
    return faces;
}

void expectSums(unsigned int pointCount, unsigned int spread, unsigned int faceSize)
{
    auto faces = facesAlong(pointCount, spread, faceSize);
    std::mt19937 random(spread);
    std::vector<float3> points(pointCount);
    for (float3& p : points)
        p = {float(random() % 1000) / 7, float(random() % 1000) / 7, float(random() % 1000) / 7};
    auto const mesh = support::mesh(points, faces);
    Normals ofFaces;
    computeMeshFaceNormals(*mesh, ofFaces);
    for (std::size_t f = 0; f < faces.size(); ++f) {
        Polygon<float> const polygon{points, faces[f]};
        ASSERT_TRUE(haveSameBits(ofFaces[f], polygon.isWhole() ? polygon.normal() : float3{0, 1, 0})) << f;
    }
    auto mixed = faces;
    mixed.push_back({0, 1});
    auto const ofMixedFaces = support::mesh(points, mixed);
    for (int variant = 0; variant < 4; ++variant) {
        bool const byAngle = variant >= 2;
        bool const byArea = variant % 2 == 1;
        SCOPED_TRACE(testing::Message() << "variant " << variant << ", spread " << spread << " of " << pointCount);
        // Angles come from an arc cosine of our own: the same with faces of one size as among others.
        Normals first;
        computeMeshVertexNormals(*ofMixedFaces, byAngle, byArea, first);
        ASSERT_EQ(first.size(), pointCount);
        Sums<float> const single(points, faces, byAngle, byArea);
        Sums<double> const sums(points, faces, byAngle, byArea);
        for (std::size_t p = 0; p < pointCount; ++p) {
            if (!byAngle) {
                ASSERT_TRUE(haveSameBits(first[p], unitOr(single.normals[p], {0, 1, 0}))) << p;
            }
            // What cancels out in a polygon of many corners need not in single precision.
            if (faceSize == 0 || sums.weights[p] == 0)
                continue;
            Vector<double> const found{first[p].x, first[p].y, first[p].z};
            auto const error = found * length(sums.normals[p]) - sums.normals[p];
            ASSERT_LT(length(error), 1e-3 * sums.weights[p]) << p;
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
        for (auto const* component : {Veldrin::Geometry::sFaceComp, Veldrin::Geometry::sFaceVertexComp})
            ASSERT_TRUE(Veldrin::Geometry::setElementCount(component, 0, *object));
        Nexil::MutablePtr<Veldrin::Object> offsets(support::part(*object, Veldrin::Geometry::sFaceOffset));
        Veldrin::setProperty(*offsets, Veldrin::Geometry::sData, support::array(std::vector<unsigned int>{}));
        Veldrin::setProperty(*object, Veldrin::Geometry::sFaceOffset, Nexil::Ptr<Veldrin::Object>(std::move(offsets)));
        support::onThreadCounts([&] {
            for (bool const byAngle : {false, true}) {
                Normals normals;
                computeMeshVertexNormals(*object, byAngle, false, normals);
                ASSERT_EQ(normals.size(), pointCount);
                EXPECT_EQ(normals[pointCount - 1], (float3{0, 1, 0}));
            }
        });
    }
}

TEST(MeshNormals, AnglesAreExactToAFewUnitsInTheLastPlace)
{
    // Two triangles at right angles share one point: the normal there tells their angles' ratio.
    for (double const angle : {1e-3, 0.1, 0.7, 1.0471975512, 1.5707963, 2.2, 3.1}) {
        float const c = static_cast<float>(std::cos(angle));
        float const s = static_cast<float>(std::sin(angle));
        auto const object =
            support::mesh({{0, 0, 0}, {1, 0, 0}, {c, s, 0}, {0, 1, 0}, {0, 0, 1}}, {{0, 1, 2}, {0, 3, 4}});
        Normals normals;
        computeMeshVertexNormals(*object, true, false, normals);
        double const ratio = double(normals[0].z) / double(normals[0].x);
        double const expected = std::atan2(double(s), double(c)) / 1.57079632679489661923;
        // An angle from its cosine in single precision is uncertain by the cosine's rounding over its sine.
        double const tolerance = 6e-8 * (4 * expected + 1 / std::max(std::sin(angle), 1e-3));
        EXPECT_NEAR(ratio, expected, tolerance) << angle;
    }
}

TEST(MeshNormals, DegenerateFacesAndLonePointsGetTheFallback)
{
    // A triangle, one of two corners, one without area, one that names no point, one of none; a point apart.
    auto const mesh =
        support::mesh({{0, 0, 0}, {1, 0, 0}, {0, 1, 0}, {5, 5, 5}}, {{0, 2, 1}, {0, 1}, {0, 0, 1}, {0, 1, 4}, {}});
    Normals faces, byArea;
    computeMeshFaceNormals(*mesh, faces);
    EXPECT_EQ(faces, (Normals{{0, 0, -1}, {0, 1, 0}, {0, 1, 0}, {0, 1, 0}, {0, 1, 0}}));
    computeMeshVertexNormals(*mesh, false, true, byArea);
    EXPECT_EQ(byArea, (Normals{{0, 0, -1}, {0, 0, -1}, {0, 0, -1}, {0, 1, 0}})) << "no area, no weight";
}

Nexil::Array<FaceEdge> acrossOf(Veldrin::Object const& mesh)
{
    Nexil::Array<FaceEdge> across, pointFaces;
    Nexil::Array<unsigned int> index;
    (void)buildFaceVertexAdjacency(mesh, across, pointFaces, index, nullptr);
    return across;
}

TEST(MeshNormals, OffsetsThatWrapAmongOnesThatRiseStayWithinTheirArrays)
{
    // Whole runs of offsets are looked at together: the second one has steps of 3 and wraps.
    constexpr unsigned int kRun = 16384;
    std::vector<unsigned int> offsets;
    for (unsigned int i = 0; i < kRun; ++i)
        offsets.push_back(3 * i);
    for (unsigned int i = 0; i < kRun; ++i)
        offsets.push_back(0xFFFFFFFEu + 3 * i);
    for (unsigned int i = 0; i < 2 * kRun; ++i)
        offsets.push_back(3 * kRun - 2 + 2 * i);
    offsets.push_back(3 * 4 * kRun);
    std::vector<unsigned int> corners(offsets.back());
    for (std::size_t i = 0; i < corners.size(); ++i)
        corners[i] = static_cast<unsigned int>(i * 7919 % 1000);
    auto const object = support::filled([&](Veldrin::Object& mesh) {
        Veldrin::Geometry::populateMesh(support::array(std::vector<float3>(1000)), support::array(corners),
                                        support::array(offsets), mesh);
    });
    Normals normals;
    computeMeshFaceNormals(*object, normals);
    EXPECT_EQ(normals.size(), offsets.size() - 1);
    computeMeshVertexNormals(*object, true, true, normals);
    EXPECT_EQ(normals.size(), 1000u);
    EXPECT_TRUE(acrossOf(*object).empty());
}

/// Groups by flood over the face-vertices of each point, in the order of their first face-vertex. All faces are quads.
std::vector<unsigned int> floodGroups(Nexil::Array<FaceEdge> const& across, std::vector<bool> const& isSmooth)
{
    std::vector<std::vector<std::size_t>> linked(across.size());
    for (std::size_t i = 0; i < linked.size(); ++i)
        if (isSmooth[i]) {
            std::size_t const behind = 4 * across[i].face + (across[i].corner + 1) % 4;
            linked[i].push_back(behind);
            linked[behind].push_back(i);
        }
    std::vector<unsigned int> groups(linked.size(), kInvalidIndex);
    unsigned int count = 0;
    for (std::size_t start = 0; start < groups.size(); ++start) {
        if (groups[start] != kInvalidIndex)
            continue;
        std::vector<std::size_t> open{start};
        while (!open.empty()) {
            std::size_t const i = open.back();
            open.pop_back();
            if (std::exchange(groups[i], count) == kInvalidIndex)
                open.insert(open.end(), linked[i].begin(), linked[i].end());
        }
        ++count;
    }
    return groups;
}

TEST(NormalsTopology, GroupsAreThoseThatAFloodAcrossSmoothEdgesFinds)
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
    auto const across = acrossOf(*mesh);
    for (float const maxAngle : {0.0f, 0.05f, 0.2f, 4.0f}) {
        std::vector<bool> isSmooth;
        for (std::size_t i = 0; i < across.size(); ++i) {
            auto const normalOf = [&](std::size_t f) { return Polygon<double>{points, faces[f]}.normal(); };
            FaceEdge const edge{static_cast<unsigned int>(i / 4), static_cast<unsigned int>(i % 4)};
            isSmooth.push_back(across[i].face != kInvalidIndex &&
                               across[4 * across[i].face + across[i].corner] == edge &&
                               std::acos(std::clamp(dot(normalOf(edge.face), normalOf(across[i].face)), -1.0, 1.0)) <
                                   double(maxAngle));
        }
        auto const expected = floodGroups(across, isSmooth);
        support::onThreadCounts([&] {
            Nexil::Array<unsigned int> groups;
            unsigned int count = 0;
            computeMeshNormalsTopology(*mesh, {}, maxAngle, groups, count, nullptr);
            EXPECT_TRUE(std::ranges::equal(groups, expected)) << maxAngle;
            EXPECT_EQ(count, *std::ranges::max_element(expected) + 1) << maxAngle;
        });
    }
}

TEST(NormalsTopology, KnownNormalsDecideBeforeAngles)
{
    // Two quads side by side, with the edge from 1 to 4 between them.
    auto const object =
        support::mesh({{0, 0, 0}, {1, 0, 0}, {2, 0, 0}, {0, 1, 0}, {1, 1, 0}, {2, 1, 0}}, {{0, 1, 4, 3}, {1, 2, 5, 4}});
    struct Case {
        Nexil::Array<unsigned int> normals;
        float maxAngle;
        unsigned int groups;
    };
    unsigned int const unknown = kInvalidIndex;
    for (auto const& [normals, maxAngle, expected] :
         {Case{{0, 1, 2, 3, 1, 5, 6, 2}, 0.0f, 6},       // the same on both sides: smooth whatever the angle
          Case{{0, 1, 2, 3, 9, 5, 6, 2}, 3.0f, 8},       // another at one end: hard
          Case{{0, unknown, 2, 3, 9, 5, 6, 2}, 3.0f, 6}, // one not known: by angle
          Case{{0, 1, 2, 3}, 0.0f, 8},                   // what is missing is not known
          Case{{}, 0.1f, 6}}) {
        Nexil::Array<unsigned int> groups;
        unsigned int count = 0;
        computeMeshNormalsTopology(*object, normals, maxAngle, groups, count, nullptr);
        EXPECT_EQ(count, expected);
    }
}

} // namespace
