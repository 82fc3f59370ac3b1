#include <veldrin/algorithms/HalfEdgeDataStructure.h>
#include <veldrin/algorithms/MeshInvariants.h>
#include <veldrin/geometry/GeoProperties.h>
#include <veldrin/geometry/Prototypes.h>
#include <veldrin/io/ObjectStream.h>
#include <veldrin/object/Properties.h>

#include <CGAL/Simple_cartesian.h>
#include <CGAL/Surface_mesh.h>
#include <boost/graph/connected_components.hpp>

#include <cstdio>
#include <cstdlib>
#include <string>
#include <vector>

// mesh_counts FILE.zon ...
//
// Holds the Euler characteristic, the number of components and the number of boundary edges of the mesh in each file against
// those of CGAL, and lists the meshes that CGAL does not take: it holds manifolds only. Exit code 1 when a number differs.

namespace {

using namespace Veldrin;
using Surface = CGAL::Surface_mesh<CGAL::Simple_cartesian<float>::Point_3>;

struct Counts {
    long long euler = 0;
    long long components = 0;
    long long boundaryEdges = 0;
    bool operator==(Counts const&) const = default;
};

Counts countOurs(Object const& mesh)
{
    Geometry::Mesh::HalfEdgeDataStructure const edges(mesh);
    Counts counts{Geometry::Mesh::eulerCharacteristic(mesh, edges), Geometry::Mesh::connectedComponents(mesh), 0};
    edges.forEachEdge(0, edges.pointCount(), [&](auto const& edge) { counts.boundaryEdges += edge.isBoundary(); });
    return counts;
}

template <class T>
Nexil::Ptr<Nexil::Array<T>> dataOf(Object const& mesh, char const* name)
{
    auto const property = getPropertyAs<Nexil::Ptr<Object>>(mesh, name);
    return property ? getPropertyAs<Nexil::Ptr<Nexil::Array<T>>>(*property, Geometry::sData) : nullptr;
}

/// False when the mesh has a face that CGAL does not take.
bool build(Object const& mesh, Surface& surface)
{
    auto const corners = dataOf<unsigned int>(mesh, Geometry::sFaceVertex);
    auto const offsets = dataOf<unsigned int>(mesh, Geometry::sFaceOffset);
    surface.reserve(0, 0, 0);
    for (unsigned int p = 0; p < Geometry::getElementCount(mesh, Geometry::sPointComp); ++p)
        surface.add_vertex();
    std::vector<Surface::Vertex_index> face;
    for (std::size_t f = 0; f + 1 < offsets->size(); ++f) {
        face.clear();
        for (unsigned int i = (*offsets)[f]; i < (*offsets)[f + 1]; ++i)
            face.push_back(Surface::Vertex_index((*corners)[i]));
        if (face.size() < 3 || surface.add_face(face) == Surface::null_face())
            return false;
    }
    return true;
}

Counts countTheirs(Surface const& surface)
{
    std::vector<int> component(surface.number_of_vertices());
    Counts counts;
    counts.euler = static_cast<long long>(surface.number_of_vertices()) -
                   static_cast<long long>(surface.number_of_edges()) +
                   static_cast<long long>(surface.number_of_faces());
    counts.components = boost::connected_components(
        surface, boost::make_iterator_property_map(component.begin(), get(boost::vertex_index, surface)));
    for (auto const edge : surface.edges())
        counts.boundaryEdges += surface.is_border(edge);
    return counts;
}

void list(char const* what, std::vector<std::string> const& names)
{
    std::printf("%zu %s%s", names.size(), what, names.empty() ? "\n" : ":\n");
    for (auto const& name : names)
        std::printf("    %s\n", name.c_str());
}

} // namespace

int main(int argc, char** argv)
{
    int equal = 0;
    int different = 0;
    std::vector<std::string> refused;
    std::vector<std::string> clouds;
    for (int i = 1; i < argc; ++i) {
        Nexil::Array<Nexil::Ptr<Object>> objects;
        if (!IO::deserialize(argv[i], objects, {}, nullptr)) {
            std::fprintf(stderr, "mesh_counts: cannot read %s\n", argv[i]);
            return EXIT_FAILURE;
        }
        for (std::size_t k = 0; k < objects.size(); ++k) {
            std::string const name = objects.size() == 1 ? argv[i] : argv[i] + (" object " + std::to_string(k));
            if (!Object::isA(*objects[k], *Geometry::getMeshPrototype())) {
                clouds.push_back(name);
                continue;
            }
            Surface surface;
            if (!build(*objects[k], surface)) {
                refused.push_back(name);
                continue;
            }
            Counts const ours = countOurs(*objects[k]);
            Counts const theirs = countTheirs(surface);
            ++(ours == theirs ? equal : different);
            if (ours != theirs)
                std::printf(
                    "%s: Euler characteristic %lld, components %lld, boundary edges %lld; CGAL: %lld, %lld, %lld\n",
                    name.c_str(), ours.euler, ours.components, ours.boundaryEdges, theirs.euler, theirs.components,
                    theirs.boundaryEdges);
        }
    }
    std::printf("%d meshes with the same counts as CGAL, %d with others\n", equal, different);
    list("that CGAL does not take", refused);
    list("that are no mesh", clouds);
    return different == 0 ? EXIT_SUCCESS : EXIT_FAILURE;
}
