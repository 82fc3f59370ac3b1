#pragma once

#include <nexil/Array.h>
#include <nexil/JobCancel.h>
#include <nexil/parallel/Parallel.h>
#include <veldrin/algorithms/internal/FaceContributions.h>
#include <veldrin/algorithms/internal/MeshOrder.h>
#include <veldrin/algorithms/internal/PointClaims.h>

#include <algorithm>
#include <cstring>
#include <utility>

namespace Veldrin::GeometryAlgorithms {

/// x and y at once: two reads and two writes, of which each later one finds the earlier of its own width.
[[gnu::always_inline]] inline void addTo(Math::float3& sum, Math::float3 const& value) noexcept
{
    using Pair [[gnu::vector_size(8)]] = float;
    Pair xy;
    std::memcpy(&xy, &sum.x, sizeof(xy));
    xy += Pair{value.x, value.y};
    std::memcpy(&sum.x, &xy, sizeof(xy));
    sum.z += value.z;
}

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
        for (std::uint64_t begin = 0; begin < faces_.faceCount(); begin += kChunkFaces) {
            Nexil::Internal::throwIfJobCancelled();
            add(worker, begin, std::min<std::uint64_t>(begin + kChunkFaces, faces_.faceCount()));
        }
    }

    void addInParallel(std::size_t threadCount)
    {
        if (Geometry::judgeOrder(faces_).isLocal && addByParts(std::min(threadCount, PointClaims::kMostParts)))
            return;
        if (faces_.pointCount() > kMostNearPoints && threadCount > kMostTakingTurns)
            return addByStripes(threadCount);
        addInTurns();
    }

private:
    static constexpr std::uint64_t kChunkFaces = 4096;
    static constexpr std::size_t kKeptGrain = 1024;
    /// Sums of so many points lie in a cache near the thread that adds, so adding takes less time than what it adds.
    static constexpr std::uint64_t kMostNearPoints = 131072;
    /// So many threads have enough to do with what one of them adds.
    static constexpr std::size_t kMostTakingTurns = 4;

    using Worker = FaceContributions<isAngleWeighted, isAreaWeighted, Ranges>;

    /// Each thread adds to points that it has claimed for its part of the faces; those where parts meet follow. False, and
    /// nothing to be relied on, where parts meet at many points.
    [[nodiscard]] bool addByParts(std::size_t partCount)
    {
        PointClaims claims(faces_, partCount);
        auto const clear = [sums = sums_](std::uint64_t first, std::uint64_t count) {
            std::fill_n(sums + first, count, Math::float3{});
        };
        Nexil::parallel::forRange(claims.partCount(), 1, [&](std::size_t firstPart, std::size_t endPart) {
            Worker worker(positions_, faces_.points(), ranges_);
            for (std::size_t part = firstPart; part < endPart; ++part)
                claims.forEachChunk(part, [&](std::uint64_t begin, std::uint64_t end) {
                    // The plain loop is half again as fast as one that asks at every corner.
                    if (claims.claim(part, begin, end, clear))
                        add(worker, begin, end);
                    else
                        addWhere(worker, begin, end, [&](unsigned int point) { return claims.owns(part, point); });
                });
        });
        if (claims.areTooManyShared())
            return false;
        claims.clearRest(clear);
        Worker worker(positions_, faces_.points(), ranges_);
        claims.forEachSharingBlock([&](std::uint64_t begin, std::uint64_t end) {
            addWhere(worker, begin, end, [&](unsigned int point) { return claims.isShared(point); });
        });
        return true;
    }

    [[gnu::always_inline]] void add(Worker& worker, std::uint64_t begin, std::uint64_t end)
    {
        worker.forEachCorner(
            begin, end, [sums = sums_](unsigned int point, Math::float3 const& value) { addTo(sums[point], value); });
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
        Nexil::parallel::forRange(end - begin, kKeptGrain, [&](std::size_t first, std::size_t last) {
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
        for (std::uint64_t begin = kept.firstFace; begin < kept.endFace; begin += kChunkFaces) {
            Nexil::Internal::throwIfJobCancelled();
            std::uint64_t const end = std::min<std::uint64_t>(begin + kChunkFaces, kept.endFace);
            for (std::uint64_t f = begin; f < end; ++f) {
                Math::float3 const normal = normals[f - kept.firstFace];
                forEachCornerOf(ranges_, f, [=, &kept](std::uint64_t i, std::uint64_t) {
                    if (unsigned int const point = points[i] - firstPoint; point < size)
                        addTo(sums[point], isAngleWeighted ? scaled(normal, angles[i - kept.firstCorner]) : normal);
                });
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

} // namespace Veldrin::GeometryAlgorithms
