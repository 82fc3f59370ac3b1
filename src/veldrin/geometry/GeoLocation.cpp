#include <veldrin/geometry/GeoLocation.h>

#include <algorithm>
#include <utility>

namespace Veldrin::Geometry::Common {

namespace {

    template <class T>
    bool equalArrays(Nexil::Ptr<Nexil::Array<T>> const& a, Nexil::Ptr<Nexil::Array<T>> const& b) noexcept
    {
        if (a == b)
            return true;
        return a && b && *a == *b;
    }

} // namespace

GeoLocation::GeoLocation()
    : ids{}, params{}, indices(Nexil::makePtr<Nexil::Array<unsigned int>>()),
      weights(Nexil::makePtr<Nexil::Array<float>>())
{
}

GeoLocation::GeoLocation(GeoLocation const&) noexcept = default;
GeoLocation::GeoLocation(GeoLocation&&) noexcept = default;
GeoLocation& GeoLocation::operator=(GeoLocation const&) noexcept = default;

GeoLocation& GeoLocation::operator=(GeoLocation&& other) noexcept
{
    if (this != &other) {
        std::copy(std::begin(other.ids), std::end(other.ids), ids);
        std::copy(std::begin(other.params), std::end(other.params), params);
        indices = std::move(other.indices);
        weights = std::move(other.weights);
    }
    return *this;
}

GeoLocation::~GeoLocation() = default;

bool GeoLocation::operator==(GeoLocation const& other) const noexcept
{
    return std::equal(std::begin(ids), std::end(ids), other.ids) &&
           std::equal(std::begin(params), std::end(params), other.params) && equalArrays(indices, other.indices) &&
           equalArrays(weights, other.weights);
}

bool GeoLocation::operator!=(GeoLocation const& other) const noexcept
{
    return !(*this == other);
}

} // namespace Veldrin::Geometry::Common
