#include "Side.h"

#include <OpenMesh/Core/Mesh/PolyMesh_ArrayKernelT.hh>
#include <OpenMesh/Core/Mesh/TriMesh_ArrayKernelT.hh>

#include <cmath>

namespace compare {

namespace {

    struct FloatTraits : OpenMesh::DefaultTraits {
        VertexAttributes(OpenMesh::Attributes::Normal);
        FaceAttributes(OpenMesh::Attributes::Normal);
    };

    /// Triangles have a kernel of their own, and most programs use that.
    template <class Mesh>
    class OpenMeshSide : public Side {
    public:
        std::string name() const override { return "OpenMesh"; }

        void prepare(PlainMesh const& plain) override
        {
            plain_ = &plain;
            build(mesh_);
        }

        bool has(Kernel kernel) const override { return kernel != Kernel::Components; }

        void run(Kernel kernel, unsigned int) override
        {
            switch (kernel) {
            case Kernel::FaceNormals: mesh_.update_face_normals(); return;
            case Kernel::UniformNormals: mesh_.update_normals(); return;
            case Kernel::AreaNormals:
                for (auto const v : mesh_.vertices()) {
                    typename Mesh::Normal normal;
                    mesh_.calc_vertex_normal_correct(v, normal);
                    mesh_.set_normal(v, normal.normalize_cond());
                }
                return;
            case Kernel::AngleNormals:
                mesh_.update_face_normals();
                for (auto const v : mesh_.vertices()) {
                    typename Mesh::Normal normal(0, 0, 0);
                    for (auto const h : mesh_.vih_range(v))
                        if (!mesh_.is_boundary(h))
                            normal += mesh_.normal(mesh_.face_handle(h)) * float(mesh_.calc_sector_angle(h));
                    mesh_.set_normal(v, normal.normalize_cond());
                }
                return;
            case Kernel::Adjacency: build(built_); return;
            case Kernel::Euler:
                build(built_);
                number_ =
                    std::int64_t(built_.n_vertices()) - std::int64_t(built_.n_edges()) + std::int64_t(built_.n_faces());
                return;
            case Kernel::Components: return;
            }
        }

        Result result(Kernel kernel) override
        {
            copies_.clear();
            if (kernel == Kernel::FaceNormals)
                for (auto const f : mesh_.faces())
                    copies_.push_back({mesh_.normal(f)[0], mesh_.normal(f)[1], mesh_.normal(f)[2]});
            else if (kernel <= Kernel::AngleNormals)
                for (auto const v : mesh_.vertices())
                    copies_.push_back({mesh_.normal(v)[0], mesh_.normal(v)[1], mesh_.normal(v)[2]});
            std::int64_t inner = 0;
            if (kernel == Kernel::Adjacency)
                for (auto const h : built_.halfedges())
                    inner += !built_.is_boundary(h) && !built_.is_boundary(built_.opposite_halfedge_handle(h));
            Result const result{copies_, kernel == Kernel::Adjacency ? inner : number_};
            built_ = Mesh();
            return result;
        }

    private:
        void build(Mesh& mesh) const
        {
            mesh = Mesh();
            mesh.reserve(plain_->points.size(), plain_->corners.size() / 2, plain_->faceCount());
            for (Point const& p : plain_->points)
                mesh.add_vertex({p.x, p.y, p.z});
            std::vector<typename Mesh::VertexHandle> face(plain_->faceSize);
            for (std::size_t f = 0; f < plain_->faceCount(); ++f) {
                for (std::uint32_t k = 0; k < plain_->faceSize; ++k)
                    face[k] = typename Mesh::VertexHandle(int(plain_->corners[f * plain_->faceSize + k]));
                mesh.add_face(face);
            }
        }

        PlainMesh const* plain_ = nullptr;
        Mesh mesh_;
        Mesh built_;
        std::vector<Point> copies_;
        std::int64_t number_ = 0;
    };

    class EitherOpenMeshSide : public Side {
    public:
        std::string name() const override { return "OpenMesh"; }
        void prepare(PlainMesh const& plain) override
        {
            if (plain.faceSize == 3)
                side_ = std::make_unique<OpenMeshSide<OpenMesh::TriMesh_ArrayKernelT<FloatTraits>>>();
            else
                side_ = std::make_unique<OpenMeshSide<OpenMesh::PolyMesh_ArrayKernelT<FloatTraits>>>();
            side_->prepare(plain);
        }
        bool has(Kernel kernel) const override { return side_->has(kernel); }
        void run(Kernel kernel, unsigned int threadCount) override { side_->run(kernel, threadCount); }
        Result result(Kernel kernel) override { return side_->result(kernel); }

    private:
        std::unique_ptr<Side> side_;
    };

} // namespace

std::unique_ptr<Side> makeOpenMeshSide()
{
    return std::make_unique<EitherOpenMeshSide>();
}

} // namespace compare
