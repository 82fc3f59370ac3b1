#include "GeometryKind.h"

#include <veldrin/geometry/Names.h>
#include <veldrin/geometry/Prototypes.h>

#include <array>

namespace Zon {

using namespace Veldrin;

std::string_view nameOf(GeometryKind kind)
{
    static constexpr std::array<std::string_view, 8> kNames{"level set", "fog volume", "volume",      "instances",
                                                            "mesh",      "strands",    "point cloud", "object"};
    return kNames[static_cast<std::size_t>(kind)];
}

GeometryKind kindOf(Object const& object)
{
    Nexil::Ptr<Object> const prototypes[] = {Geometry::getLevelSetPrototype(),  Geometry::getFogVolumePrototype(),
                                             Geometry::getVolumePrototype(),    Geometry::getInstancesPrototype(),
                                             Geometry::getMeshPrototype(),      Geometry::getStrandPrototype(),
                                             Geometry::getPointCloudPrototype()};
    int kind = 0;
    for (auto const& prototype : prototypes) {
        if (Object::isA(object, *prototype))
            break;
        ++kind;
    }
    return static_cast<GeometryKind>(kind);
}

GeometryKind intendedKindOf(Object const& object)
{
    auto const kind = kindOf(object);
    // Positions alone make a point cloud, though meshes and strands have them too.
    bool const mayBeMore = kind == GeometryKind::None || kind == GeometryKind::PointCloud;
    if (mayBeMore && (object.hasProperty(Geometry::sFaceVertex) || object.hasProperty(Geometry::sFaceOffset)))
        return GeometryKind::Mesh;
    if (mayBeMore && object.hasProperty(Geometry::sStrandOffset))
        return GeometryKind::Strands;
    if (mayBeMore && object.hasProperty(Geometry::sPointPosition))
        return GeometryKind::PointCloud;
    if (mayBeMore && object.hasProperty(Geometry::sVoxelTileTree))
        return GeometryKind::Volume;
    return kind;
}

} // namespace Zon
