#include <veldrin/algorithms/internal/RisingOffsets.h>

#include <nexil/parallel/Parallel.h>

namespace Veldrin::Geometry {

namespace {

    namespace grain {
        constexpr std::size_t kOffsets = 16384;
    } // namespace grain

    struct Shape {
        bool isRising = true;
        bool isUniform = true;
    };

    // Both loops run to their end and join by bits, so that they become vector code.

    bool haveSize(unsigned int const* offsets, std::size_t begin, std::size_t end, unsigned int size) noexcept
    {
        unsigned int difference = 0;
        for (std::size_t i = begin; i < end; ++i)
            difference |= (offsets[i + 1] - offsets[i]) ^ size;
        return difference == 0;
    }

    bool rise(unsigned int const* offsets, std::size_t begin, std::size_t end) noexcept
    {
        unsigned int falls = 0;
        for (std::size_t i = begin; i < end; ++i)
            falls |= offsets[i + 1] < offsets[i] ? 1u : 0u;
        return falls == 0;
    }

    Shape shapeOf(unsigned int const* offsets, std::uint64_t rangeCount)
    {
        if (rangeCount == 0)
            return {};
        // Ranges of one size that begin at 0 rise unless they run over what 32 bits count. Differences wrap, so each chunk
        // has to begin where such ranges would.
        unsigned int const size = offsets[1];
        bool const mayBeUniform = offsets[0] == 0 && size * rangeCount == offsets[rangeCount];
        return Nexil::parallel::reduceInOrder(
            rangeCount, grain::kOffsets, Shape{true, mayBeUniform},
            [&](std::size_t begin, std::size_t end, Shape shape) {
                shape.isUniform = shape.isUniform && offsets[begin] == size * std::uint64_t(begin) &&
                                  haveSize(offsets, begin, end, size);
                shape.isRising = shape.isRising && (shape.isUniform || rise(offsets, begin, end));
                return shape;
            },
            [](Shape left, Shape right) {
                return Shape{left.isRising && right.isRising, left.isUniform && right.isUniform};
            });
    }

    IndexArray raised(Nexil::Array<unsigned int> const& offsets, std::uint64_t rangeCount)
    {
        auto result = Nexil::makeMutable<Nexil::Array<unsigned int>>();
        Nexil::Internal::resizeUninitialized(*result, rangeCount + 1);
        unsigned int highest = 0;
        for (std::uint64_t i = 0; i <= rangeCount; ++i)
            (*result)[i] = highest = std::max(highest, offsets[i]);
        return result;
    }

} // namespace

RisingOffsets::RisingOffsets(IndexArray offsets, std::uint64_t rangeCount)
    : offsets_(std::move(offsets)), count_(rangeCount)
{
    Shape const shape = shapeOf(offsets_->data(), count_);
    isUnchanged_ = shape.isRising;
    if (!shape.isRising)
        offsets_ = raised(*offsets_, count_);
    else if (shape.isUniform && count_ > 0)
        uniformSize_ = data()[1];
}

} // namespace Veldrin::Geometry
