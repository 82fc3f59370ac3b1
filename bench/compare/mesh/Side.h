#pragma once

#include "PlainMesh.h"

#include <array>
#include <cstdint>
#include <memory>
#include <span>
#include <string>
#include <vector>

namespace compare {

/// What is measured. Every side computes the same from the same mesh.
enum class Kernel {
    FaceNormals,
    UniformNormals, ///< at points, from face normals that are computed with them
    AreaNormals,    ///< weighted by area
    AngleNormals,   ///< weighted by corner angle
    Adjacency,      ///< across edges and around points; of a peer, building its mesh
    Components,
    Euler ///< from indices: of a peer, building its mesh and counting
};

inline constexpr std::array kKernels{Kernel::FaceNormals,  Kernel::UniformNormals, Kernel::AreaNormals,
                                     Kernel::AngleNormals, Kernel::Adjacency,      Kernel::Components,
                                     Kernel::Euler};

/// What came out: normals, or a number.
struct Result {
    std::span<Point const> normals;
    /// Adjacency: corners with a face across their edge. Components: how many. Euler: the characteristic.
    std::int64_t number = 0;
};

/// One library, or the plain loops, used as its own examples use it. What a caller would keep from one call to the next
/// (the mesh itself, room for results) is made before and not measured.
class Side {
public:
    virtual ~Side() = default;
    [[nodiscard]] virtual std::string name() const = 0;
    virtual void prepare(PlainMesh const& mesh) = 0;
    [[nodiscard]] virtual bool has(Kernel kernel) const = 0;
    /// Runs the kernel on one thread, or on `threadCount` where the side can. This is what is measured.
    virtual void run(Kernel kernel, unsigned int threadCount) = 0;
    /// What the last run of a kernel gave; not measured.
    virtual Result result(Kernel kernel) = 0;
};

std::unique_ptr<Side> makeVeldrinSide();
std::unique_ptr<Side> makeFlatSide();
std::unique_ptr<Side> makeCgalSide();
std::unique_ptr<Side> makeOpenMeshSide();
std::unique_ptr<Side> makeMeshoptimizerSide();

} // namespace compare
