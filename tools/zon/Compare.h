#pragma once

#include "ZonFile.h"

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

namespace Zon {

/// One place where two lists of objects are not the same.
struct Difference {
    /// From the top: "object 0", names of properties, "[5]" for elements.
    std::vector<std::string> path;
    /// "value", "type", "size", "missing", "order" or "null".
    std::string what;
    /// What stands there on either side.
    std::string first;
    std::string second;
};

struct CompareOptions {
    /// Floats this far apart, and 0 and -0, count as equal. Without one, floats are equal when their bits are.
    std::optional<double> tolerance;
    /// The comparison ends after so many.
    std::uint64_t maxDifferences = 20;
};

/// The differences of two lists of objects, in everything that a file holds: types, values, order of properties.
///
/// NaN equals NaN of the same bits and nothing else. Which properties share one array is not compared.
/// Cost: linear also where objects and arrays are shared: no pair of them is compared twice. Nesting needs no stack.
[[nodiscard]] std::vector<Difference> compare(Objects const& first, Objects const& second,
                                              CompareOptions const& options);

/// The path in one line: "object 0/point_position/data/[5]".
[[nodiscard]] std::string pathText(Difference const& difference);

} // namespace Zon
