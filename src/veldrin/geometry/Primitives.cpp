#include <veldrin/geometry/Population.h>

#include <nexil/parallel/Parallel.h>
#include <veldrin/geometry/GeoPropertyCreation.h>
#include <veldrin/object/Properties.h>

#include <algorithm>
#include <cstddef>
#include <iterator>

namespace Veldrin::Geometry {

namespace {

    namespace parallel = Nexil::parallel;

    namespace grain {
        // About half a megabyte written per task.
        constexpr std::size_t kPlanePoints = 32768;
        constexpr std::size_t kPlaneOffsets = 131072;
    } // namespace grain

    constexpr unsigned int kCubeCorners[] = {
        0, 1, 2, 3, // -y
        4, 7, 6, 5, // +y
        2, 6, 7, 3, // +z
        0, 4, 5, 1, // -z
        4, 0, 3, 7, // -x
        1, 5, 6, 2, // +x
    };
    constexpr Math::float3 kCubeNormals[] = {{0, -1, 0}, {0, 1, 0}, {0, 0, 1}, {0, 0, -1}, {-1, 0, 0}, {1, 0, 0}};
    constexpr unsigned int kCubeFaceCount = 6;

    constexpr unsigned int kSphereQuadCount = 15;
    constexpr unsigned int kSphereTriangleCount = 10;

    constexpr Math::float3 kSpherePoints[] = {
        {0.181636f, -0.809017f, -0.559017f},
        {-0.475528f, -0.809017f, -0.345492f},
        {-0.475528f, -0.809017f, 0.345491f},
        {0.181636f, -0.809017f, 0.559017f},
        {0.587785f, -0.809017f, 0},
        {0.293893f, -0.309017f, -0.904509f},
        {-0.769421f, -0.309017f, -0.559017f},
        {-0.769421f, -0.309017f, 0.559017f},
        {0.293893f, -0.309017f, 0.904509f},
        {0.951057f, -0.309017f, 0},
        {0.293893f, 0.309017f, -0.904509f},
        {-0.769421f, 0.309017f, -0.559017f},
        {-0.769421f, 0.309017f, 0.559017f},
        {0.293893f, 0.309017f, 0.904509f},
        {0.951057f, 0.309017f, 0},
        {0.181636f, 0.809017f, -0.559017f},
        {-0.475528f, 0.809017f, -0.345492f},
        {-0.475528f, 0.809017f, 0.345491f},
        {0.181636f, 0.809017f, 0.559017f},
        {0.587785f, 0.809017f, 0},
        {0, -1, 0},
        {0, 1, 0},
    };

    // Smoothed by hand, not the unit positions.
    constexpr Math::float3 kSphereNormals[] = {
        {0.215697f, -0.716086f, -0.663849f},
        {-0.564703f, -0.716086f, -0.410281f},
        {-0.564703f, -0.716086f, 0.410281f},
        {0.215697f, -0.716086f, 0.663849f},
        {0.698012f, -0.716086f, 0},
        {0.296994f, -0.276231f, -0.914052f},
        {-0.777539f, -0.276231f, -0.564915f},
        {-0.777539f, -0.276231f, 0.564915f},
        {0.296994f, -0.276231f, 0.914052f},
        {0.961091f, -0.276231f, 0},
        {0.296994f, 0.276231f, -0.914052f},
        {-0.777539f, 0.276231f, -0.564915f},
        {-0.777539f, 0.276231f, 0.564915f},
        {0.296994f, 0.276231f, 0.914052f},
        {0.961091f, 0.276231f, 0},
        {0.215697f, 0.716086f, -0.663849f},
        {-0.564703f, 0.716086f, -0.410281f},
        {-0.564703f, 0.716086f, 0.410281f},
        {0.215697f, 0.716086f, 0.663849f},
        {0.698012f, 0.716086f, 0},
        {0, -1, 0},
        {0, 1, 0},
    };

    // clang-format off
    constexpr unsigned int kSphereCorners[] = {
        // quads, ring by ring
        0, 1, 6, 5, 1, 2, 7, 6, 2, 3, 8, 7, 3, 4, 9, 8, 4, 0, 5, 9,
        5, 6, 11, 10, 6, 7, 12, 11, 7, 8, 13, 12, 8, 9, 14, 13, 9, 5, 10, 14,
        10, 11, 16, 15, 11, 12, 17, 16, 12, 13, 18, 17, 13, 14, 19, 18, 14, 10, 15, 19,
        // triangles around the lower and the upper pole
        1, 0, 20, 2, 1, 20, 3, 2, 20, 4, 3, 20, 0, 4, 20,
        15, 16, 21, 16, 17, 21, 17, 18, 21, 18, 19, 21, 19, 15, 21,
    };
    // clang-format on

    template <class T, std::size_t Count>
    Nexil::Ptr<Nexil::Array<T>> arrayOf(T const (&values)[Count])
    {
        return Nexil::makePtr<Nexil::Array<T>>(values, Count);
    }

    /// A shared array of `count` elements that fill(array) writes, each of them.
    template <class T, class Fill>
    Nexil::Ptr<Nexil::Array<T>> arrayBy(std::size_t count, Fill const& fill)
    {
        auto array = Nexil::makeMutable<Nexil::Array<T>>();
        Nexil::Internal::resizeUninitialized(*array, count);
        fill(*array);
        return array;
    }

    // Corners are counted in 32 bits: 4 n^2 < 2^32.
    constexpr unsigned int kMostPlaneSubdivisions = 32767;

    Nexil::Ptr<Nexil::Array<Math::float3>> planePoints(float size, std::size_t n)
    {
        float const half = size / 2;
        float const step = size / static_cast<float>(n);
        return arrayBy<Math::float3>((n + 1) * (n + 1), [&](Nexil::Array<Math::float3>& points) {
            std::size_t const rowGrain = grain::kPlanePoints / (n + 1) + 1;
            parallel::forRange(n + 1, rowGrain, [&](std::size_t begin, std::size_t end) {
                for (std::size_t j = begin; j < end; ++j) {
                    float const z = half + static_cast<float>(j) * -step;
                    Math::float3* const row = points.data() + j * (n + 1);
                    for (std::size_t i = 0; i <= n; ++i)
                        row[i] = {-half + static_cast<float>(i) * step, 0, z};
                }
            });
        });
    }

    Nexil::Ptr<Nexil::Array<unsigned int>> planeCorners(std::size_t n)
    {
        return arrayBy<unsigned int>(4 * n * n, [&](Nexil::Array<unsigned int>& corners) {
            std::size_t const rowGrain = grain::kPlanePoints / n + 1;
            parallel::forRange(n, rowGrain, [&](std::size_t begin, std::size_t end) {
                for (std::size_t j = begin; j < end; ++j) {
                    unsigned int* corner = corners.data() + 4 * n * j;
                    auto const width = static_cast<unsigned int>(n + 1);
                    auto const first = static_cast<unsigned int>(j) * width;
                    for (unsigned int a = first; a < first + width - 1; ++a) {
                        *corner++ = a;
                        *corner++ = a + 1;
                        *corner++ = a + 1 + width;
                        *corner++ = a + width;
                    }
                }
            });
        });
    }

    Nexil::Ptr<Nexil::Array<unsigned int>> planeOffsets(std::size_t n)
    {
        return arrayBy<unsigned int>(n * n + 1, [&](Nexil::Array<unsigned int>& offsets) {
            parallel::forRange(n * n + 1, grain::kPlaneOffsets, [&](std::size_t begin, std::size_t end) {
                for (std::size_t face = begin; face < end; ++face)
                    offsets[face] = static_cast<unsigned int>(4 * face);
            });
        });
    }

} // namespace

void populateCubeMesh(float size, Object& mesh)
{
    float const h = size * 0.5f;
    Math::float3 const points[] = {{-h, -h, -h}, {h, -h, -h}, {h, -h, h}, {-h, -h, h},
                                   {-h, h, -h},  {h, h, -h},  {h, h, h},  {-h, h, h}};
    unsigned int offsets[kCubeFaceCount + 1];
    unsigned int faceOfCorner[4 * kCubeFaceCount];
    for (unsigned int face = 0; face <= kCubeFaceCount; ++face)
        offsets[face] = 4 * face;
    for (unsigned int corner = 0; corner < std::size(faceOfCorner); ++corner)
        faceOfCorner[corner] = corner / 4;

    auto const rangeName = getGeoPropRangeName(sFaceVertexNormal);
    auto range = createObject();
    populateRangeGeoProperty(arrayOf(faceOfCorner), sFaceVertexComp, *range);
    auto normals = createObject();
    createDataGeoProperty(Math::float3{}, rangeName, arrayOf(kCubeNormals), *normals);

    Object made;
    populateMesh(arrayOf(points), arrayOf(kCubeCorners), arrayOf(offsets), made);
    setProperty(made, rangeName, std::move(range));
    setProperty(made, sFaceVertexNormal, std::move(normals));
    moveProperties(made, mesh);
}

bool populatePlaneMesh(float size, unsigned int subdivisions, Object& mesh)
{
    if (subdivisions > kMostPlaneSubdivisions)
        return false;
    std::size_t const n = std::max(subdivisions, 1u);
    auto points = planePoints(size, n);
    auto corners = planeCorners(n);
    return populateMesh(std::move(points), std::move(corners), planeOffsets(n), mesh);
}

void populateSphereMesh(float radius, Object& mesh)
{
    Math::float3 points[std::size(kSpherePoints)];
    Math::float3 normals[std::size(kSphereNormals)];
    for (std::size_t i = 0; i < std::size(points); ++i) {
        points[i] = kSpherePoints[i] * radius;
        normals[i] = radius < 0 ? kSphereNormals[i] * -1.0f : kSphereNormals[i];
    }
    unsigned int offsets[kSphereQuadCount + kSphereTriangleCount + 1] = {0};
    for (unsigned int face = 0; face < kSphereQuadCount + kSphereTriangleCount; ++face)
        offsets[face + 1] = offsets[face] + (face < kSphereQuadCount ? 4 : 3);

    auto normalProperty = createObject();
    createDataGeoProperty(Math::float3{}, sPointComp, arrayOf(normals), *normalProperty);

    Object made;
    populateMesh(arrayOf(points), arrayOf(kSphereCorners), arrayOf(offsets), made);
    setProperty(made, sPointNormal, std::move(normalProperty));
    moveProperties(made, mesh);
}

} // namespace Veldrin::Geometry
