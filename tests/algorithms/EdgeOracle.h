#pragma once

#include <support/Geometry.h>

#include <veldrin/geometry/FaceEdge.h>

#include <algorithm>
#include <map>
#include <random>
#include <set>
#include <utility>

/// Edges of a mesh the slow and simple way, and meshes that have much to get wrong.
namespace support {

using Veldrin::Geometry::Mesh::FaceEdge;

/// The sides of faces that lie on an edge: those from its lower point to its upper one, and those back, each in order.
struct EdgeUses {
    std::vector<FaceEdge> forward, backward;

    [[nodiscard]] std::set<unsigned int> faces() const
    {
        std::set<unsigned int> found;
        for (auto const* uses : {&forward, &backward})
            for (FaceEdge const& use : *uses)
                found.insert(use.face);
        return found;
    }
};
using EdgeMap = std::map<std::pair<unsigned int, unsigned int>, EdgeUses>;

inline EdgeMap edgesOf(unsigned int pointCount, Polygons const& faces)
{
    EdgeMap edges;
    for (unsigned int f = 0; f < faces.size(); ++f)
        for (unsigned int k = 0; k < faces[f].size(); ++k) {
            unsigned int const a = faces[f][k];
            unsigned int const b = faces[f][(k + 1) % faces[f].size()];
            if (a == b || a >= pointCount || b >= pointCount)
                continue;
            EdgeUses& uses = edges[std::minmax(a, b)];
            (a < b ? uses.forward : uses.backward).push_back({f, k});
        }
    return edges;
}

/// Faces of one size, or of all up to 7 corners when `faceSize` is 0, over few enough points that edges meet in every way:
/// shared, repeated within a face, run both ways, at hubs. Every twentieth face may name a point that is not there.
inline Polygons randomFaces(unsigned int pointCount, std::size_t faceCount, unsigned int faceSize, unsigned int seed)
{
    std::mt19937 random(seed);
    auto const below = [&](unsigned int count) { return static_cast<unsigned int>(random() % count); };
    Polygons faces(faceCount);
    for (auto& face : faces) {
        face.resize(faceSize != 0 ? faceSize : below(8));
        unsigned int const top = below(20) == 0 ? pointCount + 2 : pointCount;
        for (unsigned int& corner : face)
            corner = below(4) == 0 ? below(3) : below(top);
    }
    return faces;
}

/// `side` x `side` quads that wrap around in both directions; neighbours have numbers `stride` apart, modulo the points.
inline Polygons torusFaces(unsigned int side, unsigned int stride = 1)
{
    auto const number = [&](unsigned int row, unsigned int column) {
        std::uint64_t const point = std::uint64_t(row % side) * side + column % side;
        return static_cast<unsigned int>(point * stride % (side * side));
    };
    Polygons faces;
    for (unsigned int r = 0; r < side; ++r)
        for (unsigned int c = 0; c < side; ++c)
            faces.push_back({number(r, c), number(r + 1, c), number(r + 1, c + 1), number(r, c + 1)});
    return faces;
}

/// A mesh whose points stand anywhere: on a curve that no three of them share a line on.
inline Nexil::MutablePtr<Veldrin::Object> meshOn(unsigned int pointCount, Polygons const& faces)
{
    std::vector<Veldrin::Math::float3> points(pointCount);
    for (unsigned int p = 0; p < pointCount; ++p) {
        float const t = static_cast<float>(p) / static_cast<float>(pointCount);
        points[p] = {t, t * t, t * t * t};
    }
    return mesh(points, faces);
}

} // namespace support
