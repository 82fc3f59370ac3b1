#include <veldrin/algorithms/ComponentConversion.h>

#include <nexil/parallel/Parallel.h>
#include <veldrin/algorithms/internal/TopologyArrays.h>

#include <algorithm>
#include <atomic>
#include <vector>

namespace Veldrin::Geometry {

namespace {

    using Mask = Nexil::Array<bool>;
    using MaskPtr = Nexil::Ptr<Mask>;

    namespace grain {
        constexpr std::size_t kElements = 1024;
    } // namespace grain

    /// The mask of a destination component, all false, until it is handed out.
    class Destination {
    public:
        Destination(Object const& geometry, char const* component, bool* success)
            : mask_(Nexil::makeMutable<Mask>()), success_(success)
        {
            mask_->resize(getElementCount(geometry, component));
        }

        [[nodiscard]] std::uint64_t size() const noexcept { return mask_->size(); }
        [[nodiscard]] bool* flags() noexcept { return mask_->data(); }

        MaskPtr finish(bool isConverted)
        {
            if (success_)
                *success_ = isConverted;
            return std::move(mask_);
        }

    private:
        Nexil::MutablePtr<Mask> mask_;
        bool* success_;
    };

    /// Sets flags of a destination, also from several threads at once; indices beyond it are dropped.
    class Marker {
    public:
        explicit Marker(Destination& destination) : flags_(destination.flags()), size_(destination.size()) {}

        void operator()(std::uint64_t index) const noexcept
        {
            if (index < size_)
                std::atomic_ref<bool>(flags_[index]).store(true, std::memory_order_relaxed);
        }

    private:
        bool* flags_;
        std::uint64_t size_;
    };

    /// Calls body(i) for every i below `count`.
    template <class Body>
    void forEach(std::uint64_t count, Body const& body)
    {
        Nexil::parallel::forRange(count, grain::kElements, [&](std::size_t begin, std::size_t end) {
            // A copy: after each atomic store, what is read through a reference is read again.
            Body const own = body;
            for (std::size_t i = begin; i < end; ++i)
                own(i);
        });
    }

    /// Whether a range is selected: any or all of isSelected(i) over it, and never for an empty one.
    template <class IsSelected>
    bool isRangeSelected(IndexRange range, TagConversionStyle style, IsSelected const& isSelected)
    {
        // What decides before the end: a selected element for "any", an unselected one for "all".
        bool const decisive = style != TagConversionStyle::AllElements;
        for (std::uint64_t i = range.begin; i < range.end; ++i)
            if (isSelected(i) == decisive)
                return decisive;
        return !decisive && range.begin < range.end;
    }

    /// A mask as its source component has it: what is missing or surplus reads as unselected.
    class Source {
    public:
        Source(Object const& geometry, char const* component, Mask const& mask)
            : flags_(mask.data()), size_(std::min<std::uint64_t>(mask.size(), getElementCount(geometry, component)))
        {
        }

        [[nodiscard]] std::uint64_t size() const noexcept { return size_; }
        [[nodiscard]] bool operator[](std::uint64_t index) const noexcept { return index < size_ && flags_[index]; }

    private:
        bool const* flags_;
        std::uint64_t size_;
    };

    /// Calls body(i) for every range below `count`, in parallel. False, and not all of them are visited, where offsets
    /// fall: ranges overlap then, and to go over each could take the square of the time.
    template <class Body>
    bool forEachRange(OffsetRanges const& ranges, std::uint64_t count, Body const& body)
    {
        std::atomic<bool> areRising{true};
        Nexil::parallel::forRange(count, grain::kElements, [&](std::size_t begin, std::size_t end) {
            if (!areRising.load(std::memory_order_relaxed))
                return;
            if (!ranges.rise(begin, end)) {
                areRising.store(false, std::memory_order_relaxed);
                return;
            }
            // A copy: after each atomic store, what is read through a reference is read again.
            Body const own = body;
            for (std::size_t i = begin; i < end; ++i)
                own(i);
        });
        return areRising.load(std::memory_order_relaxed);
    }

    /// Gathers over ranges: destination i from isSelected over its own range.
    template <class IsSelected>
    void gather(Destination& destination, OffsetRanges const& ranges, TagConversionStyle style,
                IsSelected const& isSelected)
    {
        std::uint64_t const count = std::min(ranges.count(), destination.size());
        bool* const flags = destination.flags();
        if (forEachRange(ranges, count,
                         [&, flags](std::uint64_t i) { flags[i] = isRangeSelected(ranges[i], style, isSelected); }))
            return;
        // Ranges that overlap: for each element where the next one is that decides.
        bool const decisive = style != TagConversionStyle::AllElements;
        Nexil::Array<std::uint64_t> deciding;
        Nexil::Internal::resizeUninitialized(deciding, ranges.limit());
        for (std::uint64_t i = ranges.limit(), next = i; i-- > 0;)
            deciding[i] = next = isSelected(i) == decisive ? i : next;
        forEach(count, [=, next = deciding.data()](std::uint64_t i) {
            IndexRange const range = ranges[i];
            flags[i] = range.begin < range.end && (next[range.begin] < range.end) == decisive;
        });
    }

    /// Scatters from ranges: every element of a selected range reaches visit(element).
    template <class Visit>
    void scatter(OffsetRanges const& ranges, Source const& source, Visit const& visit)
    {
        std::uint64_t const count = std::min(ranges.count(), source.size());
        if (forEachRange(ranges, count, [=](std::uint64_t i) {
                if (!source[i])
                    return;
                IndexRange const range = ranges[i];
                for (std::uint64_t k = range.begin; k < range.end; ++k)
                    visit(k);
            }))
            return;
        // Ranges that overlap: from left to right, each from where those before it ended.
        std::vector<IndexRange> selected;
        for (std::uint64_t i = 0; i < count; ++i)
            if (source[i] && ranges[i].begin < ranges[i].end)
                selected.push_back(ranges[i]);
        std::sort(selected.begin(), selected.end(),
                  [](IndexRange const& a, IndexRange const& b) { return a.begin < b.begin; });
        std::uint64_t next = 0;
        for (IndexRange const& range : selected)
            for (next = std::max(next, range.begin); next < range.end; ++next)
                visit(next);
    }

    /// From elements of `sourceName` to the elements that own ranges of them.
    MaskPtr gatherOverOffsets(Object const& geometry, char const* destinationName, char const* offsetName,
                              char const* sourceName, Mask const& mask, TagConversionStyle style, bool* success)
    {
        Destination destination(geometry, destinationName, success);
        auto const offsets = dataOf<unsigned int>(geometry, offsetName);
        if (!offsets)
            return destination.finish(false);
        Source const source(geometry, sourceName, mask);
        // All beyond the source is unselected: looking at one of them decides as well as looking at each.
        gather(destination, OffsetRanges(*offsets, source.size() + 1), style,
               [&](std::uint64_t i) { return source[i]; });
        return destination.finish(true);
    }

    /// From elements that own ranges of `destinationName` to those.
    MaskPtr scatterOverOffsets(Object const& geometry, char const* destinationName, char const* offsetName,
                               char const* sourceName, Mask const& mask, bool* success)
    {
        Destination destination(geometry, destinationName, success);
        auto const offsets = dataOf<unsigned int>(geometry, offsetName);
        if (!offsets)
            return destination.finish(false);
        scatter(OffsetRanges(*offsets, destination.size()), Source(geometry, sourceName, mask), Marker(destination));
        return destination.finish(true);
    }

} // namespace

MaskPtr faceVerticesToFaces(Object const& geometry, Mask const& mask, TagConversionStyle style, bool* success)
{
    return gatherOverOffsets(geometry, sFaceComp, sFaceOffset, sFaceVertexComp, mask, style, success);
}

MaskPtr pointsToStrands(Object const& geometry, Mask const& mask, TagConversionStyle style, bool* success)
{
    return gatherOverOffsets(geometry, sStrandComp, sStrandOffset, sPointComp, mask, style, success);
}

MaskPtr pointsToFaces(Object const& geometry, Mask const& mask, TagConversionStyle style, bool* success)
{
    Destination destination(geometry, sFaceComp, success);
    auto const offsets = dataOf<unsigned int>(geometry, sFaceOffset);
    auto const corners = dataOf<unsigned int>(geometry, sFaceVertex);
    if (!offsets || !corners)
        return destination.finish(false);
    Source const source(geometry, sPointComp, mask);
    gather(destination, OffsetRanges(*offsets, corners->size()), style,
           [&, points = corners->data()](std::uint64_t i) { return source[points[i]]; });
    return destination.finish(true);
}

MaskPtr pointsToFaceVertices(Object const& geometry, Mask const& mask, bool* success)
{
    Destination destination(geometry, sFaceVertexComp, success);
    auto const corners = dataOf<unsigned int>(geometry, sFaceVertex);
    if (!corners)
        return destination.finish(false);
    Source const source(geometry, sPointComp, mask);
    forEach(std::min(corners->size(), destination.size()), [&, flags = destination.flags(), points = corners->data()](
                                                               std::uint64_t i) { flags[i] = source[points[i]]; });
    return destination.finish(true);
}

MaskPtr faceVerticesToPoints(Object const& geometry, Mask const& mask, bool* success)
{
    Destination destination(geometry, sPointComp, success);
    auto const corners = dataOf<unsigned int>(geometry, sFaceVertex);
    if (!corners)
        return destination.finish(false);
    Source const source(geometry, sFaceVertexComp, mask);
    forEach(std::min(corners->size(), source.size()),
            [source, points = corners->data(), mark = Marker(destination)](std::uint64_t i) {
                if (source[i])
                    mark(points[i]);
            });
    return destination.finish(true);
}

MaskPtr facesToFaceVertices(Object const& geometry, Mask const& mask, bool* success)
{
    return scatterOverOffsets(geometry, sFaceVertexComp, sFaceOffset, sFaceComp, mask, success);
}

MaskPtr strandsToPoints(Object const& geometry, Mask const& mask, bool* success)
{
    return scatterOverOffsets(geometry, sPointComp, sStrandOffset, sStrandComp, mask, success);
}

MaskPtr facesToPoints(Object const& geometry, Mask const& mask, bool* success)
{
    Destination destination(geometry, sPointComp, success);
    auto const offsets = dataOf<unsigned int>(geometry, sFaceOffset);
    auto const corners = dataOf<unsigned int>(geometry, sFaceVertex);
    if (!offsets || !corners)
        return destination.finish(false);
    scatter(OffsetRanges(*offsets, corners->size()), Source(geometry, sFaceComp, mask),
            [points = corners->data(), mark = Marker(destination)](std::uint64_t i) { mark(points[i]); });
    return destination.finish(true);
}

} // namespace Veldrin::Geometry
