#include <veldrin/validation/StrandValidator.h>

#include <veldrin/geometry/GeoProperties.h>
#include <veldrin/geometry/Prototypes.h>
#include <veldrin/validation/internal/Findings.h>
#include <veldrin/validation/internal/GeoPropertiesCheck.h>
#include <veldrin/validation/internal/Messages.h>
#include <veldrin/validation/internal/OffsetCheck.h>

namespace Veldrin::Geometry {

namespace {

    void judgeStrand(Object const& strand, Internal::Findings& findings)
    {
        if (!Object::isA(strand, *getStrandPrototype()) && !findings.take(Internal::notOfKind("strand")))
            return;
        if (findings.take(Internal::offsetFailure(strand, sStrandOffset, getElementCount(strand, sPointComp))))
            Internal::judgeGeoProperties(strand, findings);
    }

} // namespace

GeoValidator::Status StrandValidator::validate(Object const& object)
{
    return Internal::firstFailure(object, judgeStrand);
}

Nexil::Array<GeoValidator::Failure> StrandValidator::findFailures(Object const& object) const
{
    return Internal::everyFailure(object, judgeStrand);
}

} // namespace Veldrin::Geometry
