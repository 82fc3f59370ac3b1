#pragma once

#include <nexil/Array.h>
#include <veldrin/geometry/Population.h>
#include <veldrin/io/ObjectStream.h>
#include <veldrin/object/Object.h>

#include <cmath>
#include <cstdint>
#include <cstdlib>
#include <random>
#include <utility>
#include <vector>

/// The meshes that the stream's benchmarks write: as flat arrays and as a geometry over the same arrays.
namespace bench {

struct FlatMesh {
    std::vector<Veldrin::Math::float3> positions;
    std::vector<unsigned int> faceVertex;
    std::vector<unsigned int> faceOffset;

    [[nodiscard]] std::size_t byteSize() const
    {
        return positions.size() * sizeof(positions[0]) + (faceVertex.size() + faceOffset.size()) * sizeof(unsigned int);
    }
};

/// A closed torus grid of side * side quads, displaced, its points in random order: in natural order the indices compress
/// 90 times and flatter every writer.
inline FlatMesh permutedTorus(unsigned int side)
{
    FlatMesh mesh;
    std::size_t const count = std::size_t(side) * side;
    std::vector<unsigned int> place(count);
    for (std::size_t i = 0; i < count; ++i)
        place[i] = static_cast<unsigned int>(i);
    std::mt19937 random(1);
    for (std::size_t i = count; i > 1; --i)
        std::swap(place[i - 1], place[random() % i]);

    mesh.positions.resize(count);
    mesh.faceVertex.reserve(count * 4);
    mesh.faceOffset.reserve(count + 1);
    mesh.faceOffset.push_back(0);
    constexpr float kTurn = 6.2831853f;
    for (unsigned int j = 0; j < side; ++j)
        for (unsigned int i = 0; i < side; ++i) {
            float const u = kTurn * static_cast<float>(i) / static_cast<float>(side);
            float const v = kTurn * static_cast<float>(j) / static_cast<float>(side);
            float const radius = 0.3f + 0.02f * std::sin(40 * u) * std::cos(30 * v);
            auto at = [&](unsigned int a, unsigned int b) { return place[std::size_t(b % side) * side + a % side]; };
            mesh.positions[at(i, j)] = {(1 + radius * std::cos(v)) * std::cos(u), radius * std::sin(v),
                                        (1 + radius * std::cos(v)) * std::sin(u)};
            mesh.faceVertex.insert(mesh.faceVertex.end(), {at(i, j), at(i + 1, j), at(i + 1, j + 1), at(i, j + 1)});
            mesh.faceOffset.push_back(static_cast<unsigned int>(mesh.faceVertex.size()));
        }
    return mesh;
}

template <class T>
Nexil::Ptr<Nexil::Array<T>> arrayOf(std::vector<T> const& values)
{
    return Nexil::makePtr<Nexil::Array<T>>(values.data(), values.size());
}

inline Nexil::Ptr<Veldrin::Object> geometryOf(FlatMesh const& mesh)
{
    auto object = Veldrin::createObject();
    Veldrin::Geometry::populateMesh(arrayOf(mesh.positions), arrayOf(mesh.faceVertex), arrayOf(mesh.faceOffset),
                                    *object);
    return object;
}

} // namespace bench
