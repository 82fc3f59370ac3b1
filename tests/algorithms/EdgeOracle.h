#pragma once

#include <support/Geometry.h>

#include <algorithm>
#include <map>
#include <random>
#include <set>
#include <utility>

/// Edges of a mesh the slow and simple way, and meshes that have much to get wrong.
namespace support {

/// Which faces use an edge, and in which directions.
struct EdgeUses {
    std::set<std::size_t> faces;
    bool isForward = false;
    bool isBackward = false;
};
using EdgeMap = std::map<std::pair<unsigned int, unsigned int>, EdgeUses>;

inline EdgeMap edgesOf(unsigned int pointCount, Polygons const& faces)
{
    EdgeMap edges;
    for (std::size_t f = 0; f < faces.size(); ++f)
        for (std::size_t k = 0; k < faces[f].size(); ++k) {
            unsigned int const a = faces[f][k];
            unsigned int const b = faces[f][(k + 1) % faces[f].size()];
            if (a == b || a >= pointCount || b >= pointCount)
                continue;
            EdgeUses& uses = edges[std::minmax(a, b)];
            uses.faces.insert(f);
            (a < b ? uses.isForward : uses.isBackward) = true;
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

/// `side` x `side` quads that wrap around in both directions.
inline Polygons torusFaces(unsigned int side)
{
    Polygons faces;
    for (unsigned int r = 0; r < side; ++r)
        for (unsigned int c = 0; c < side; ++c) {
            unsigned int const nextRow = (r + 1) % side;
            unsigned int const nextColumn = (c + 1) % side;
            faces.push_back({r * side + c, nextRow * side + c, nextRow * side + nextColumn, r * side + nextColumn});
        }
    return faces;
}

/// Corners of the largest face, points of the longest strand; fewer under sanitizers, which take ten times as long.
#if defined(__SANITIZE_ADDRESS__) || defined(__SANITIZE_THREAD__)
inline constexpr unsigned int kGiant = 1000000;
#else
inline constexpr unsigned int kGiant = 10000000;
#endif

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
