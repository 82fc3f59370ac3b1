#pragma once

#include <cstddef>
#include <cstdint>
#include <string>
#include <vector>

namespace compare {

struct Point {
    float x, y, z;
};

/// A mesh of triangles or of quads in plain arrays, which every side of the comparison starts from.
struct PlainMesh {
    std::string order;
    std::vector<Point> points;
    std::vector<std::uint32_t> corners;
    /// Face f has the corners [offsets[f], offsets[f + 1]).
    std::vector<std::uint32_t> offsets;
    std::uint32_t faceSize = 3;

    [[nodiscard]] std::size_t faceCount() const { return corners.size() / faceSize; }
};

/// The order in which points and faces are stored.
enum class Order {
    Natural,        ///< row by row
    PointsPermuted, ///< points in random order, faces row by row
    Shuffled        ///< both in random order
};

/// A closed torus of rows x columns quads, or twice as many triangles, displaced by waves: no two faces are alike.
[[nodiscard]] PlainMesh torus(std::uint32_t rows, std::uint32_t columns, std::uint32_t faceSize);

/// The same mesh in another order.
[[nodiscard]] PlainMesh reordered(PlainMesh mesh, Order order);

} // namespace compare
