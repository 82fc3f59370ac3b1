#include <veldrin/algorithms/NormalsTopology.h>

#include <nexil/parallel/Parallel.h>
#include <veldrin/algorithms/FaceVertexAdjacency.h>
#include <veldrin/algorithms/MeshNormals.h>
#include <veldrin/algorithms/internal/MeshFaces.h>
#include <veldrin/algorithms/internal/PendingOutput.h>

#include <algorithm>
#include <cmath>

namespace Veldrin::GeometryAlgorithms {

namespace {

    using Geometry::IndexRange;
    using Geometry::kInvalidIndex;
    using Geometry::MeshFaces;
    using Geometry::Mesh::FaceEdge;

    namespace grain {
        constexpr std::size_t kFaces = 1024;
        constexpr std::size_t kFaceVertices = 1000;
    } // namespace grain

    constexpr std::uint64_t kCancellationChunk = 65536;

    template <class Ranges>
    class NormalGroups {
    public:
        NormalGroups(MeshFaces const& faces, Ranges const& ranges, Nexil::Array<FaceEdge> const& adjacentEdges)
            : faces_(faces), ranges_(ranges), adjacentEdges_(adjacentEdges)
        {
            isHard_.resize(adjacentEdges.size());
        }

        void classify(Nexil::Array<unsigned int> const& normalIndices, Nexil::Array<Math::float3> const& normals,
                      float maxAngle)
        {
            Nexil::parallel::forRange(faces_.faceCount(), grain::kFaces, [&](std::size_t begin, std::size_t end) {
                for (std::size_t f = begin; f < end; ++f)
                    for (std::uint64_t i = ranges_[f].begin; i < ranges_[f].end; ++i) {
                        FaceEdge const edge{static_cast<unsigned int>(f),
                                            static_cast<unsigned int>(i - ranges_[f].begin)};
                        isHard_[i] = !isSmooth(edge, normalIndices, normals, maxAngle);
                    }
            });
        }

        /// Numbers the groups; `groups` holds `kInvalidIndex` throughout. Returns how many there are.
        unsigned int number(unsigned int* groups) const
        {
            unsigned int count = 0;
            for (std::uint64_t f = 0; f < faces_.faceCount(); ++f) {
                if (f % kCancellationChunk == 0)
                    Nexil::Internal::throwIfJobCancelled();
                for (std::uint64_t i = ranges_[f].begin; i < ranges_[f].end; ++i)
                    if (groups[i] == kInvalidIndex)
                        grow({static_cast<unsigned int>(f), static_cast<unsigned int>(i - ranges_[f].begin)}, count++,
                             groups);
            }
            return count;
        }

    private:
        [[nodiscard]] unsigned int sizeOf(unsigned int face) const noexcept
        {
            return static_cast<unsigned int>(ranges_[face].end - ranges_[face].begin);
        }

        [[nodiscard]] std::uint64_t indexOf(FaceEdge edge) const noexcept
        {
            return ranges_[edge.face].begin + edge.corner;
        }

        [[nodiscard]] FaceEdge next(FaceEdge edge) const noexcept
        {
            return {edge.face, edge.corner + 1 == sizeOf(edge.face) ? 0 : edge.corner + 1};
        }

        [[nodiscard]] FaceEdge previous(FaceEdge edge) const noexcept
        {
            return {edge.face, (edge.corner == 0 ? sizeOf(edge.face) : edge.corner) - 1};
        }

        [[nodiscard]] FaceEdge across(FaceEdge edge) const noexcept { return adjacentEdges_[indexOf(edge)]; }

        [[nodiscard]] bool isSmooth(FaceEdge edge, Nexil::Array<unsigned int> const& normalIndices,
                                    Nexil::Array<Math::float3> const& normals, float maxAngle) const
        {
            // An opposite always runs between the same points the other way; that it is manifold remains to be seen.
            FaceEdge const other = across(edge);
            if (other.face == kInvalidIndex || across(other) != edge)
                return false;
            auto const normalAt = [&](FaceEdge at) {
                std::uint64_t const i = indexOf(at);
                return i < normalIndices.size() ? normalIndices[i] : kInvalidIndex;
            };
            unsigned int const start = normalAt(edge);
            unsigned int const end = normalAt(next(edge));
            unsigned int const otherStart = normalAt(other);
            unsigned int const otherEnd = normalAt(next(other));
            if (start != kInvalidIndex && end != kInvalidIndex && otherStart != kInvalidIndex &&
                otherEnd != kInvalidIndex)
                return start == otherEnd && end == otherStart;
            Math::float3 const& a = normals[edge.face];
            Math::float3 const& b = normals[other.face];
            double const cosine = double(a.x) * double(b.x) + double(a.y) * double(b.y) + double(a.z) * double(b.z);
            return static_cast<float>(std::acos(std::clamp(cosine, -1.0, 1.0))) < maxAngle;
        }

        /// Takes in the face-vertices that smooth edges at the point lead to, first across the edge that leaves it, until
        /// that is hard or the face-vertex behind it taken; then the same way backwards from where it began.
        void grow(FaceEdge const start, unsigned int group, unsigned int* groups) const
        {
            for (FaceEdge at = start; groups[indexOf(at)] == kInvalidIndex;) {
                groups[indexOf(at)] = group;
                if (isHard_[indexOf(at)])
                    break;
                at = next(across(at));
            }
            for (FaceEdge at = start; !isHard_[indexOf(previous(at))];) {
                at = across(previous(at));
                if (groups[indexOf(at)] != kInvalidIndex)
                    break;
                groups[indexOf(at)] = group;
            }
        }

        MeshFaces const& faces_;
        Ranges const& ranges_;
        Nexil::Array<FaceEdge> const& adjacentEdges_;
        Nexil::Array<bool> isHard_;
    };

} // namespace

void computeMeshNormalsTopology(Object const& mesh, Nexil::Array<unsigned int> const& normalIndices, float maxAngle,
                                Nexil::Array<unsigned int>& result, unsigned int& count, Nexil::RuntimeServices const*)
{
    MeshFaces faces;
    auto const positions = Geometry::dataOf<Math::float3>(mesh, Geometry::sPointPosition);
    if (!faces.read(mesh) || !positions || positions->size() < faces.pointCount())
        return;
    Nexil::Array<Math::float3> normals;
    Nexil::Array<FaceEdge> adjacentEdges;
    bool hasAdjacency = false;
    Nexil::parallel::invoke([&] { computeMeshFaceNormals(mesh, normals); },
                            [&] {
                                Nexil::Array<FaceEdge> pointFaces;
                                Nexil::Array<unsigned int> pointFaceIndex;
                                hasAdjacency =
                                    buildFaceVertexAdjacency(mesh, adjacentEdges, pointFaces, pointFaceIndex, nullptr);
                            });
    if (!hasAdjacency)
        return;
    faces.withRanges([&]<class Ranges>(Ranges const& ranges) {
        NormalGroups<Ranges> groups(faces, ranges, adjacentEdges);
        groups.classify(normalIndices, normals, maxAngle);
        std::uint64_t const faceVertexCount = Geometry::getElementCount(mesh, Geometry::sFaceVertexComp);
        PendingOutput<unsigned int> output(result, faceVertexCount);
        Nexil::parallel::forRange(faceVertexCount, grain::kFaceVertices, [&](std::size_t begin, std::size_t end) {
            std::fill(output.data() + begin, output.data() + end, kInvalidIndex);
        });
        count = groups.number(output.data());
        output.commit();
    });
}

} // namespace Veldrin::GeometryAlgorithms
