#include "Side.h"

#include <meshoptimizer.h>

namespace compare {

namespace {

    /// It has one of the kernels, for triangles.
    class MeshoptimizerSide : public Side {
    public:
        std::string name() const override { return "meshoptimizer"; }

        void prepare(PlainMesh const& mesh) override
        {
            mesh_ = &mesh;
            if (mesh.faceSize == 3)
                adjacency_.assign(mesh.corners.size() * 2, 0);
        }

        bool has(Kernel kernel) const override { return kernel == Kernel::Adjacency && mesh_->faceSize == 3; }

        void run(Kernel, unsigned int) override
        {
            meshopt_generateAdjacencyIndexBuffer(adjacency_.data(), mesh_->corners.data(), mesh_->corners.size(),
                                                 &mesh_->points[0].x, mesh_->points.size(), sizeof(Point));
        }

        /// Behind each corner stands the point across the edge that begins there; on a border, the corner's own point.
        Result result(Kernel) override
        {
            Result result;
            for (std::size_t c = 0; c < adjacency_.size(); c += 2)
                result.number += adjacency_[c + 1] != adjacency_[c];
            return result;
        }

    private:
        PlainMesh const* mesh_ = nullptr;
        std::vector<unsigned int> adjacency_;
    };

} // namespace

std::unique_ptr<Side> makeMeshoptimizerSide()
{
    return std::make_unique<MeshoptimizerSide>();
}

} // namespace compare
