#pragma once

#include <nexil/Array.h>
#include <nexil/Ptr.h>
#include <nexil/String.h>
#include <veldrin/geometry/DataInterpolationMode.h>
#include <veldrin/geometry/Export.h>
#include <veldrin/geometry/Names.h>
#include <veldrin/object/Properties.h>

#include <type_traits>
#include <utility>

/// Filling empty objects as geo properties: components, data and ranges.
///
///     auto colors = Veldrin::createObject();
///     createDataGeoProperty(Math::float3{1, 1, 1}, sPointComp, std::move(values), *colors);
///     setProperty(*mesh, sPointColor, std::move(colors));
///
/// Arrays are moved in, never copied. Errors: std::bad_alloc, which leaves the object as it was.
namespace Veldrin::Geometry {

/// Sets "count": the number of elements of one kind.
VELDRIN_API void populateComponentGeoProperty(unsigned int count, Object& obj);

/// Fills `geoProp` as data of type T per element of `target`: "data", "target", "depends_on" (empty), "default" and
/// "interpolation_mode" (`Linear`), in this order.
///
/// target: the name of a component or of a range; the number of values is not held against it.
/// data:   moved in; null counts as an empty array.
template <class T>
void createDataGeoProperty(T const& defaultValue, Nexil::String const& target,
                           std::type_identity_t<Nexil::Ptr<Nexil::Array<T>>> data, Object& geoProp)
{
    if (!data)
        data = Nexil::makePtr<Nexil::Array<T>>();
    Object made;
    made.setPropertyAny(sData, std::move(data));
    made.setPropertyAny(sTarget, target);
    made.setPropertyAny(sDependsOn, Nexil::makePtr<Nexil::Array<Nexil::String>>());
    made.setPropertyAny(sDefault, Nexil::Any(defaultValue));
    made.setPropertyAny(sInterp, Common::DataInterpolationMode::Linear);
    moveProperties(made, geoProp);
}

/// The same with an empty array and the target "".
template <class T>
void createDataGeoProperty(T const& defaultValue, Object& geoProp)
{
    createDataGeoProperty<T>(defaultValue, sNullString, nullptr, geoProp);
}

/// Fills `range` as a range without elements and with the target "": "indices", "target" and "depends_on" (empty), in
/// this order.
VELDRIN_API void populateRangeGeoProperty(Object& range);

/// Fills `range` with one index per element of `target` into the values of the data that targets the range.
///
/// indices: moved in; null counts as an empty array. Neither their number nor their values are checked.
/// Returns true; false only from an object that refuses to be written.
VELDRIN_API bool populateRangeGeoProperty(Nexil::Ptr<Nexil::Array<unsigned int>> indices, Nexil::String const& target,
                                          Object& range);

/// Makes `indices` 0, 1, ..., count - 1. More than 2^32 of them have no 32-bit indices: `indices` stays untouched then.
VELDRIN_API void populateTrivialRangeIndices(unsigned long long count, Nexil::Array<unsigned int>& indices);

/// The name of the range that shares out the values of data `name`: `name` followed by "_index".
[[nodiscard]] VELDRIN_API Nexil::String getGeoPropRangeName(Nexil::String const& name);

} // namespace Veldrin::Geometry
