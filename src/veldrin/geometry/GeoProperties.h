#pragma once

#include <nexil/Array.h>
#include <nexil/Ptr.h>
#include <nexil/String.h>
#include <veldrin/geometry/DataInterpolationMode.h>
#include <veldrin/geometry/Export.h>
#include <veldrin/geometry/GeoPropertyCreation.h>
#include <veldrin/geometry/Names.h>
#include <veldrin/object/Object.h>

/// Reading geometry: how many elements it has, which data it carries, and what that data is attached to.
///
///     using namespace Veldrin;
///     auto cube = createObject();
///     Geometry::populateCubeMesh(2, *cube);
///     Geometry::getElementCount(*cube, Geometry::sPointComp);                // 8
///     Geometry::getTargetChain(*cube, Geometry::sFaceVertexNormal);          // itself, "face_vertex_normal_index",
///                                                                            // "face_vertex_component"
///     auto normals = Geometry::getDataGeoProperty(*cube, Geometry::sFaceVertexNormal);
///     auto values = getPropertyAs<Nexil::Ptr<Nexil::Array<Math::float3>>>(*normals, Geometry::sData); // 6 of them
///
/// Three kinds of sub-objects make a geometry:
/// - a component says how many elements of a kind there are: "count";
/// - data holds one value per element: "data", "target", "depends_on", "default", "interpolation_mode";
/// - a range stands between data and component and shares the values out: "indices", "target", "depends_on".
///
/// Missing and malformed properties read as null, "", an empty array or 0; a value of the wrong type counts as missing.
/// A setter returns false then and leaves the object as it was.
/// Cost: constant whatever the arrays hold; arrays are neither copied nor looked at. Listings visit every property once.
/// Errors: std::bad_alloc. Threads: as of the object.
namespace Veldrin::Geometry {

/// "count" of a component; 0 when it is missing or no unsigned int.
[[nodiscard]] VELDRIN_API unsigned int getElementCount(Object const& component);

/// "count" of the component stored under `name`; 0 when there is none.
[[nodiscard]] VELDRIN_API unsigned int getElementCount(Object const& obj, Nexil::String const& name);

/// Sets "count" of the object under `name`; false when there is no such object.
///
/// The key keeps its place, and the sub-object its address when `obj` held the only reference; otherwise it is copied
/// and other holders keep seeing the old count.
VELDRIN_API bool setElementCount(Nexil::String const& name, unsigned int count, Object& obj);

/// The object under `name` when it is a data geo property of that name: for names that a geometry prototype declares,
/// with that element type, for others with any. Null otherwise.
[[nodiscard]] VELDRIN_API Nexil::Ptr<Object> getDataGeoProperty(Object const& obj, Nexil::String const& name);

/// The object under `name` when it is a range; null otherwise.
[[nodiscard]] VELDRIN_API Nexil::Ptr<Object> getRangeGeoProperty(Object const& obj, Nexil::String const& name);

/// "indices" of a range; null when missing.
[[nodiscard]] VELDRIN_API Nexil::Ptr<Nexil::Array<unsigned int>> getRangeGeoPropIndices(Object const& geoProp);

/// "indices" of the range under `name`; null when there is no range.
[[nodiscard]] VELDRIN_API Nexil::Ptr<Nexil::Array<unsigned int>> getRangeGeoPropIndices(Object const& obj,
                                                                                        Nexil::String const& name);

/// Replaces "indices" of the object under `name`; false when there is no such object. Null counts as an empty array.
/// Places, addresses and other holders as in `setElementCount`.
VELDRIN_API bool setRangeGeoPropIndices(Nexil::String const& name, Nexil::Ptr<Nexil::Array<unsigned int>> indices,
                                        Object& obj);

/// Names of the properties that hold an object which is a `prototype`, in the order of `keys()`.
[[nodiscard]] VELDRIN_API Nexil::Array<Nexil::String> getGeoPropNamesByPrototype(Object const& obj,
                                                                                 Object const& prototype);

/// The same objects themselves.
[[nodiscard]] VELDRIN_API Nexil::Array<Nexil::Ptr<Object>> getGeoPropsByPrototype(Object const& obj,
                                                                                  Object const& prototype);

/// Names of the properties that hold an object whose "target" equals `target`, in the order of `keys()`.
[[nodiscard]] VELDRIN_API Nexil::Array<Nexil::String> getGeoPropNamesByTarget(Object const& obj,
                                                                              Nexil::String const& target);

/// The same objects themselves.
[[nodiscard]] VELDRIN_API Nexil::Array<Nexil::Ptr<Object>> getGeoPropsByTarget(Object const& obj,
                                                                               Nexil::String const& target);

/// Names of the data geo properties that match `pattern`, in the order of `keys()`: '*' stands for any run of
/// characters, '?' for exactly one. None for the empty pattern.
[[nodiscard]] VELDRIN_API Nexil::Array<Nexil::String> getGeoPropsByName(Object const& obj,
                                                                        Nexil::String const& pattern);

/// The object of `obj` that `geoProp` targets; null when the target is missing, empty, of the wrong type, or names
/// nothing.
[[nodiscard]] VELDRIN_API Nexil::Ptr<Object> getGeoPropTarget(Object const& obj, Object const& geoProp);

/// "target" of `geoProp`; "" when missing.
[[nodiscard]] VELDRIN_API Nexil::String getGeoPropTargetName(Object const& geoProp);

/// "target" of the object under `name`; "" when missing.
[[nodiscard]] VELDRIN_API Nexil::String getGeoPropTargetName(Object const& obj, Nexil::String const& name);

/// The names met on the way from `name` to its component: `name` itself first, then each "target" in turn.
///
/// Empty when no object is stored under `name`. A target that names nothing (also "") is the last element; a name met
/// before ends the chain and is not repeated. Cost: n log n in the length of the chain.
[[nodiscard]] VELDRIN_API Nexil::Array<Nexil::String> getTargetChain(Object const& obj, Nexil::String const& name);

/// The last name of that chain, or "".
[[nodiscard]] VELDRIN_API Nexil::String getTargetComponent(Object const& obj, Nexil::String const& name);

/// `name` when `obj` has no property of that name; otherwise the first free one of `name` without its trailing decimal
/// digits followed by 1, 2, 3, ...: with "point_color" and "point_color7" present, "point_color7" gives "point_color1".
[[nodiscard]] VELDRIN_API Nexil::String getUniqueGeoPropName(Nexil::String const& name, Object const& obj);

} // namespace Veldrin::Geometry
