#include "Side.h"

#include <CGAL/Polygon_mesh_processing/compute_normal.h>
#include <CGAL/Polygon_mesh_processing/connected_components.h>
#include <CGAL/Simple_cartesian.h>
#include <CGAL/Surface_mesh.h>

#include <cmath>

namespace compare {

namespace {

    using Kernelf = CGAL::Simple_cartesian<float>;
    using Vector = Kernelf::Vector_3;
    using Mesh = CGAL::Surface_mesh<Kernelf::Point_3>;

    Mesh build(PlainMesh const& plain)
    {
        Mesh mesh;
        mesh.reserve(plain.points.size(), plain.corners.size() / 2, plain.faceCount());
        for (Point const& p : plain.points)
            mesh.add_vertex({p.x, p.y, p.z});
        for (std::size_t f = 0; f < plain.faceCount(); ++f) {
            std::uint32_t const* const c = &plain.corners[f * plain.faceSize];
            auto const v = [&](int k) { return Mesh::Vertex_index(c[k]); };
            if (plain.faceSize == 3)
                mesh.add_face(v(0), v(1), v(2));
            else
                mesh.add_face(v(0), v(1), v(2), v(3));
        }
        return mesh;
    }

    Vector unit(Vector const& v)
    {
        float const length = std::sqrt(v.squared_length());
        return length > 0 ? v / length : Vector(0, 1, 0);
    }

    class CgalSide : public Side {
    public:
        std::string name() const override { return "CGAL"; }

        void prepare(PlainMesh const& plain) override
        {
            plain_ = &plain;
            mesh_ = build(plain);
            faceNormals_ = mesh_.add_property_map<Mesh::Face_index, Vector>("f:normal").first;
            normals_ = mesh_.add_property_map<Mesh::Vertex_index, Vector>("v:normal").first;
            components_ = mesh_.add_property_map<Mesh::Face_index, std::size_t>("f:component").first;
        }

        bool has(Kernel) const override { return true; }

        void run(Kernel kernel, unsigned int) override
        {
            switch (kernel) {
            case Kernel::FaceNormals: return faceNormals();
            case Kernel::UniformNormals:
                faceNormals();
                return normals([&](Mesh::Halfedge_index h) { return faceNormals_[mesh_.face(h)]; });
            case Kernel::AreaNormals:
                for (auto const f : mesh_.faces())
                    faceNormals_[f] = areaVector(f);
                return normals([&](Mesh::Halfedge_index h) { return faceNormals_[mesh_.face(h)]; });
            case Kernel::AngleNormals:
                faceNormals();
                return normals([&](Mesh::Halfedge_index h) {
                    auto const& p = mesh_.point(mesh_.target(h));
                    auto const a = unit(mesh_.point(mesh_.source(h)) - p);
                    auto const b = unit(mesh_.point(mesh_.target(mesh_.next(h))) - p);
                    return faceNormals_[mesh_.face(h)] * std::acos(std::clamp(float(a * b), -1.0f, 1.0f));
                });
            case Kernel::Adjacency: built_ = build(*plain_); return;
            case Kernel::Components:
                number_ =
                    static_cast<std::int64_t>(CGAL::Polygon_mesh_processing::connected_components(mesh_, components_));
                return;
            case Kernel::Euler:
                built_ = build(*plain_);
                number_ = std::int64_t(built_.number_of_vertices()) - std::int64_t(built_.number_of_edges()) +
                          std::int64_t(built_.number_of_faces());
                return;
            }
        }

        Result result(Kernel kernel) override
        {
            copies_.clear();
            if (kernel == Kernel::FaceNormals)
                for (auto const f : mesh_.faces())
                    copies_.push_back({faceNormals_[f].x(), faceNormals_[f].y(), faceNormals_[f].z()});
            else if (kernel <= Kernel::AngleNormals)
                for (auto const v : mesh_.vertices())
                    copies_.push_back({normals_[v].x(), normals_[v].y(), normals_[v].z()});
            std::int64_t inner = 0;
            if (kernel == Kernel::Adjacency)
                for (auto const h : built_.halfedges())
                    inner += !built_.is_border(h) && !built_.is_border(built_.opposite(h));
            Result const result{copies_, kernel == Kernel::Adjacency ? inner : number_};
            built_ = Mesh();
            return result;
        }

    private:
        Vector areaVector(Mesh::Face_index f) const
        {
            auto const h0 = mesh_.halfedge(f);
            auto const& origin = mesh_.point(mesh_.target(h0));
            Vector sum(0, 0, 0);
            for (auto h = mesh_.next(h0); mesh_.next(h) != h0; h = mesh_.next(h))
                sum = sum + CGAL::cross_product(mesh_.point(mesh_.target(h)) - origin,
                                                mesh_.point(mesh_.target(mesh_.next(h))) - origin);
            return sum;
        }

        void faceNormals()
        {
            for (auto const f : mesh_.faces())
                faceNormals_[f] = unit(areaVector(f));
        }

        template <class Weighted>
        void normals(Weighted const& weighted)
        {
            for (auto const v : mesh_.vertices()) {
                Vector sum(0, 0, 0);
                for (auto const h : CGAL::halfedges_around_target(v, mesh_))
                    if (!mesh_.is_border(h))
                        sum = sum + weighted(h);
                normals_[v] = unit(sum);
            }
        }

        PlainMesh const* plain_ = nullptr;
        Mesh mesh_;
        Mesh built_;
        Mesh::Property_map<Mesh::Face_index, Vector> faceNormals_;
        Mesh::Property_map<Mesh::Vertex_index, Vector> normals_;
        Mesh::Property_map<Mesh::Face_index, std::size_t> components_;
        std::vector<Point> copies_;
        std::int64_t number_ = 0;
    };

} // namespace

std::unique_ptr<Side> makeCgalSide()
{
    return std::make_unique<CgalSide>();
}

} // namespace compare
