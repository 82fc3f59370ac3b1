#include <benchmark/benchmark.h>
#include <tbb/global_control.h>

#include <veldrin/algorithms/FaceVertexAdjacency.h>
#include <veldrin/algorithms/MeshInvariants.h>
#include <veldrin/algorithms/MeshNormals.h>
#include <veldrin/geometry/FaceEdge.h>
#include <veldrin/geometry/GeoProperties.h>
#include <veldrin/geometry/Names.h>
#include <veldrin/geometry/Population.h>

#include <cstring>
#include <vector>

// Kernels over a plane of 4 million quads in its natural order, on one and two threads, beside a copy of the bytes that a
// face's corners and positions take. Items are faces.
namespace {

using namespace Veldrin;

constexpr unsigned int kSubdivisions = 2000;

Object const& plane()
{
    static auto const made = [] {
        auto object = createObject();
        Geometry::populatePlaneMesh(1.0f, kSubdivisions, *object);
        return object;
    }();
    return *made;
}

template <class Kernel>
void run(benchmark::State& state, Kernel const& kernel)
{
    Object const& mesh = plane();
    tbb::global_control const limit(tbb::global_control::max_allowed_parallelism,
                                    static_cast<std::size_t>(state.range(0)));
    for ([[maybe_unused]] auto _ : state)
        kernel(mesh);
    state.SetItemsProcessed(state.iterations() *
                            static_cast<std::int64_t>(Geometry::getElementCount(mesh, Geometry::sFaceComp)));
}

void faceNormals(benchmark::State& state)
{
    Nexil::Array<Math::float3> normals;
    run(state, [&](Object const& mesh) { GeometryAlgorithms::computeMeshFaceNormals(mesh, normals); });
}

template <bool isAngleWeighted, bool isAreaWeighted>
void vertexNormals(benchmark::State& state)
{
    Nexil::Array<Math::float3> normals;
    run(state, [&](Object const& mesh) {
        GeometryAlgorithms::computeMeshVertexNormals(mesh, isAngleWeighted, isAreaWeighted, normals);
    });
}

void adjacency(benchmark::State& state)
{
    Nexil::Array<Geometry::Mesh::FaceEdge> edges;
    Nexil::Array<Geometry::Mesh::FaceEdge> pointFaces;
    Nexil::Array<unsigned int> index;
    run(state, [&](Object const& mesh) {
        if (!GeometryAlgorithms::buildFaceVertexAdjacency(mesh, edges, pointFaces, index, nullptr))
            state.SkipWithError("no adjacency");
    });
}

void eulerCharacteristic(benchmark::State& state)
{
    run(state, [&](Object const& mesh) {
        if (Geometry::Mesh::eulerCharacteristic(mesh) != 1)
            state.SkipWithError("a plane has 1");
    });
}

void connectedComponents(benchmark::State& state)
{
    run(state, [&](Object const& mesh) {
        if (Geometry::Mesh::connectedComponents(mesh) != 1)
            state.SkipWithError("a plane is one piece");
    });
}

void copyOfSameBytes(benchmark::State& state)
{
    // Four corners, one offset, one position a face.
    std::vector<char> from(std::size_t(kSubdivisions) * kSubdivisions * 32);
    std::vector<char> to(from.size());
    run(state, [&](Object const&) {
        std::memcpy(to.data(), from.data(), from.size());
        benchmark::ClobberMemory();
    });
}

} // namespace

BENCHMARK(faceNormals)->Arg(1)->Arg(2)->UseRealTime()->Unit(benchmark::kMillisecond);
BENCHMARK(vertexNormals<false, false>)->Arg(1)->Arg(2)->UseRealTime()->Unit(benchmark::kMillisecond);
BENCHMARK(vertexNormals<false, true>)->Arg(1)->Arg(2)->UseRealTime()->Unit(benchmark::kMillisecond);
BENCHMARK(vertexNormals<true, false>)->Arg(1)->Arg(2)->UseRealTime()->Unit(benchmark::kMillisecond);
BENCHMARK(adjacency)->Arg(1)->Arg(2)->UseRealTime()->Unit(benchmark::kMillisecond);
BENCHMARK(eulerCharacteristic)->Arg(1)->Arg(2)->UseRealTime()->Unit(benchmark::kMillisecond);
BENCHMARK(connectedComponents)->Arg(1)->Arg(2)->UseRealTime()->Unit(benchmark::kMillisecond);
BENCHMARK(copyOfSameBytes)->Arg(1)->UseRealTime()->Unit(benchmark::kMillisecond);
