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
        constexpr std::size_t kKept = 1024;
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
    template <bool isAngleWeighted, bool isAreaWeighted, class Ranges>
    class Contributions {
    public:
        Contributions(Positions const& positions, unsigned int const* points, Ranges const& ranges)
            : positions_(positions), points_(points), ranges_(ranges)
        {
        }

        /// Calls visit(face, normal, angleAt) for the faces [begin, end) in order: the unit normal, weighted by area if
        /// asked for, and angleAt(k) the angle at its corner k. Leaves out faces without a normal.
        template <class Visit>
        [[gnu::always_inline]] void forEachFace(std::uint64_t begin, std::uint64_t end, Visit const& visit)
        {
            for (std::uint64_t next = begin; begin < end; begin = next) {
                next = std::min(begin + normals_.kSize, end);
                normals_.compute(positions_, points_, ranges_, begin, next);
                if constexpr (isAngleWeighted)
                    angles_.compute(normals_, positions_, points_, ranges_, begin, next);
                for (std::uint64_t f = begin; f < next; ++f)
                    if (normals_.isCovered(f - begin))
                        visit(f, normals_[f - begin], [this, i = f - begin](std::uint64_t k) { return angles_(i, k); });
            }
        }

        /// Calls add(point, value) for each corner of the faces [begin, end), in order.
        template <class Add>
        [[gnu::always_inline]] void forEachCorner(std::uint64_t begin, std::uint64_t end, Add const& add)
        {
            forEachFace(begin, end, [&](std::uint64_t f, Math::float3 const& normal, auto const& angleAt) {
                Geometry::IndexRange const corners = ranges_[f];
                for (std::uint64_t i = corners.begin; i < corners.end; ++i)
                    add(points_[i], isAngleWeighted ? scaled(normal, angleAt(i - corners.begin)) : normal);
            });
        }

    private:
        Positions const& positions_;
        unsigned int const* points_;
        Ranges const& ranges_;
        FaceNormalBlock<isAreaWeighted, Ranges> normals_;
        CornerAngles<Ranges> angles_;
    };

    /// Sums at points, in four ways that give the same bits: every point sees its faces in their order.
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
            Worker worker(positions_, faces_.points(), ranges_);
            for (std::uint64_t begin = 0; begin < faces_.faceCount(); begin += grain::kFaces) {
                Nexil::Internal::throwIfJobCancelled();
                worker.forEachCorner(
                    begin, std::min<std::uint64_t>(begin + grain::kFaces, faces_.faceCount()),
                    [&](unsigned int point, Math::float3 const& value) { addTo(sums_[point], value); });
            }
        }

        void addInParallel(std::size_t threadCount)
        {
            if (faces_.pointCount() > kMostNearPoints) {
                PointOwners const owners(faces_, std::min(threadCount, PointOwners::kMostParts));
                if (owners.areMostlyApart())
                    return addByParts(owners);
                if (threadCount > kMostTakingTurns)
                    return addByStripes(threadCount);
            }
            addInTurns();
        }

    private:
        /// Sums of so many points lie in a cache near the thread that adds, so adding takes less time than what it adds.
        static constexpr std::uint64_t kMostNearPoints = 131072;
        /// So many threads have enough to do with what one of them adds.
        static constexpr std::size_t kMostTakingTurns = 4;

        using Worker = Contributions<isAngleWeighted, isAreaWeighted, Ranges>;

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
                Worker worker(positions_, faces_.points(), ranges_);
                for (std::size_t part = firstPart; part < endPart; ++part)
                    owners.forEachChunk(part, [&](std::uint64_t begin, std::uint64_t end) {
                        // The plain loop is half again as fast as one that asks at every corner.
                        if (owners.isOwnChunk(begin))
                            worker.forEachCorner(begin, end, [&](unsigned int point, Math::float3 const& value) {
                                addTo(sums_[point], value);
                            });
                        else
                            addWhere(worker, begin, end, [&](unsigned int point) { return owners.owns(part, point); });
                    });
            });
            Worker worker(positions_, faces_.points(), ranges_);
            for (std::size_t part = 1; part < owners.partCount(); ++part)
                owners.forEachChunk(part, [&](std::uint64_t begin, std::uint64_t end) {
                    if (!owners.isOwnChunk(begin))
                        addWhere(worker, begin, end, [&](unsigned int point) { return !owners.owns(part, point); });
                });
        }

        template <class Holds>
        [[gnu::noinline]] void addWhere(Worker& worker, std::uint64_t begin, std::uint64_t end, Holds const& holds)
        {
            worker.forEachCorner(begin, end, [&](unsigned int point, Math::float3 const& value) {
                if (holds(point))
                    addTo(sums_[point], value);
            });
        }

        /// What the faces of a range have to add, kept.
        struct Kept {
            std::uint64_t firstFace = 0;
            std::uint64_t endFace = 0;
            std::uint64_t firstCorner = 0;
            Nexil::Array<Math::float3> normals;
            Nexil::Array<float> angles;
        };

        /// Computes what the faces [begin, end) have to add, in parallel. Faces without a normal add zero, which changes no
        /// sum.
        void keep(Kept& kept, std::uint64_t begin, std::uint64_t end)
        {
            Geometry::IndexRange const corners = faces_.corners(begin, end);
            kept.firstFace = begin;
            kept.endFace = end;
            kept.firstCorner = corners.begin;
            Nexil::Internal::resizeUninitialized(kept.normals, end - begin);
            Nexil::Internal::resizeUninitialized(kept.angles, isAngleWeighted ? corners.end - corners.begin : 0);
            Nexil::parallel::forRange(end - begin, grain::kKept, [&](std::size_t first, std::size_t last) {
                keepChunk(kept, begin + first, begin + last);
            });
        }

        void keepChunk(Kept& kept, std::uint64_t begin, std::uint64_t end)
        {
            Math::float3* const normals = kept.normals.data();
            float* const angles = kept.angles.data();
            std::fill(normals + (begin - kept.firstFace), normals + (end - kept.firstFace), Math::float3{});
            Geometry::IndexRange rest = faces_.corners(begin, end);
            auto const skipTo = [&](std::uint64_t corner) {
                std::fill(angles + (rest.begin - kept.firstCorner), angles + (corner - kept.firstCorner), 0.0f);
            };
            Worker worker(positions_, faces_.points(), ranges_);
            worker.forEachFace(begin, end, [&](std::uint64_t f, Math::float3 const& normal, auto const& angleAt) {
                normals[f - kept.firstFace] = normal;
                if constexpr (isAngleWeighted) {
                    Geometry::IndexRange const corners = ranges_[f];
                    skipTo(corners.begin);
                    for (std::uint64_t i = corners.begin; i < corners.end; ++i)
                        angles[i - kept.firstCorner] = angleAt(i - corners.begin);
                    rest.begin = corners.end;
                }
            });
            if constexpr (isAngleWeighted)
                skipTo(rest.end);
        }

        /// Adds what was kept for the points [firstPoint, firstPoint + size).
        void addKept(Kept const& kept, unsigned int firstPoint, unsigned int size)
        {
            unsigned int const* const points = faces_.points();
            Math::float3 const* const normals = kept.normals.data();
            float const* const angles = kept.angles.data();
            Math::float3* const sums = sums_ + firstPoint;
            for (std::uint64_t begin = kept.firstFace; begin < kept.endFace; begin += grain::kFaces) {
                Nexil::Internal::throwIfJobCancelled();
                std::uint64_t const end = std::min<std::uint64_t>(begin + grain::kFaces, kept.endFace);
                for (std::uint64_t f = begin; f < end; ++f) {
                    Math::float3 const normal = normals[f - kept.firstFace];
                    for (std::uint64_t i = ranges_[f].begin; i < ranges_[f].end; ++i)
                        if (unsigned int const point = points[i] - firstPoint; point < size)
                            addTo(sums[point], isAngleWeighted ? scaled(normal, angles[i - kept.firstCorner]) : normal);
                }
            }
        }

        /// While one thread adds what some faces have, the others compute what the next faces have.
        void addInTurns()
        {
            constexpr std::uint64_t kTurnFaces = 16384;
            std::fill_n(sums_, faces_.pointCount(), Math::float3{});
            Kept current;
            Kept next;
            auto const keepFrom = [&](Kept& kept, std::uint64_t begin) {
                keep(kept, begin, std::min(begin + kTurnFaces, faces_.faceCount()));
            };
            for (keepFrom(current, 0); current.firstFace < faces_.faceCount(); std::swap(current, next))
                Nexil::parallel::invoke([&] { keepFrom(next, current.endFace); },
                                        [&] { addKept(current, 0, static_cast<unsigned int>(faces_.pointCount())); });
        }

        /// First what each face has to add, then each thread goes over all faces for the points of its own stripe.
        void addByStripes(std::size_t stripeCount)
        {
            Kept kept;
            keep(kept, 0, faces_.faceCount());
            Nexil::parallel::forRange(stripeCount, 1, [&](std::size_t firstStripe, std::size_t endStripe) {
                std::uint64_t const pointCount = faces_.pointCount();
                auto const firstPoint = static_cast<unsigned int>(pointCount * firstStripe / stripeCount);
                auto const size = static_cast<unsigned int>(pointCount * endStripe / stripeCount) - firstPoint;
                std::fill_n(sums_ + firstPoint, size, Math::float3{});
                addKept(kept, firstPoint, size);
            });
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
