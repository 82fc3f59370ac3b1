#include <veldrin/validation/PointCloudValidator.h>

#include <veldrin/geometry/Prototypes.h>
#include <veldrin/validation/internal/Findings.h>
#include <veldrin/validation/internal/GeoPropertiesCheck.h>
#include <veldrin/validation/internal/Messages.h>

namespace Veldrin::Geometry {

namespace {

    void judgePointCloud(Object const& pointCloud, Internal::Findings& findings)
    {
        if (!Object::isA(pointCloud, *getPointCloudPrototype()) && !findings.take(Internal::notOfKind("point cloud")))
            return;
        Internal::judgeGeoProperties(pointCloud, findings);
    }

} // namespace

GeoValidator::Status PointCloudValidator::validate(Object const& object)
{
    return Internal::firstFailure(object, judgePointCloud);
}

Nexil::Array<GeoValidator::Failure> PointCloudValidator::findFailures(Object const& object) const
{
    return Internal::everyFailure(object, judgePointCloud);
}

} // namespace Veldrin::Geometry
