#include <veldrin/algorithms/MeshNormals.h>

#include <nexil/parallel/Parallel.h>
#include <veldrin/algorithms/internal/FaceOrderSums.h>
#include <veldrin/algorithms/internal/PendingOutput.h>
#include <veldrin/algorithms/internal/VectorClones.h>

#include <algorithm>
#include <array>

namespace Veldrin::GeometryAlgorithms {

namespace {

    namespace grain {
        constexpr std::size_t kPoints = 1024;
    } // namespace grain

    /// Scales each sum to length 1, a block at a time.
    VELDRIN_VECTOR_CLONES void normalize(Math::float3* sums, std::size_t count) noexcept
    {
        std::array<float, kBlockSize> x, y, z;
        for (std::size_t begin = 0; begin < count; begin += kBlockSize) {
            std::size_t const size = std::min(kBlockSize, count - begin);
            for (std::size_t i = 0; i < size; ++i) {
                x[i] = sums[begin + i].x;
                y[i] = sums[begin + i].y;
                z[i] = sums[begin + i].z;
            }
            unitsOrFallback(x.data(), y.data(), z.data(), size);
            for (std::size_t i = 0; i < size; ++i)
                sums[begin + i] = {x[i], y[i], z[i]};
        }
    }

    template <bool isAngleWeighted, bool isAreaWeighted>
    void sumNormals(Geometry::MeshFaces const& faces, Positions const& positions, Math::float3* sums)
    {
        std::size_t const threadCount =
            faces.pointCount() < kParallelMeshVertexNormalsThreshold ? 1 : Nexil::parallel::threadCount();
        faces.withRanges([&]<class Ranges>(Ranges const& ranges) {
            FaceOrderSums<isAngleWeighted, isAreaWeighted, Ranges> faceOrderSums(faces, positions, ranges, sums);
            if (threadCount == 1)
                faceOrderSums.addSerially();
            else
                faceOrderSums.addInParallel(threadCount);
        });
    }

} // namespace

void computeMeshVertexNormals(Object const& mesh, bool angleWeighted, bool areaWeighted,
                              Nexil::Array<Math::float3>& normals)
{
    Geometry::MeshFaces faces;
    auto const positionArray = Geometry::dataOf<Math::float3>(mesh, Geometry::sPointPosition);
    if (!faces.read(mesh) || !positionArray || positionArray->size() < faces.pointCount())
        return;
    Positions const positions{positionArray->data(), faces.pointCount()};
    PendingOutput<Math::float3> output(normals, faces.pointCount());
    Math::float3* const sums = output.data();
    if (angleWeighted && areaWeighted)
        sumNormals<true, true>(faces, positions, sums);
    else if (angleWeighted)
        sumNormals<true, false>(faces, positions, sums);
    else if (areaWeighted)
        sumNormals<false, true>(faces, positions, sums);
    else
        sumNormals<false, false>(faces, positions, sums);
    Nexil::parallel::forRange(faces.pointCount(), grain::kPoints,
                              [&](std::size_t begin, std::size_t end) { normalize(sums + begin, end - begin); });
    output.commit();
}

} // namespace Veldrin::GeometryAlgorithms
