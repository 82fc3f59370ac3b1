#include <veldrin/geometry/GeoPropertyCreation.h>

#include <numeric>

namespace Veldrin::Geometry {

void populateComponentGeoProperty(unsigned int count, Object& obj)
{
    obj.setPropertyAny(sCount, count);
}

void populateRangeGeoProperty(Object& range)
{
    populateRangeGeoProperty(nullptr, sNullString, range);
}

bool populateRangeGeoProperty(Nexil::Ptr<Nexil::Array<unsigned int>> indices, Nexil::String const& target,
                              Object& range)
{
    if (!indices)
        indices = Nexil::makePtr<Nexil::Array<unsigned int>>();
    Object made;
    made.setPropertyAny(sIndices, std::move(indices));
    made.setPropertyAny(sTarget, target);
    made.setPropertyAny(sDependsOn, Nexil::makePtr<Nexil::Array<Nexil::String>>());
    return moveProperties(made, range);
}

void populateTrivialRangeIndices(unsigned long long count, Nexil::Array<unsigned int>& indices)
{
    if (count > (1ull << 32))
        return;
    if (count > indices.capacity()) {
        // A fresh array, so that values about to be overwritten are not moved along.
        Nexil::Array<unsigned int> fresh;
        fresh.reserve(count);
        indices.swap(fresh);
    }
    Nexil::Internal::resizeUninitialized(indices, count);
    std::iota(indices.begin(), indices.end(), 0u);
}

Nexil::String getGeoPropRangeName(Nexil::String const& name)
{
    return name + sIndexSuffix;
}

} // namespace Veldrin::Geometry
