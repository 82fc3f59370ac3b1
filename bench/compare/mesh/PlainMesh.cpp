#include "PlainMesh.h"

#include <algorithm>
#include <cmath>
#include <numbers>
#include <numeric>
#include <random>

namespace compare {

namespace {

    std::vector<std::uint32_t> permutation(std::size_t count, std::uint32_t seed)
    {
        std::vector<std::uint32_t> order(count);
        std::iota(order.begin(), order.end(), 0u);
        std::shuffle(order.begin(), order.end(), std::mt19937(seed));
        return order;
    }

} // namespace

PlainMesh torus(std::uint32_t rows, std::uint32_t columns, std::uint32_t faceSize)
{
    PlainMesh mesh;
    mesh.faceSize = faceSize;
    mesh.points.reserve(std::size_t(rows) * columns);
    for (std::uint32_t r = 0; r < rows; ++r)
        for (std::uint32_t c = 0; c < columns; ++c) {
            double const u = 2 * std::numbers::pi * r / rows;
            double const v = 2 * std::numbers::pi * c / columns;
            double const tube = 1 + 0.05 * std::sin(17 * u) * std::cos(23 * v);
            mesh.points.push_back({static_cast<float>((3 + tube * std::cos(v)) * std::cos(u)),
                                   static_cast<float>((3 + tube * std::cos(v)) * std::sin(u)),
                                   static_cast<float>(tube * std::sin(v))});
        }
    mesh.corners.reserve(std::size_t(rows) * columns * (faceSize == 3 ? 6 : 4));
    auto const at = [&](std::uint32_t r, std::uint32_t c) { return r % rows * columns + c % columns; };
    for (std::uint32_t r = 0; r < rows; ++r)
        for (std::uint32_t c = 0; c < columns; ++c) {
            std::uint32_t const quad[] = {at(r, c), at(r + 1, c), at(r + 1, c + 1), at(r, c + 1)};
            if (faceSize == 4)
                mesh.corners.insert(mesh.corners.end(), quad, quad + 4);
            else
                mesh.corners.insert(mesh.corners.end(), {quad[0], quad[1], quad[2], quad[0], quad[2], quad[3]});
        }
    for (std::size_t f = 0; f <= mesh.faceCount(); ++f)
        mesh.offsets.push_back(static_cast<std::uint32_t>(f) * faceSize);
    mesh.order = "natural";
    return mesh;
}

PlainMesh reordered(PlainMesh mesh, Order order)
{
    if (order == Order::Natural)
        return mesh;
    auto const newIndex = permutation(mesh.points.size(), 1);
    std::vector<Point> points(mesh.points.size());
    for (std::size_t p = 0; p < points.size(); ++p)
        points[newIndex[p]] = mesh.points[p];
    mesh.points = std::move(points);
    for (auto& corner : mesh.corners)
        corner = newIndex[corner];
    mesh.order = "points permuted";
    if (order == Order::Shuffled) {
        auto const source = permutation(mesh.faceCount(), 2);
        std::vector<std::uint32_t> corners(mesh.corners.size());
        for (std::size_t f = 0; f < source.size(); ++f)
            std::copy_n(&mesh.corners[std::size_t(source[f]) * mesh.faceSize], mesh.faceSize,
                        &corners[f * mesh.faceSize]);
        mesh.corners = std::move(corners);
        mesh.order = "points and faces shuffled";
    }
    return mesh;
}

} // namespace compare
