#pragma once

#include <veldrin/object/Object.h>

#include <cstddef>
#include <string>
#include <string_view>
#include <vector>

namespace Zon {

/// Selects points by where they are: "y > 0.1 & x <= 3".
///
/// Comparisons of x, y or z with a number, by <, <=, >, >=, == or !=, joined by '&'. A number means the float nearest to
/// it, so that "y == 0.1" finds what an import made from "0.1".
class PositionRule {
public:
    /// Errors: Failure that shows where the text is wrong.
    explicit PositionRule(std::string_view text);

    /// A flag per point; null when the object has no positions.
    [[nodiscard]] Nexil::Ptr<Nexil::Array<bool>> select(Veldrin::Object const& geometry) const;

private:
    enum class Comparison { Less, LessOrEqual, Greater, GreaterOrEqual, Equal, NotEqual };
    struct Term {
        int axis;
        Comparison comparison;
        float number;
    };
    static Term readTerm(std::string_view text, std::size_t& place);
    static bool holds(Term const& term, float coordinate) noexcept;

    std::vector<Term> terms_;
};

/// Throws Failure: the message, the text, and a mark under the byte at `offset`.
[[noreturn]] void failAt(std::string_view what, std::string_view text, std::size_t offset, std::string_view message);

} // namespace Zon
