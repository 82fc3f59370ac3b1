#include <veldrin/algorithms/StrandMeasures.h>

#include <nexil/parallel/Parallel.h>
#include <veldrin/algorithms/internal/RisingOffsets.h>
#include <veldrin/geometry/Prototypes.h>

namespace Veldrin::GeometryAlgorithms {

namespace {

    using Geometry::dataOf;
    using Geometry::IndexArray;
    using Geometry::IndexRange;
    using Geometry::OffsetRanges;
    using Geometry::RisingOffsets;

    namespace grain {
        constexpr std::size_t kTangentStrands = 1024;
        constexpr std::size_t kMeasureStrands = 1000;
    } // namespace grain

    /// A strand geometry whose arrays are as large as its counts ask for.
    struct Strands {
        IndexArray offsets;
        Nexil::Ptr<Nexil::Array<Math::float3>> positions;
        std::uint64_t strandCount = 0;
        std::uint64_t pointCount = 0;

        [[nodiscard]] bool read(Object const& object)
        {
            offsets = dataOf<unsigned int>(object, Geometry::sStrandOffset);
            positions = dataOf<Math::float3>(object, Geometry::sPointPosition);
            strandCount = Geometry::getElementCount(object, Geometry::sStrandComp);
            pointCount = Geometry::getElementCount(object, Geometry::sPointComp);
            return offsets && positions && positions->size() >= pointCount && offsets->size() >= strandCount + 1;
        }
    };

    /// Calls body(strand, range) for every strand; ranges end at the last point and do not overlap.
    template <class Body>
    void forEachStrand(IndexArray const& offsets, std::uint64_t strandCount, std::uint64_t pointCount,
                       std::size_t grain, Body const& body)
    {
        if (offsets->empty())
            return;
        RisingOffsets const rising(offsets, std::min<std::uint64_t>(strandCount, offsets->size() - 1));
        OffsetRanges const ranges(rising.data(), rising.count(), pointCount);
        Nexil::parallel::forRange(ranges.count(), grain, [&](std::size_t begin, std::size_t end) {
            for (std::size_t s = begin; s < end; ++s)
                body(s, ranges[s]);
        });
    }

    template <class T>
    Nexil::Array<T> zeros(std::uint64_t count)
    {
        Nexil::Array<T> made;
        made.resize(count);
        return made;
    }

} // namespace

bool computeStrandTangents(Object const& strands, Nexil::Array<Math::float3>& tangents, Nexil::RuntimeServices const*)
{
    Strands input;
    if (!input.read(strands))
        return false;
    auto result = zeros<Math::float3>(input.pointCount);
    Math::float3 const* const positions = input.positions->data();
    forEachStrand(
        input.offsets, input.strandCount, input.pointCount, grain::kTangentStrands, [&](std::size_t, IndexRange range) {
            if (range.begin < range.end)
                computeStrandTangent(positions + range.begin, positions + range.end, result.data() + range.begin);
        });
    tangents = std::move(result);
    return true;
}

bool computeStrandLength(Object const& strands, Nexil::Array<float>& strandLengths, Nexil::Array<float>& segmentLengths,
                         Nexil::RuntimeServices const*)
{
    Strands input;
    if (!input.read(strands))
        return false;
    auto lengths = zeros<float>(input.strandCount);
    auto segments = zeros<float>(input.pointCount);
    Math::float3 const* const positions = input.positions->data();
    forEachStrand(input.offsets, input.strandCount, input.pointCount, grain::kMeasureStrands,
                  [&](std::size_t s, IndexRange range) {
                      float total = 0;
                      for (std::uint64_t i = range.begin; i + 1 < range.end; ++i) {
                          segments[i] = length(positions[i + 1] - positions[i]);
                          total += segments[i];
                      }
                      if (range.begin < range.end)
                          segments[range.end - 1] = 0;
                      lengths[s] = total;
                  });
    strandLengths = std::move(lengths);
    segmentLengths = std::move(segments);
    return true;
}

bool computeStrandRatio(Object const& strands, Nexil::Array<float>& ratios, Nexil::RuntimeServices const*)
{
    if (!Object::isA(strands, *Geometry::getStrandPrototype()))
        return false;
    std::uint64_t const pointCount = Geometry::getElementCount(strands, Geometry::sPointComp);
    std::uint64_t const strandCount = Geometry::getElementCount(strands, Geometry::sStrandComp);
    auto result = zeros<float>(pointCount);
    if (auto const offsets = dataOf<unsigned int>(strands, Geometry::sStrandOffset))
        forEachStrand(offsets, strandCount, pointCount, grain::kMeasureStrands, [&](std::size_t, IndexRange range) {
            if (range.begin + 1 >= range.end)
                return;
            float const last = static_cast<float>(range.end - range.begin - 1);
            for (std::uint64_t i = range.begin; i < range.end; ++i)
                result[i] = static_cast<float>(i - range.begin) / last;
        });
    ratios = std::move(result);
    return true;
}

} // namespace Veldrin::GeometryAlgorithms
