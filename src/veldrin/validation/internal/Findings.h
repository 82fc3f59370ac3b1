#pragma once

#include <veldrin/validation/GeoValidator.h>

#include <optional>
#include <set>
#include <utility>

namespace Veldrin::Geometry::Internal {

/// The failures met so far, and whether to look for more.
///
///     return findings.take(positionFailure(mesh)) && findings.take(cornerFailure(mesh));
class Findings {
public:
    enum class Extent { FirstFailure, EveryProperty };

    explicit Findings(Extent extent) noexcept : extent_(extent) {}

    /// Notes a failure, if there is one; false when that ends the work.
    bool take(std::optional<GeoValidator::Failure> failure)
    {
        if (!failure)
            return true;
        if (wantsOneOnly() && !failures_.empty())
            return false;
        failedProperties_.insert(failure->property);
        failures_.push_back(std::move(*failure));
        return !wantsOneOnly();
    }

    [[nodiscard]] bool wantsOneOnly() const noexcept { return extent_ == Extent::FirstFailure; }
    /// Whether a property has failed and is left out from there on.
    [[nodiscard]] bool hasFailed(Nexil::String const& property) const { return failedProperties_.contains(property); }

    [[nodiscard]] Nexil::Array<GeoValidator::Failure> all() && { return std::move(failures_); }
    [[nodiscard]] GeoValidator::Status first() &&
    {
        return failures_.empty() ? GeoValidator::Status() : std::move(failures_[0].status);
    }

private:
    Extent extent_;
    Nexil::Array<GeoValidator::Failure> failures_;
    std::set<Nexil::String> failedProperties_;
};

/// Runs judge(object, findings) for the first failure.
template <class Judge>
[[nodiscard]] GeoValidator::Status firstFailure(Object const& object, Judge const& judge)
{
    Findings findings(Findings::Extent::FirstFailure);
    judge(object, findings);
    return std::move(findings).first();
}

/// Runs judge(object, findings) for all failures.
template <class Judge>
[[nodiscard]] Nexil::Array<GeoValidator::Failure> everyFailure(Object const& object, Judge const& judge)
{
    Findings findings(Findings::Extent::EveryProperty);
    judge(object, findings);
    return std::move(findings).all();
}

} // namespace Veldrin::Geometry::Internal
