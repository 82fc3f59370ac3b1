#pragma once

#include <nexil/Any.h>
#include <nexil/Array.h>
#include <nexil/DefaultClass.h>
#include <nexil/Export.h>
#include <nexil/Ptr.h>
#include <nexil/String.h>
#include <veldrin/object/PropertyTable.h>

#include <cstdint>

/// The property bag in which all geometry lives.
///
///     auto object = Veldrin::createObject();
///     object->setPropertyAny("count", 3u);
///     Nexil::Ptr<Veldrin::Object> shared(std::move(object));
namespace Veldrin {

/// What can be told of a property without touching its data.
struct PropertyInfo {
    bool exists = false;
    /// True when the value is a pointer to an array.
    bool isArray = false;
    /// The exact type of the value; no type for an empty value.
    Nexil::TypeId type;
    /// Number of elements when it is an array.
    std::uint64_t arraySize = 0;
};

/// Named values of any type, in the order in which their names first came.
///
/// A class may derive to present something else as properties; the ten operations come first in the virtual table, in
/// this order, and never change their places.
/// Cost: names are found in constant time, also among 100 000. Copying an object copies the table; arrays and objects in
/// it stay shared.
/// Threads: reading from many threads at once is safe; a writer must be alone, which `MutablePtr` sees to.
class VELDRIN_PLATFORM_API Object {
public:
    Object();
    Object(Object const&);
    Object(Object&&) noexcept;
    Object& operator=(Object const&);
    Object& operator=(Object&&) noexcept;

    virtual ~Object();
    /// Number of properties.
    [[nodiscard]] virtual std::uint64_t size() const;
    [[nodiscard]] virtual bool empty() const;
    [[nodiscard]] virtual bool hasProperty(Nexil::String const& key) const;
    /// A copy of the value (arrays and objects are shared, not copied); empty when there is no such property.
    [[nodiscard]] virtual Nexil::Any getProperty(Nexil::String const& key) const;
    /// Removes the property and returns its value; empty when there is none.
    virtual Nexil::Any extractProperty(Nexil::String const& key);
    /// Removes the property; true if it existed.
    virtual bool eraseProperty(Nexil::String const& key);
    virtual void eraseAllProperties();
    /// All names, oldest first; a replaced value keeps its name's place.
    [[nodiscard]] virtual Nexil::Array<Nexil::String> keys() const;
    /// Stores or replaces the property; an empty value can be stored. False, and nothing stored, under an empty key.
    virtual bool setPropertyAny(Nexil::String const& key, Nexil::Any&& value);

    /// Type and size of a property. Never builds or copies data: constant time, whatever stands behind the property.
    ///
    /// A class that computes its properties overrides this one too; where it does not, its `getProperty` is asked.
    [[nodiscard]] virtual PropertyInfo propertyInfo(Nexil::String const& key) const;

    /// True when `object` holds every property of `prototype` with a value of the same exact type; further properties do
    /// not matter. Where the prototype's value is an object, the object's must be one of which the same holds.
    ///
    /// Two wildcards: an empty value in the prototype accepts any value under its key; an (even null) pointer to an array
    /// of `Any` accepts any array. A null object never stands for the object that a prototype has; where the prototype's
    /// own object is null, the type alone decides. An object is always of its own kind.
    /// Cost: constant per property of the prototype, each pair of objects compared once however often they are shared;
    /// sizes of arrays do not matter, nesting needs no stack.
    [[nodiscard]] static bool isA(Object const& object, Object const& prototype);

private:
    friend struct ObjectAccess;

    Internal::PropertyTable properties_;
};

/// A new empty object for one writer.
[[nodiscard]] VELDRIN_PLATFORM_API Nexil::MutablePtr<Object> createObject();

} // namespace Veldrin

namespace Nexil {

template <>
VELDRIN_PLATFORM_API Ptr<Veldrin::Object> const& Internal::getDefaultClass<Veldrin::Object>();

} // namespace Nexil
