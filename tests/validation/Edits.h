#pragma once

#include <support/Geometry.h>

#include <veldrin/geometry/Names.h>

#include <functional>

/// Changes to geometry that no population function would make.
namespace support {

using Veldrin::Geometry::kInvalidIndex;
using Change = std::function<void(Veldrin::Object&)>;

inline Change without(char const* name)
{
    return [=](Veldrin::Object& o) { o.eraseProperty(name); };
}

/// Another count of a component, whatever there is of its elements.
inline Change count(char const* component, unsigned int number)
{
    return [=](Veldrin::Object& o) { Veldrin::Geometry::setElementCount(component, number, o); };
}

/// Replaces a field of the object under `name`, or adds it.
template <class T>
void setField(Veldrin::Object& geometry, char const* name, char const* key, T&& value)
{
    Nexil::MutablePtr<Veldrin::Object> changed(part(geometry, name));
    Veldrin::setProperty(*changed, key, std::forward<T>(value));
    Veldrin::setProperty(geometry, name, std::move(changed));
}

/// The message of a validator, "" for a valid object.
template <class Validator>
std::string verdict(Validator&& validator, Veldrin::Object const& object)
{
    return validator.validate(object).message.c_str();
}

inline void setTarget(Veldrin::Object& geometry, char const* name, char const* target)
{
    setField(geometry, name, Veldrin::Geometry::sTarget, target);
}

inline void setIndices(Veldrin::Object& geometry, char const* name, Indices const& values,
                       char const* key = Veldrin::Geometry::sData)
{
    setField(geometry, name, key, array(values));
}

inline void addData(Veldrin::Object& geometry, char const* name, char const* target, std::vector<float> const& values)
{
    auto made = Veldrin::createObject();
    Veldrin::Geometry::createDataGeoProperty(0.0f, target, array(values), *made);
    Veldrin::setProperty(geometry, name, std::move(made));
}

inline void addRange(Veldrin::Object& geometry, char const* name, char const* target, Indices const& values)
{
    auto made = Veldrin::createObject();
    Veldrin::Geometry::populateRangeGeoProperty(array(values), target, *made);
    Veldrin::setProperty(geometry, name, std::move(made));
}

inline void addComponent(Veldrin::Object& geometry, char const* name, unsigned int count)
{
    auto made = Veldrin::createObject();
    Veldrin::Geometry::populateComponentGeoProperty(count, *made);
    Veldrin::setProperty(geometry, name, std::move(made));
}

} // namespace support
