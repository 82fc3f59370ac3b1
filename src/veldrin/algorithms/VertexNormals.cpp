#include <veldrin/algorithms/MeshNormals.h>

#include <nexil/parallel/Parallel.h>
#include <nexil/parallel/Scan.h>
#include <veldrin/algorithms/internal/CornerAngles.h>
#include <veldrin/algorithms/internal/FaceNormalBlock.h>
#include <veldrin/algorithms/internal/PendingOutput.h>
#include <veldrin/algorithms/internal/PointOwners.h>

#include <algorithm>
#include <array>

namespace Veldrin::GeometryAlgorithms {

namespace {

    namespace grain {
        constexpr std::size_t kPoints = 1024;
        constexpr std::size_t kFaces = 4096;
    } // namespace grain

    [[gnu::always_inline]] inline Math::float3 scaled(Math::float3 const& v, float factor) noexcept
    {
        return {v.x * factor, v.y * factor, v.z * factor};
    }

    [[gnu::always_inline]] inline void addTo(Math::float3& sum, Math::float3 const& value) noexcept
    {
        sum.x += value.x;
        sum.y += value.y;
        sum.z += value.z;
    }

    /// Scales each sum to length 1, a block at a time.
    void normalize(Math::float3* sums, std::size_t count) noexcept
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

    /// What faces add to the normals of their points, a block of faces at a time.
    template <bool isAngleWeighted, bool isAreaWeighted>
    class Contributions {
    public:
        Contributions(Positions const& positions, unsigned int const* points) : positions_(positions), points_(points)
        {
        }

        /// Calls visit(face, normal, firstAngle) for the faces [begin, end) in order: the unit normal, weighted by area if
        /// asked for, and the index in `angles()` of the face's first corner. Leaves out faces without a normal.
        template <class Ranges, class Visit>
        [[gnu::always_inline]] void forEachFace(Ranges const& ranges, std::uint64_t begin, std::uint64_t end,
                                                Visit const& visit)
        {
            for (std::uint64_t next = begin; begin < end; begin = next) {
                next = std::min(begin + normals_.kSize, end);
                normals_.compute(positions_, points_, ranges, begin, next);
                if constexpr (isAngleWeighted) {
                    angles_.clear();
                    for (std::uint64_t f = begin; f < next; ++f)
                        if (normals_.isCovered(f - begin))
                            angles_.addFace(positions_, points_ + ranges[f].begin, ranges[f].end - ranges[f].begin);
                    angles_.compute();
                }
                std::size_t angle = 0;
                for (std::uint64_t f = begin; f < next; ++f)
                    if (normals_.isCovered(f - begin)) {
                        visit(f, normals_[f - begin], angle);
                        angle += ranges[f].end - ranges[f].begin;
                    }
            }
        }

        /// Calls add(point, value) for each corner of the faces [begin, end), in order.
        template <class Ranges, class Add>
        [[gnu::always_inline]] void forEachCorner(Ranges const& ranges, std::uint64_t begin, std::uint64_t end,
                                                  Add const& add)
        {
            forEachFace(ranges, begin, end, [&](std::uint64_t f, Math::float3 const& normal, std::size_t angle) {
                for (std::uint64_t i = ranges[f].begin; i < ranges[f].end; ++i)
                    add(points_[i], isAngleWeighted ? scaled(normal, angles_[angle++]) : normal);
            });
        }

        [[nodiscard]] CornerAngles const& angles() const noexcept { return angles_; }

    private:
        Positions const& positions_;
        unsigned int const* points_;
        FaceNormalBlock<isAreaWeighted> normals_;
        CornerAngles angles_;
    };

    /// Sums at points, in three ways that give the same bits: every point sees its faces in their order.
    template <bool isAngleWeighted, bool isAreaWeighted, class Ranges>
    class FaceOrderSums {
    public:
        FaceOrderSums(Geometry::MeshFaces const& faces, Positions const& positions, Ranges const& ranges,
                      Math::float3* sums)
            : faces_(faces), positions_(positions), ranges_(ranges), sums_(sums)
        {
        }

        /// One loop over the faces. Takes no memory but that of one block.
        void addSerially()
        {
            std::fill_n(sums_, faces_.pointCount(), Math::float3{});
            Worker worker(positions_, faces_.points());
            for (std::uint64_t begin = 0; begin < faces_.faceCount(); begin += grain::kFaces) {
                Nexil::Internal::throwIfJobCancelled();
                worker.forEachCorner(
                    ranges_, begin, std::min<std::uint64_t>(begin + grain::kFaces, faces_.faceCount()),
                    [&](unsigned int point, Math::float3 const& value) { addTo(sums_[point], value); });
            }
        }

        void addInParallel(std::size_t threadCount)
        {
            PointOwners const owners(faces_, std::min(threadCount, PointOwners::kMostParts));
            if (owners.areMostlyApart())
                addByParts(owners);
            else
                addByStripes(threadCount);
        }

    private:
        using Worker = Contributions<isAngleWeighted, isAreaWeighted>;

        void clear()
        {
            Nexil::parallel::forRange(faces_.pointCount(), grain::kPoints, [&](std::size_t begin, std::size_t end) {
                std::fill(sums_ + begin, sums_ + end, Math::float3{});
            });
        }

        /// Each thread adds to the points of its own part of the faces; the rest follows.
        void addByParts(PointOwners const& owners)
        {
            clear();
            Nexil::parallel::forRange(owners.partCount(), 1, [&](std::size_t firstPart, std::size_t endPart) {
                Worker worker(positions_, faces_.points());
                for (std::size_t part = firstPart; part < endPart; ++part)
                    owners.forEachChunk(part, [&](std::uint64_t begin, std::uint64_t end) {
                        // The plain loop is half again as fast as one that asks at every corner.
                        if (owners.isOwnChunk(begin))
                            worker.forEachCorner(
                                ranges_, begin, end,
                                [&](unsigned int point, Math::float3 const& value) { addTo(sums_[point], value); });
                        else
                            addWhere(worker, begin, end, [&](unsigned int point) { return owners.owns(part, point); });
                    });
            });
            Worker worker(positions_, faces_.points());
            for (std::size_t part = 1; part < owners.partCount(); ++part)
                owners.forEachChunk(part, [&](std::uint64_t begin, std::uint64_t end) {
                    if (!owners.isOwnChunk(begin))
                        addWhere(worker, begin, end, [&](unsigned int point) { return !owners.owns(part, point); });
                });
        }

        template <class Holds>
        [[gnu::noinline]] void addWhere(Worker& worker, std::uint64_t begin, std::uint64_t end, Holds const& holds)
        {
            worker.forEachCorner(ranges_, begin, end, [&](unsigned int point, Math::float3 const& value) {
                if (holds(point))
                    addTo(sums_[point], value);
            });
        }

        /// First what each face has to add, then each thread goes over all faces for the points of its own stripe.
        void addByStripes(std::size_t stripeCount)
        {
            Nexil::Array<Math::float3> normals;
            Nexil::Array<float> angles;
            Nexil::Internal::resizeUninitialized(normals, faces_.faceCount());
            Nexil::Internal::resizeUninitialized(angles, isAngleWeighted ? faces_.cornerCount() : 0);
            Nexil::parallel::forRange(faces_.faceCount(), grain::kFaces, [&](std::size_t begin, std::size_t end) {
                // Faces that the loop below leaves out add zero, which changes no sum.
                std::fill(normals.data() + begin, normals.data() + end, Math::float3{});
                Geometry::IndexRange rest = faces_.corners(begin, end);
                auto const skipTo = [&](std::uint64_t corner) {
                    std::fill(angles.data() + rest.begin, angles.data() + corner, 0.0f);
                };
                Worker worker(positions_, faces_.points());
                worker.forEachFace(ranges_, begin, end,
                                   [&](std::uint64_t f, Math::float3 const& normal, std::size_t angle) {
                                       normals[f] = normal;
                                       if constexpr (isAngleWeighted) {
                                           skipTo(ranges_[f].begin);
                                           rest.begin = ranges_[f].end;
                                           for (std::uint64_t i = ranges_[f].begin; i < ranges_[f].end; ++i)
                                               angles[i] = worker.angles()[angle++];
                                       }
                                   });
                if constexpr (isAngleWeighted)
                    skipTo(rest.end);
            });
            Nexil::parallel::forRange(stripeCount, 1, [&](std::size_t firstStripe, std::size_t endStripe) {
                std::uint64_t const pointCount = faces_.pointCount();
                auto const firstPoint = static_cast<unsigned int>(pointCount * firstStripe / stripeCount);
                auto const size = static_cast<unsigned int>(pointCount * endStripe / stripeCount) - firstPoint;
                addStripe(firstPoint, size, normals.data(), angles.data());
            });
        }

        void addStripe(unsigned int firstPoint, unsigned int size, Math::float3 const* normals, float const* angles)
        {
            unsigned int const* const points = faces_.points();
            Math::float3* const sums = sums_ + firstPoint;
            std::fill_n(sums, size, Math::float3{});
            for (std::uint64_t begin = 0; begin < faces_.faceCount(); begin += grain::kFaces) {
                Nexil::Internal::throwIfJobCancelled();
                std::uint64_t const end = std::min<std::uint64_t>(begin + grain::kFaces, faces_.faceCount());
                for (std::uint64_t f = begin; f < end; ++f)
                    for (std::uint64_t i = ranges_[f].begin; i < ranges_[f].end; ++i)
                        if (unsigned int const point = points[i] - firstPoint; point < size)
                            addTo(sums[point], isAngleWeighted ? scaled(normals[f], angles[i]) : normals[f]);
            }
        }

        Geometry::MeshFaces const& faces_;
        Positions const& positions_;
        Ranges const& ranges_;
        Math::float3* sums_;
    };

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
