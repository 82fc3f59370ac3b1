#include "MeshArrays.h"

#include <veldrin/geometry/GeoPropertyCreation.h>
#include <veldrin/geometry/Names.h>
#include <veldrin/geometry/Population.h>
#include <veldrin/object/Properties.h>

#include <utility>

namespace Zon {

namespace {

    using namespace Veldrin;

    template <class T>
    void addCornerValues(char const* name, CornerValues<T>&& corners, Object& mesh)
    {
        auto const rangeName = Geometry::getGeoPropRangeName(name);
        auto range = createObject();
        Geometry::populateRangeGeoProperty(Nexil::makePtr<Nexil::Array<unsigned int>>(std::move(corners.indices)),
                                           Geometry::sFaceVertexComp, *range);
        auto data = createObject();
        Geometry::createDataGeoProperty(T{}, rangeName, Nexil::makePtr<Nexil::Array<T>>(std::move(corners.values)),
                                        *data);
        setProperty(mesh, rangeName, std::move(range));
        setProperty(mesh, name, std::move(data));
    }

} // namespace

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
        addCornerValues(Geometry::sFaceVertexNormal, std::move(*arrays.cornerNormals), *object);
    if (arrays.cornerUVs)
        addCornerValues(Geometry::sFaceVertexUV, std::move(*arrays.cornerUVs), *object);
    if (!arrays.pointNormals.empty()) {
        auto normals = createObject();
        Geometry::createDataGeoProperty(Math::float3{}, Geometry::sPointComp,
                                        Nexil::makePtr<Nexil::Array<Math::float3>>(std::move(arrays.pointNormals)),
                                        *normals);
        setProperty(*object, Geometry::sPointNormal, std::move(normals));
    }
    if (arrays.name)
        setProperty(*object, "name", Nexil::String(std::string_view(*arrays.name)));
    return Nexil::Ptr<Object>(std::move(object));
}

} // namespace Zon
