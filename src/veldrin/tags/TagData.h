#pragma once

#include <nexil/Array.h>
#include <nexil/Ptr.h>
#include <nexil/String.h>
#include <veldrin/algorithms/ComponentConversion.h>
#include <veldrin/geometry/Export.h>
#include <veldrin/object/Object.h>

/// Tags: named selections that a geometry carries along.
///
///     auto tag = Veldrin::createObject();
///     populateTag(sPointComp, mask, *tag);
///     setProperty(*mesh, createTagName(sPointComp, "top"), std::move(tag)); // under "point_top_tag"
///
///     Nexil::Ptr<Nexil::Array<bool>> data;
///     Nexil::String component;
///     getTagData(*mesh, "point_top_tag", data, component); // that mask, "point_component"
///
/// A tag is a data geo property of `bool` elements: one flag per element of the component that it targets.
/// Masks are shared, never copied. A null mask counts as an empty one.
/// Errors: std::bad_alloc. Threads: as of the object.
namespace Veldrin::Geometry {

/// The name under which a tag of a component is stored: the component's name without "_component", "_", the tag's name,
/// "_tag". What the tag's name already has of it, at either end, is not repeated.
///
/// With "point_component": "top", "point_top" and "point_top_tag" all give "point_top_tag"; "pointy" gives "pointy_tag",
/// because it starts with "point"; "point" gives "point_point_tag". With "" only the ending is added.
[[nodiscard]] VELDRIN_API Nexil::String createTagName(Nexil::String const& component, Nexil::String const& tag);

/// Whether `name`, a full name, is that of a tag: of an object whose "data" is an array of `bool`. Then `data` receives
/// its mask and `component` the component it targets, through ranges if there are any; otherwise both stay as they are.
/// Cost: constant, and the length of the chain of targets.
[[nodiscard]] VELDRIN_API bool getTagData(Object const& geometry, Nexil::String const& name,
                                          Nexil::Ptr<Nexil::Array<bool>>& data, Nexil::String& component);

/// Fills `tagProperty` as a tag of the component `target`: a data geo property with the default false. The caller stores
/// it in the geometry.
VELDRIN_API void populateTag(Nexil::String const& target, Nexil::Ptr<Nexil::Array<bool>> const& data,
                             Object& tagProperty);

/// The mask on component `from`, carried over to component `to`. Never null.
///
/// Points, faces and face vertices convert into each other, and so do points and strands. Between other components, and
/// from "" to "", there is no conversion: the result is an empty mask. From a component to itself the mask is handed
/// through.
/// style: whether any or all of the elements make up one of `to`, where one is made up of several: from points or face
///        vertices to faces, from points to strands.
/// ok:    when not null, receives whether there is such a conversion and the geometry has the topology for it.
/// Cost: as of the conversions; std::runtime_error when the job is cancelled.
[[nodiscard]] VELDRIN_API Nexil::Ptr<Nexil::Array<bool>>
convertTagData(Object const& geometry, Nexil::Ptr<Nexil::Array<bool>> data, Nexil::String const& from,
               Nexil::String const& to, TagConversionStyle style, bool* ok);

} // namespace Veldrin::Geometry
