#include <veldrin/algorithms/MeshNormals.h>

#include <nexil/parallel/Parallel.h>
#include <veldrin/algorithms/internal/FaceNormalBlock.h>
#include <veldrin/algorithms/internal/PendingOutput.h>

namespace Veldrin::GeometryAlgorithms {

namespace {

    namespace grain {
        constexpr std::size_t kFaces = 1024;
    } // namespace grain

} // namespace

void computeMeshFaceNormals(Object const& mesh, Nexil::Array<Math::float3>& normals)
{
    Geometry::MeshFaces faces;
    auto const positionArray = Geometry::dataOf<Math::float3>(mesh, Geometry::sPointPosition);
    if (!faces.read(mesh) || !positionArray || positionArray->size() < faces.pointCount())
        return;
    Positions const positions{positionArray->data(), faces.pointCount()};
    unsigned int const* const points = faces.points();
    PendingOutput<Math::float3> output(normals, faces.faceCount());
    faces.withRanges([&, out = output.data()]<class Ranges>(Ranges const& ranges) {
        Nexil::parallel::forRange(faces.faceCount(), grain::kFaces, [&](std::size_t begin, std::size_t end) {
            FaceNormalBlock<false, Ranges> block;
            for (std::size_t next = begin; begin < end; begin = next) {
                next = std::min(begin + block.kSize, end);
                block.compute(positions, points, ranges, begin, next);
                for (std::size_t f = begin; f < next; ++f)
                    out[f] = block[f - begin];
            }
        });
    });
    output.commit();
}

} // namespace Veldrin::GeometryAlgorithms
