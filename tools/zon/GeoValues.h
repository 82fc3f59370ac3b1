#pragma once

#include <nexil/Array.h>
#include <nexil/Ptr.h>
#include <veldrin/geometry/GeoPropertyCreation.h>
#include <veldrin/geometry/Names.h>
#include <veldrin/object/Object.h>
#include <veldrin/object/Properties.h>

#include <utility>

/// Values on the elements of an object, stored as geo properties. Arrays are shared out and moved in, not copied.
namespace Zon {

/// The "data" of the property of this name; null when there is none of this type.
template <class T>
[[nodiscard]] Nexil::Ptr<Nexil::Array<T>> dataOf(Veldrin::Object const& object, Nexil::String const& name)
{
    auto const property = Veldrin::getPropertyAs<Nexil::Ptr<Veldrin::Object>>(object, name);
    return property ? Veldrin::getPropertyAs<Nexil::Ptr<Nexil::Array<T>>>(*property, Veldrin::Geometry::sData)
                    : nullptr;
}

/// Values shared out to the corners of faces. A corner without one has the index `kInvalidIndex`.
template <class T>
struct CornerValues {
    Nexil::Array<T> values;
    Nexil::Array<unsigned int> indices;
};

/// One value per element of a component, as data that targets it.
template <class T>
void storeElementValues(Nexil::String const& name, Nexil::String const& component, Nexil::Array<T>&& values,
                        Veldrin::Object& object)
{
    auto data = Veldrin::createObject();
    Veldrin::Geometry::createDataGeoProperty(T{}, component, Nexil::makePtr<Nexil::Array<T>>(std::move(values)), *data);
    Veldrin::setProperty(object, name, std::move(data));
}

/// The values as data under `name`, behind a range of the indices over the face-vertices.
template <class T>
void storeCornerValues(Nexil::String const& name, CornerValues<T>&& corners, Veldrin::Object& mesh)
{
    auto const rangeName = Veldrin::Geometry::getGeoPropRangeName(name);
    auto range = Veldrin::createObject();
    Veldrin::Geometry::populateRangeGeoProperty(Nexil::makePtr<Nexil::Array<unsigned int>>(std::move(corners.indices)),
                                                Veldrin::Geometry::sFaceVertexComp, *range);
    Veldrin::setProperty(mesh, rangeName, std::move(range));
    storeElementValues(name, rangeName, std::move(corners.values), mesh);
}

} // namespace Zon
