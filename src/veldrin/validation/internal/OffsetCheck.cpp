#include <veldrin/validation/internal/OffsetCheck.h>

#include <veldrin/geometry/GeoProperties.h>
#include <veldrin/object/Properties.h>
#include <veldrin/validation/internal/DataArray.h>
#include <veldrin/validation/internal/IndexScan.h>
#include <veldrin/validation/internal/Messages.h>

namespace Veldrin::Geometry::Internal {

namespace {

    bool areOffsets(Nexil::Array<unsigned int> const& offsets, std::uint64_t rangeCount, std::uint64_t elementCount)
    {
        // Where none falls, the last one is the largest.
        return offsets.size() == rangeCount + 1 && offsets[0] == 0 && offsets[rangeCount] <= elementCount &&
               neverFalls(offsets.data(), offsets.size());
    }

} // namespace

std::optional<Failure> offsetFailure(Object const& geometry, char const* name, std::uint64_t elementCount)
{
    auto const offsets = dataArray<unsigned int>(geometry, name);
    if (!offsets)
        return invalidField(name, sData);
    auto const component = getTargetComponent(geometry, name);
    if (!areOffsets(*offsets, getElementCount(geometry, component), elementCount))
        return invalidIndex(name, name, component);
    return std::nullopt;
}

} // namespace Veldrin::Geometry::Internal
