#pragma once

#include <nexil/Array.h>
#include <nexil/Ptr.h>
#include <veldrin/validation/GeoValidator.h>

#include <cstdint>
#include <map>
#include <optional>
#include <variant>

namespace Veldrin::Geometry::Internal {

/// Data over a range, where the values of the indices decide.
struct IndexQuestion {
    Nexil::String property;
    Nexil::String range;
    Nexil::Ptr<Nexil::Array<unsigned int>> indices;
    std::uint64_t valueCount = 0;
    /// Whether the last index may be an end, which equals the number of values.
    bool mayHaveEnd = false;
};

/// What types and sizes say of a property: it passes, it fails, or indices decide.
using PropertyVerdict = std::variant<std::monostate, GeoValidator::Failure, IndexQuestion>;

/// Judges the property under `name` but for the values of indices. Cost: constant in the elements.
[[nodiscard]] PropertyVerdict judgeGeoProperty(Object const& geometry, Nexil::String const& name);

/// Answers the questions that are left. Each array is read once, however many properties share it.
class IndexAnswers {
public:
    [[nodiscard]] std::optional<GeoValidator::Failure> failureOf(IndexQuestion const& question);

private:
    struct Known {
        // Keeps the address from being given to another array meanwhile.
        Nexil::Ptr<Nexil::Array<unsigned int>> indices;
        /// How many values all indices but the last ask for.
        unsigned int boundBeforeLast;
    };

    [[nodiscard]] unsigned int boundBeforeLast(Nexil::Ptr<Nexil::Array<unsigned int>> const& indices);

    std::map<unsigned int const*, Known> known_;
};

} // namespace Veldrin::Geometry::Internal
