#include "EdgeOracle.h"

#include <veldrin/algorithms/FaceVertexAdjacency.h>
#include <veldrin/algorithms/MeshNormals.h>
#include <veldrin/algorithms/NormalsTopology.h>
#include <veldrin/geometry/FaceEdge.h>

#include <gtest/gtest.h>

#include <array>
#include <cmath>
#include <cstring>
#include <numeric>

namespace {

using namespace Veldrin::GeometryAlgorithms;
using support::Polygons;
using Veldrin::Geometry::kInvalidIndex;
using Veldrin::Geometry::Mesh::FaceEdge;
using Veldrin::Math::float3;
using Normals = Nexil::Array<float3>;
using Vector = std::array<double, 3>;

Vector toDouble(float3 const& v)
{
    return {double(v.x), double(v.y), double(v.z)};
}

Vector minus(Vector a, Vector const& b)
{
    return {a[0] - b[0], a[1] - b[1], a[2] - b[2]};
}

Vector crossOf(Vector const& a, Vector const& b)
{
    return {a[1] * b[2] - a[2] * b[1], a[2] * b[0] - a[0] * b[2], a[0] * b[1] - a[1] * b[0]};
}

double dotOf(Vector const& a, Vector const& b)
{
    return a[0] * b[0] + a[1] * b[1] + a[2] * b[2];
}

Vector unit(Vector const& v)
{
    double const length = std::sqrt(dotOf(v, v));
    return length > 1e-12 ? Vector{v[0] / length, v[1] / length, v[2] / length} : Vector{0, 1, 0};
}

/// Twice the area vector of a planar face.
Vector areaVector(std::vector<float3> const& points, std::vector<unsigned int> const& face)
{
    Vector sum{};
    for (std::size_t k = 2; k < face.size(); ++k) {
        auto const origin = toDouble(points[face[0]]);
        auto const term =
            crossOf(minus(toDouble(points[face[k - 1]]), origin), minus(toDouble(points[face[k]]), origin));
        sum = {sum[0] + term[0], sum[1] + term[1], sum[2] + term[2]};
    }
    return sum;
}

double cornerAngle(std::vector<float3> const& points, std::vector<unsigned int> const& face, std::size_t k)
{
    auto const at = [&](std::size_t i) { return toDouble(points[face[i % face.size()]]); };
    auto const a = unit(minus(at(k + face.size() - 1), at(k)));
    auto const b = unit(minus(at(k + 1), at(k)));
    return std::acos(std::clamp(dotOf(a, b), -1.0, 1.0));
}

/// A bumpy torus of quads split into triangles where `faceSize` is 3; `stride` renumbers the points.
struct Torus {
    std::vector<float3> points;
    Polygons faces;

    Torus(unsigned int side, unsigned int faceSize, unsigned int stride)
    {
        points.resize(std::size_t(side) * side);
        auto const number = [&](unsigned int p) {
            return static_cast<unsigned int>(std::uint64_t(p) * stride % points.size());
        };
        for (unsigned int p = 0; p < points.size(); ++p) {
            float const u = 6.2831853f * float(p / side) / float(side);
            float const v = 6.2831853f * float(p % side) / float(side);
            float const r = 1 + 0.1f * std::sin(5 * u) * std::cos(3 * v);
            points[number(p)] = {(3 + r * std::cos(v)) * std::cos(u), (3 + r * std::cos(v)) * std::sin(u),
                                 r * std::sin(v)};
        }
        for (auto const& quad : support::torusFaces(side)) {
            std::vector<unsigned int> face;
            for (unsigned int const p : quad)
                face.push_back(number(p));
            if (faceSize == 3) {
                faces.push_back({face[0], face[1], face[2]});
                faces.push_back({face[0], face[2], face[3]});
            } else {
                faces.push_back(face);
            }
        }
    }
};

void expectNear(float3 const& found, Vector const& expected, double tolerance)
{
    EXPECT_NEAR(double(found.x), expected[0], tolerance);
    EXPECT_NEAR(double(found.y), expected[1], tolerance);
    EXPECT_NEAR(double(found.z), expected[2], tolerance);
}

TEST(MeshNormals, DegenerateFacesAndLonePointsGetTheFallback)
{
    std::vector<float3> const points{{0, 0, 0}, {1, 0, 0}, {0, 1, 0}, {5, 5, 5}};
    // A triangle, one of two corners, one without area, one that names no point, one of none.
    auto const object = support::mesh(points, {{0, 2, 1}, {0, 1}, {0, 0, 1}, {0, 1, 9}, {}});
    Normals faces;
    computeMeshFaceNormals(*object, faces);
    EXPECT_EQ(faces, (Normals{{0, 0, -1}, {0, 1, 0}, {0, 1, 0}, {0, 1, 0}, {0, 1, 0}}));
    Normals byArea;
    computeMeshVertexNormals(*object, false, true, byArea);
    EXPECT_EQ(byArea, (Normals{{0, 0, -1}, {0, 0, -1}, {0, 0, -1}, {0, 1, 0}})) << "no area, no weight";
}

TEST(MeshNormals, MissingOrShortArraysLeaveTheOutputUntouched)
{
    Normals const before{{7, 8, 9}};
    for (char const* name :
         {Veldrin::Geometry::sFaceOffset, Veldrin::Geometry::sFaceVertex, Veldrin::Geometry::sPointPosition}) {
        auto object = support::mesh({{0, 0, 0}, {1, 0, 0}, {0, 1, 0}}, {{0, 1, 2}});
        object->eraseProperty(name);
        Normals faces = before;
        Normals points = before;
        computeMeshFaceNormals(*object, faces);
        computeMeshVertexNormals(*object, true, true, points);
        EXPECT_EQ(faces, before) << name;
        EXPECT_EQ(points, before) << name;
    }
}

TEST(MeshNormals, AgreeWithSumsInDoubleInEveryVariantAndAreTheSameBitsOnAllThreads)
{
    // Neighbours with near numbers, and with far ones, above the number of points from which threads share the work.
    for (unsigned int const faceSize : {3u, 4u})
        for (unsigned int const stride : {1u, 7919u}) {
            Torus const torus(131, faceSize, stride);
            ASSERT_GT(torus.points.size(), kParallelMeshVertexNormalsThreshold);
            auto const object = support::mesh(torus.points, torus.faces);
            for (int variant = 0; variant < 4; ++variant) {
                bool const byAngle = variant >= 2;
                bool const byArea = variant % 2 == 1;
                std::vector<Vector> sums(torus.points.size());
                for (auto const& face : torus.faces) {
                    auto const area = areaVector(torus.points, face);
                    auto const normal = unit(area);
                    for (std::size_t k = 0; k < face.size(); ++k) {
                        double const weight = (byAngle ? cornerAngle(torus.points, face, k) : 1) *
                                              (byArea ? 0.5 * std::sqrt(dotOf(area, area)) : 1);
                        for (std::size_t i = 0; i < 3; ++i)
                            sums[face[k]][i] += weight * normal[i];
                    }
                }
                Normals first;
                support::onThreadCounts([&] {
                    Normals normals;
                    computeMeshVertexNormals(*object, byAngle, byArea, normals);
                    if (first.empty()) {
                        first = normals;
                        ASSERT_EQ(normals.size(), sums.size());
                        for (std::size_t p = 0; p < sums.size(); p += 97)
                            expectNear(normals[p], unit(sums[p]), byArea ? 2e-3 : 2e-5);
                    }
                    ASSERT_EQ(normals.size(), first.size());
                    EXPECT_EQ(std::memcmp(normals.data(), first.data(), first.size() * sizeof(float3)), 0)
                        << "variant " << variant << ", stride " << stride;
                });
            }
            Normals faces;
            computeMeshFaceNormals(*object, faces);
            for (std::size_t f = 0; f < torus.faces.size(); f += 61)
                expectNear(faces[f], unit(areaVector(torus.points, torus.faces[f])), 2e-4);
        }
}

/// Sums in single precision over the faces in their order, each normal times the face's area when asked for.
Normals summedInFaceOrder(std::vector<float3> const& points, Polygons const& faces, bool byArea)
{
    auto const unitOf = [](float3 const& v) {
        float const length = std::sqrt(v.x * v.x + v.y * v.y + v.z * v.z);
        float const scale = 1 / length;
        return length > 1.1754944e-38f ? float3{v.x * scale, v.y * scale, v.z * scale} : float3{0, 1, 0};
    };
    Normals sums;
    sums.resize(points.size());
    for (auto const& face : faces) {
        auto const at = [&](std::size_t k) { return points[face[k % face.size()]]; };
        if (face.size() < 3 || *std::max_element(face.begin(), face.end()) >= points.size())
            continue;
        float3 fan{};
        float3 loop{};
        for (std::size_t k = 2; k < face.size(); ++k)
            fan = fan + cross(at(k - 1) - at(0), at(k) - at(0));
        for (std::size_t k = 0; k < face.size(); ++k)
            loop = loop + cross(at(k), at(k + 1));
        float const area = 0.5f * std::sqrt(loop.x * loop.x + loop.y * loop.y + loop.z * loop.z);
        for (unsigned int const p : face)
            sums[p] = sums[p] + (byArea ? unitOf(fan) * area : unitOf(fan));
    }
    for (float3& sum : sums)
        sum = unitOf(sum);
    return sums;
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
                corner += pointCount;
    return faces;
}

void expectBitsOfALoopOverTheFaces(unsigned int pointCount, unsigned int spread, unsigned int faceSize)
{
    auto faces = facesAlong(pointCount, spread, faceSize);
    std::mt19937 random(spread);
    std::vector<float3> points(pointCount);
    for (float3& p : points)
        p = {float(random() % 1000) / 7, float(random() % 1000) / 7, float(random() % 1000) / 7};
    auto const object = support::mesh(points, faces);
    faces.push_back({0, 1});
    auto const ofMixedFaces = support::mesh(points, faces);
    for (int variant = 0; variant < 4; ++variant) {
        Normals expected;
        if (variant < 2)
            expected = summedInFaceOrder(points, faces, variant == 1);
        else
            computeMeshVertexNormals(*ofMixedFaces, true, variant == 3, expected);
        support::onThreadCounts([&] {
            soilFreeMemory(4 * faces.size());
            Normals normals;
            computeMeshVertexNormals(*object, variant >= 2, variant % 2 == 1, normals);
            ASSERT_EQ(normals.size(), expected.size());
            EXPECT_EQ(std::memcmp(normals.data(), expected.data(), expected.size() * sizeof(float3)), 0)
                << "variant " << variant << ", spread " << spread << " of " << pointCount;
        });
    }
}

TEST(MeshNormals, OfMessyMeshesAreTheBitsOfALoopOverTheFacesOnAllThreads)
{
    // Degenerate faces, repeated corners and points that are not there; sums that fit a cache and sums that do not, among
    // neighbours with near numbers and far ones.
    for (unsigned int const pointCount : {16389u, 131077u})
        for (unsigned int const spread : {40u, pointCount})
            for (unsigned int const faceSize : {0u, 3u, 4u})
                expectBitsOfALoopOverTheFaces(pointCount, spread, faceSize);
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

/// What the adjacency of a mesh is by definition.
struct BruteAdjacency {
    std::vector<FaceEdge> edges, pointFaces;
    std::vector<unsigned int> index;

    BruteAdjacency(unsigned int pointCount, Polygons const& faces)
    {
        auto const corner = [](std::size_t f, std::size_t k) {
            return FaceEdge{static_cast<unsigned int>(f), static_cast<unsigned int>(k)};
        };
        for (std::size_t f = 0; f < faces.size(); ++f)
            for (std::size_t k = 0; k < faces[f].size(); ++k) {
                unsigned int const a = faces[f][k];
                unsigned int const b = faces[f][(k + 1) % faces[f].size()];
                FaceEdge found;
                for (std::size_t g = 0; g < faces.size() && found.face == kInvalidIndex && a != b; ++g)
                    for (std::size_t j = 0; j < faces[g].size() && g != f; ++j)
                        if (faces[g][j] == b && faces[g][(j + 1) % faces[g].size()] == a) {
                            found = corner(g, j);
                            break;
                        }
                edges.push_back(found);
            }
        for (unsigned int p = 0; p < pointCount; ++p) {
            index.push_back(static_cast<unsigned int>(pointFaces.size()));
            for (std::size_t f = 0; f < faces.size(); ++f)
                for (std::size_t k = 0; k < faces[f].size(); ++k)
                    if (faces[f][k] == p)
                        pointFaces.push_back(corner(f, k));
        }
        index.push_back(static_cast<unsigned int>(pointFaces.size()));
    }
};

template <class T>
std::vector<T> values(Nexil::Array<T> const& array)
{
    return {array.begin(), array.end()};
}

struct Adjacency {
    Nexil::Array<FaceEdge> edges, pointFaces;
    Nexil::Array<unsigned int> index;

    bool build(Veldrin::Object const& mesh)
    {
        return buildFaceVertexAdjacency(mesh, edges, pointFaces, index, nullptr);
    }
};

TEST(FaceVertexAdjacency, IsThatOfTheDefinitionOnMeshesWithEveryKindOfEdge)
{
    unsigned int seed = 0;
    for (unsigned int const pointCount : {4u, 12u, 60u})
        for (unsigned int const faceSize : {0u, 3u, 4u}) {
            // Hubs among them: three points take a quarter of all corners, more than a small group holds.
            auto faces = support::randomFaces(pointCount, 120, faceSize, ++seed);
            for (auto& face : faces)
                for (unsigned int& p : face)
                    p %= pointCount;
            BruteAdjacency const expected(pointCount, faces);
            auto const object = support::meshOn(pointCount, faces);
            support::onThreadCounts([&] {
                Adjacency found;
                ASSERT_TRUE(found.build(*object));
                EXPECT_EQ(values(found.edges), expected.edges);
                EXPECT_EQ(values(found.pointFaces), expected.pointFaces);
                EXPECT_EQ(values(found.index), expected.index);
            });
        }
}

TEST(FaceVertexAdjacency, IsTheSameOnAllThreadsAndPairsEveryEdgeOfAClosedSurface)
{
    Torus const torus(150, 3, 7919);
    auto const object = support::mesh(torus.points, torus.faces);
    Adjacency first;
    support::onThreadCounts([&] {
        Adjacency found;
        ASSERT_TRUE(found.build(*object));
        if (first.index.empty()) {
            for (std::size_t i = 0; i < found.edges.size(); ++i) {
                FaceEdge const across = found.edges[i];
                ASSERT_NE(across.face, kInvalidIndex);
                ASSERT_EQ(found.edges[across.face * 3u + across.corner],
                          (FaceEdge{static_cast<unsigned int>(i / 3), static_cast<unsigned int>(i % 3)}));
            }
            first = found;
        }
        EXPECT_EQ(found.edges, first.edges);
        EXPECT_EQ(found.pointFaces, first.pointFaces);
        EXPECT_EQ(found.index, first.index);
    });
}

TEST(FaceVertexAdjacency, RefusesWhatIsNoMeshOfWholeFaces)
{
    auto const outOfRange = support::meshOn(3, {{0, 1, 2}, {0, 1, 3}});
    auto missing = support::meshOn(3, {{0, 1, 2}});
    missing->eraseProperty(Veldrin::Geometry::sFaceOffset);
    for (Veldrin::Object const* object : {&*outOfRange, &*missing}) {
        Adjacency found;
        found.index = {1, 2};
        EXPECT_FALSE(found.build(*object));
        EXPECT_EQ(found.index, (Nexil::Array<unsigned int>{1, 2})) << "untouched";
        EXPECT_TRUE(found.edges.empty());
    }
    Adjacency none;
    EXPECT_TRUE(none.build(*support::filled([](Veldrin::Object& object) { Veldrin::Geometry::populateMesh(object); })));
    EXPECT_EQ(none.index, (Nexil::Array<unsigned int>{0})) << "a mesh without faces or points is one";
}

TEST(FaceVertexAdjacency, OffsetsThatWrapAmongOnesThatRiseStayWithinTheirArrays)
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
    Adjacency found;
    EXPECT_FALSE(found.build(*object));
}

TEST(FaceVertexAdjacency, FansBooksAndGiantPolygonsAreNoHarderThanAGrid)
{
    constexpr unsigned int kMany = 100000;
    Polygons fan;
    Polygons book;
    for (unsigned int k = 0; k < kMany; ++k) {
        fan.push_back({0, 1 + k, 1 + (k + 1) % kMany});
        book.push_back(k % 2 == 0 ? std::vector<unsigned int>{0, 1, 2 + k} : std::vector<unsigned int>{1, 0, 2 + k});
    }
    Adjacency found;
    ASSERT_TRUE(found.build(*support::meshOn(kMany + 1, fan)));
    EXPECT_EQ(found.edges[0], (FaceEdge{kMany - 1, 2}));
    EXPECT_EQ(found.edges[2], (FaceEdge{1, 0}));
    EXPECT_EQ(found.edges[1].face, kInvalidIndex);
    ASSERT_TRUE(found.build(*support::meshOn(kMany + 2, book)));
    EXPECT_EQ(found.edges[0], (FaceEdge{1, 0})) << "the lowest that runs the other way";
    EXPECT_EQ(found.edges[3], (FaceEdge{0, 0}));
    std::vector<unsigned int> polygon(support::kGiant);
    std::iota(polygon.begin(), polygon.end(), 0u);
    auto const giant = support::meshOn(support::kGiant, {polygon});
    ASSERT_TRUE(found.build(*giant));
    EXPECT_EQ(found.edges[support::kGiant - 1].face, kInvalidIndex);
    Normals faceNormal;
    computeMeshFaceNormals(*giant, faceNormal);
    for (bool const byAngle : {false, true}) {
        Normals normals;
        computeMeshVertexNormals(*giant, byAngle, true, normals);
        EXPECT_EQ(normals.size(), support::kGiant);
        // Scaling to length 1 a second time may change the last bit.
        expectNear(normals[support::kGiant / 2], {faceNormal[0].x, faceNormal[0].y, faceNormal[0].z}, 1e-6);
    }
}

/// Groups by flood over the face-vertices of each point, in the order of their first face-vertex.
std::vector<unsigned int> floodGroups(Polygons const& faces, Adjacency const& adjacency,
                                      std::vector<bool> const& isSmooth)
{
    std::vector<std::size_t> first{0};
    for (auto const& face : faces)
        first.push_back(first.back() + face.size());
    std::vector<unsigned int> groups(first.back(), kInvalidIndex);
    std::vector<std::vector<std::size_t>> linked(first.back());
    for (std::size_t f = 0; f < faces.size(); ++f)
        for (std::size_t k = 0; k < faces[f].size(); ++k) {
            std::size_t const i = first[f] + k;
            if (!isSmooth[i])
                continue;
            FaceEdge const across = adjacency.edges[i];
            std::size_t const behind = first[across.face] + (across.corner + 1) % faces[across.face].size();
            linked[i].push_back(behind);
            linked[behind].push_back(i);
        }
    unsigned int count = 0;
    for (std::size_t start = 0; start < groups.size(); ++start) {
        std::vector<std::size_t> open{start};
        bool isNew = false;
        while (!open.empty()) {
            std::size_t const i = open.back();
            open.pop_back();
            if (groups[i] != kInvalidIndex)
                continue;
            groups[i] = count;
            isNew = true;
            open.insert(open.end(), linked[i].begin(), linked[i].end());
        }
        count += isNew ? 1 : 0;
    }
    return groups;
}

TEST(NormalsTopology, GroupsAreThoseThatAFloodAcrossSmoothEdgesFinds)
{
    for (float const maxAngle : {0.0f, 0.05f, 0.2f, 4.0f}) {
        Torus torus(24, 4, 5);
        torus.faces.erase(torus.faces.begin() + 40, torus.faces.begin() + 43);
        std::reverse(torus.faces[100].begin(), torus.faces[100].end());
        torus.faces.push_back(torus.faces[10]);
        auto const object = support::mesh(torus.points, torus.faces);
        Adjacency adjacency;
        ASSERT_TRUE(adjacency.build(*object));
        std::vector<bool> isSmooth;
        for (std::size_t f = 0; f < torus.faces.size(); ++f)
            for (std::size_t k = 0; k < 4; ++k) {
                FaceEdge const across = adjacency.edges[4 * f + k];
                bool const isManifold = across.face != kInvalidIndex &&
                                        adjacency.edges[4 * across.face + across.corner] ==
                                            FaceEdge{static_cast<unsigned int>(f), static_cast<unsigned int>(k)};
                isSmooth.push_back(isManifold &&
                                   std::acos(std::clamp(dotOf(unit(areaVector(torus.points, torus.faces[f])),
                                                              unit(areaVector(torus.points, torus.faces[across.face]))),
                                                        -1.0, 1.0)) < double(maxAngle));
            }
        auto const expected = floodGroups(torus.faces, adjacency, isSmooth);
        support::onThreadCounts([&] {
            Nexil::Array<unsigned int> groups;
            unsigned int count = 0;
            computeMeshNormalsTopology(*object, {}, maxAngle, groups, count, nullptr);
            EXPECT_EQ(values(groups), expected) << maxAngle;
            EXPECT_EQ(count, *std::max_element(expected.begin(), expected.end()) + 1) << maxAngle;
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
