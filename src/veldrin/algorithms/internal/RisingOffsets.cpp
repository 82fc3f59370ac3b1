#include <veldrin/algorithms/internal/RisingOffsets.h>

#include <nexil/parallel/Parallel.h>

namespace Veldrin::Geometry {

namespace {

    namespace grain {
        constexpr std::size_t kOffsets = 65536;
    } // namespace grain

    struct Shape {
        bool isRising = true;
        bool isUniform = true;
    };

    /// One pass over the offsets, which a compiler turns into vector code: no early exit.
    Shape shapeOf(unsigned int const* offsets, std::uint64_t rangeCount)
    {
        if (rangeCount == 0)
            return {};
        unsigned int const size = offsets[1] - offsets[0];
        return Nexil::parallel::reduceInOrder(
            rangeCount, grain::kOffsets, Shape{},
            [&](std::size_t begin, std::size_t end, Shape shape) {
                bool falls = false;
                bool differs = false;
                for (std::size_t i = begin; i < end; ++i) {
                    falls |= offsets[i + 1] < offsets[i];
                    differs |= offsets[i + 1] - offsets[i] != size;
                }
                return Shape{shape.isRising && !falls, shape.isUniform && !differs};
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
    else if (shape.isUniform && count_ > 0 && first() == 0)
        uniformSize_ = data()[1];
}

} // namespace Veldrin::Geometry
