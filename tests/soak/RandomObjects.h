#pragma once

#include <nexil/Array.h>
#include <nexil/Ptr.h>
#include <veldrin/object/Object.h>

#include <cstdint>
#include <random>

namespace soak {

using Random = std::mt19937_64;
using Objects = Nexil::Array<Nexil::Ptr<Veldrin::Object>>;

/// An object that has to be valid, and of which kind.
struct JudgedObject {
    enum class Kind { Mesh, PointCloud, Strands, Volume };
    Kind kind;
    Nexil::Ptr<Veldrin::Object> object;
};

[[nodiscard]] JudgedObject randomGeometry(Random& random);

/// A bag of properties of any types that a stream can hold, objects and shared values within it.
/// depth: how many objects may lie in each other.
[[nodiscard]] Nexil::Ptr<Veldrin::Object> randomObject(Random& random, int depth);

} // namespace soak
