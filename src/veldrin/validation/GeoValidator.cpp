#include <veldrin/validation/GeoValidator.h>

#include <nexil/parallel/Parallel.h>
#include <veldrin/validation/internal/Findings.h>
#include <veldrin/validation/internal/GeoPropertiesCheck.h>
#include <veldrin/validation/internal/GeoPropertyCheck.h>
#include <veldrin/validation/internal/Messages.h>

#include <iterator>
#include <vector>

namespace Veldrin::Geometry {

namespace Internal {

    namespace {

        namespace grain {
            constexpr std::size_t kKeys = 1024;
        } // namespace grain

        /// Verdicts other than a pass, in the order of keys.
        using Verdicts = std::vector<PropertyVerdict>;

        bool endsInFailure(Verdicts const& verdicts)
        {
            return !verdicts.empty() && std::holds_alternative<Failure>(verdicts.back());
        }

        Verdicts judgeTypesAndSizes(Object const& object, Nexil::Array<Nexil::String> const& keys,
                                    Findings const& findings)
        {
            bool const stopsAtFailure = findings.wantsOneOnly();
            return Nexil::parallel::reduceInOrder(
                keys.size(), grain::kKeys, Verdicts(),
                [&](std::size_t begin, std::size_t end, Verdicts verdicts) {
                    for (std::size_t key = begin; key < end; ++key) {
                        if (stopsAtFailure && endsInFailure(verdicts))
                            break;
                        if (findings.hasFailed(keys[key]))
                            continue;
                        auto verdict = judgeGeoProperty(object, keys[key]);
                        if (!std::holds_alternative<std::monostate>(verdict))
                            verdicts.push_back(std::move(verdict));
                    }
                    return verdicts;
                },
                [](Verdicts left, Verdicts right) {
                    left.insert(left.end(), std::move_iterator(right.begin()), std::move_iterator(right.end()));
                    return left;
                });
        }

    } // namespace

    void judgeGeoProperties(Object const& object, Findings& findings)
    {
        // Indices are read behind the first failure by type or size only when all failures are wanted.
        auto verdicts = judgeTypesAndSizes(object, object.keys(), findings);
        IndexAnswers answers;
        for (PropertyVerdict& verdict : verdicts) {
            auto* const failure = std::get_if<Failure>(&verdict);
            if (!findings.take(failure ? std::move(*failure) : answers.failureOf(std::get<IndexQuestion>(verdict))))
                return;
        }
    }

} // namespace Internal

GeoValidator::~GeoValidator() = default;

GeoValidator::Status GeoValidator::validate(Object const& object)
{
    return Internal::firstFailure(object, Internal::judgeGeoProperties);
}

Nexil::Array<GeoValidator::Failure> GeoValidator::findFailures(Object const& object) const
{
    return Internal::everyFailure(object, Internal::judgeGeoProperties);
}

} // namespace Veldrin::Geometry
