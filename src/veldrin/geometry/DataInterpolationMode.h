#pragma once

namespace Veldrin::Geometry::Common {

/// How values are taken between the elements that carry data; the numbers are stored in files.
enum class DataInterpolationMode : unsigned int {
    Nearest = 0,      ///< the value of the nearest element
    Linear = 1,       ///< weighted between elements; what a new data geo property has
    DefaultValue = 2, ///< the property's default
};

} // namespace Veldrin::Geometry::Common
