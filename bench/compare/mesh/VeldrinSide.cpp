#include "Side.h"

#include <veldrin/algorithms/FaceVertexAdjacency.h>
#include <veldrin/algorithms/MeshInvariants.h>
#include <veldrin/algorithms/MeshNormals.h>
#include <veldrin/geometry/Population.h>

#include <tbb/global_control.h>

#include <algorithm>

namespace compare {

namespace {

    namespace Geometry = Veldrin::Geometry;
    namespace Algorithms = Veldrin::GeometryAlgorithms;
    using Veldrin::Math::float3;

    template <class T, class Source>
    Nexil::Ptr<Nexil::Array<T>> arrayOf(std::vector<Source> const& values)
    {
        static_assert(sizeof(T) == sizeof(Source));
        return Nexil::makePtr<Nexil::Array<T>>(
            Nexil::Array<T>(reinterpret_cast<T const*>(values.data()), values.size()));
    }

    class VeldrinSide : public Side {
    public:
        std::string name() const override { return "Veldrin"; }

        void prepare(PlainMesh const& mesh) override
        {
            mesh_ = Veldrin::createObject();
            Geometry::populateMesh(arrayOf<float3>(mesh.points), arrayOf<unsigned int>(mesh.corners),
                                   arrayOf<unsigned int>(mesh.offsets), *mesh_);
        }

        bool has(Kernel) const override { return true; }

        void run(Kernel kernel, unsigned int threadCount) override
        {
            tbb::global_control const limit(tbb::global_control::max_allowed_parallelism, threadCount);
            switch (kernel) {
            case Kernel::FaceNormals: return Algorithms::computeMeshFaceNormals(*mesh_, normals_);
            case Kernel::UniformNormals: return Algorithms::computeMeshVertexNormals(*mesh_, false, false, normals_);
            case Kernel::AreaNormals: return Algorithms::computeMeshVertexNormals(*mesh_, false, true, normals_);
            case Kernel::AngleNormals: return Algorithms::computeMeshVertexNormals(*mesh_, true, false, normals_);
            case Kernel::Adjacency:
                (void)Algorithms::buildFaceVertexAdjacency(*mesh_, adjacentEdges_, pointFaces_, pointFaceIndex_,
                                                           nullptr);
                return;
            case Kernel::Components: number_ = Geometry::Mesh::connectedComponents(*mesh_); return;
            case Kernel::Euler: number_ = Geometry::Mesh::eulerCharacteristic(*mesh_); return;
            }
        }

        Result result(Kernel kernel) override
        {
            if (kernel <= Kernel::AngleNormals)
                return {{reinterpret_cast<Point const*>(normals_.data()), normals_.size()}, 0};
            if (kernel == Kernel::Adjacency)
                return {{}, std::count_if(adjacentEdges_.begin(), adjacentEdges_.end(), [](auto const& edge) {
                            return edge.face != Geometry::kInvalidIndex;
                        })};
            return {{}, number_};
        }

    private:
        Nexil::MutablePtr<Veldrin::Object> mesh_;
        Nexil::Array<float3> normals_;
        Nexil::Array<Geometry::Mesh::FaceEdge> adjacentEdges_;
        Nexil::Array<Geometry::Mesh::FaceEdge> pointFaces_;
        Nexil::Array<unsigned int> pointFaceIndex_;
        std::int64_t number_ = 0;
    };

} // namespace

std::unique_ptr<Side> makeVeldrinSide()
{
    return std::make_unique<VeldrinSide>();
}

} // namespace compare
