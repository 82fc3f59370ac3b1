#pragma once

#include <nexil/Array.h>
#include <nexil/Ptr.h>
#include <veldrin/geometry/Export.h>

/// A location on a geometry, as a value of properties.
///
///     Geometry::Common::GeoLocation location;
///     location.ids[0] = faceIndex;
///     location.params[0] = 0.25f;
///     setProperty(*object, "pinned_at", location);
namespace Veldrin::Geometry::Common {

/// A location on a geometry that carries its own interpolation arrays. What the numbers mean is up to whoever makes
/// the location; it is only copied, moved and compared here.
///
/// Cost: a copy shares both arrays. Moving takes them and leaves null pointers behind; its numbers stay.
struct VELDRIN_API GeoLocation {
    unsigned int ids[6];
    float params[4];
    /// Elements that the location interpolates between; null only in a location that was moved from.
    Nexil::Ptr<Nexil::Array<unsigned int>> indices;
    /// Their weights; null only in a location that was moved from.
    Nexil::Ptr<Nexil::Array<float>> weights;

    /// All numbers 0, two new empty arrays. Errors: std::bad_alloc.
    GeoLocation();
    GeoLocation(GeoLocation const&) noexcept;
    GeoLocation(GeoLocation&&) noexcept;
    GeoLocation& operator=(GeoLocation const&) noexcept;
    GeoLocation& operator=(GeoLocation&&) noexcept;
    ~GeoLocation();

    /// Equal numbers and equal arrays. A NaN equals nothing, so a location that holds one differs from itself; within
    /// an array that both share, nothing is compared. A null array equals only a null one.
    [[nodiscard]] bool operator==(GeoLocation const& other) const noexcept;
    [[nodiscard]] bool operator!=(GeoLocation const& other) const noexcept;
};

} // namespace Veldrin::Geometry::Common
