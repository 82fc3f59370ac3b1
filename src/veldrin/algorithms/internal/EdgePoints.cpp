#include <veldrin/algorithms/internal/EdgePoints.h>

#include <nexil/parallel/Parallel.h>

#include <atomic>

namespace Veldrin::Geometry::Mesh {

namespace {

    namespace grain {
        constexpr std::size_t kPoints = 16384;
    } // namespace grain

} // namespace

Nexil::Array<bool> pointsOnEdges(HalfEdgeDataStructure const& edges)
{
    Nexil::Array<bool> flags;
    flags.resize(edges.pointCount());
    auto const set = [&](unsigned int point) {
        std::atomic_ref<bool>(flags[point]).store(true, std::memory_order_relaxed);
    };
    Nexil::parallel::forRange(edges.pointCount(), grain::kPoints, [&](std::size_t begin, std::size_t end) {
        edges.forEachEdge(begin, end, [&](HalfEdgeDataStructure::Edge const& edge) {
            set(edge.lower);
            set(edge.upper);
        });
    });
    return flags;
}

} // namespace Veldrin::Geometry::Mesh
