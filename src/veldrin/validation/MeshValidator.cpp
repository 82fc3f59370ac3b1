#include <veldrin/validation/MeshValidator.h>

#include <veldrin/geometry/GeoProperties.h>
#include <veldrin/geometry/Prototypes.h>
#include <veldrin/math/Vector.h>
#include <veldrin/validation/internal/DataArray.h>
#include <veldrin/validation/internal/Findings.h>
#include <veldrin/validation/internal/GeoPropertiesCheck.h>
#include <veldrin/validation/internal/IndexScan.h>
#include <veldrin/validation/internal/Messages.h>
#include <veldrin/validation/internal/OffsetCheck.h>

namespace Veldrin::Geometry {

namespace {

    using Internal::Failure;
    using Internal::Findings;

    std::optional<Failure> prototypeFailure(Object const& mesh)
    {
        if (Object::isA(mesh, *getMeshPrototype()))
            return std::nullopt;
        return Internal::notOfKind("mesh");
    }

    std::optional<Failure> positionFailure(Object const& mesh)
    {
        auto const positions = Internal::dataArray<Math::float3>(mesh, sPointPosition);
        if (!positions)
            return Internal::invalidField(sPointPosition, sData);
        if (positions->size() < getElementCount(mesh, sPointComp))
            return Internal::tooFewElements(sPointPosition, sPointPosition);
        return std::nullopt;
    }

    std::optional<Failure> cornerFailure(Object const& mesh)
    {
        auto const points = Internal::dataArray<unsigned int>(mesh, sFaceVertex);
        if (!points)
            return Internal::invalidField(sFaceVertex, sData);
        if (!points->empty() &&
            Internal::largestIndex(points->data(), points->size()) >= getElementCount(mesh, sPointComp))
            return Internal::invalidIndex(sFaceVertex, sFaceVertex, sPointComp);
        return std::nullopt;
    }

    std::optional<Failure> faceFailure(Object const& mesh)
    {
        return Internal::offsetFailure(mesh, sFaceOffset, getElementCount(mesh, sFaceVertexComp));
    }

    void judgeMesh(Object const& mesh, Findings& findings)
    {
        if (findings.take(prototypeFailure(mesh)) && findings.take(positionFailure(mesh)) &&
            findings.take(cornerFailure(mesh)) && findings.take(faceFailure(mesh)))
            Internal::judgeGeoProperties(mesh, findings);
    }

} // namespace

GeoValidator::Status MeshValidator::validate(Object const& object)
{
    return Internal::firstFailure(object, judgeMesh);
}

Nexil::Array<GeoValidator::Failure> MeshValidator::findFailures(Object const& object) const
{
    return Internal::everyFailure(object, judgeMesh);
}

GeoValidator::Status validateMesh(Object const& mesh)
{
    return MeshValidator().validate(mesh);
}

} // namespace Veldrin::Geometry
