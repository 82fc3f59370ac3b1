#include "MeshArrays.h"

#include <veldrin/geometry/Population.h>
#include <veldrin/object/Properties.h>

#include <utility>

namespace Zon {

using namespace Veldrin;

Nexil::Ptr<Object> makeObject(MeshArrays&& arrays)
{
    auto object = createObject();
    auto positions = Nexil::makePtr<Nexil::Array<Math::float3>>(std::move(arrays.positions));
    bool const populated =
        arrays.faceCount() == 0
            ? Geometry::populatePointCloud(std::move(positions), *object)
            : Geometry::populateMesh(std::move(positions),
                                     Nexil::makePtr<Nexil::Array<unsigned int>>(std::move(arrays.corners)),
                                     Nexil::makePtr<Nexil::Array<unsigned int>>(std::move(arrays.offsets)), *object);
    if (!populated)
        return nullptr;
    if (arrays.cornerNormals)
        storeCornerValues(Geometry::sFaceVertexNormal, std::move(*arrays.cornerNormals), *object);
    if (arrays.cornerUVs)
        storeCornerValues(Geometry::sFaceVertexUV, std::move(*arrays.cornerUVs), *object);
    if (!arrays.pointNormals.empty())
        storeElementValues(Geometry::sPointNormal, Geometry::sPointComp, std::move(arrays.pointNormals), *object);
    if (arrays.name)
        setProperty(*object, "name", Nexil::String(std::string_view(*arrays.name)));
    return Nexil::Ptr<Object>(std::move(object));
}

} // namespace Zon
