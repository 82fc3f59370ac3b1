#include <veldrin/object/internal/ObjectAccess.h>

namespace Veldrin {

Object::Object() = default;
Object::Object(Object const&) = default;
Object::Object(Object&&) noexcept = default;
Object& Object::operator=(Object const&) = default;
Object& Object::operator=(Object&&) noexcept = default;
Object::~Object() = default;

std::uint64_t Object::size() const
{
    return properties_.size();
}

bool Object::empty() const
{
    return properties_.size() == 0;
}

bool Object::hasProperty(Nexil::String const& key) const
{
    return properties_.find(key.view()) != nullptr;
}

Nexil::Any Object::getProperty(Nexil::String const& key) const
{
    auto const* value = properties_.find(key.view());
    return value ? *value : Nexil::Any();
}

Nexil::Any Object::extractProperty(Nexil::String const& key)
{
    Nexil::Any value;
    properties_.extract(key.view(), value);
    return value;
}

bool Object::eraseProperty(Nexil::String const& key)
{
    Nexil::Any value;
    return properties_.extract(key.view(), value);
}

void Object::eraseAllProperties()
{
    properties_.clear();
}

Nexil::Array<Nexil::String> Object::keys() const
{
    Nexil::Array<Nexil::String> names;
    names.reserve(properties_.size());
    properties_.visitWhile([&names](Nexil::String const& name, Nexil::Any const&) {
        names.push_back(name);
        return true;
    });
    return names;
}

bool Object::setPropertyAny(Nexil::String const& key, Nexil::Any&& value)
{
    if (key.empty())
        return false;
    properties_.set(key, std::move(value));
    return true;
}

PropertyInfo Object::propertyInfo(Nexil::String const& key) const
{
    auto const describe = [](Nexil::Any const& value) -> PropertyInfo {
        return {true, Nexil::AnyArray::is_any_array(value), value.type(), Nexil::AnyArray::get_any_array_size(value)};
    };
    if (!ObjectAccess::table(*this))
        return hasProperty(key) ? describe(getProperty(key)) : PropertyInfo();
    auto const* value = properties_.find(key.view());
    return value ? describe(*value) : PropertyInfo();
}

Nexil::MutablePtr<Object> createObject()
{
    return Nexil::makeMutable<Object>();
}

} // namespace Veldrin

namespace Nexil {

template <>
Ptr<Veldrin::Object> const& Internal::getDefaultClass<Veldrin::Object>()
{
    static Ptr<Veldrin::Object> const instance = makePtr<Veldrin::Object>();
    return instance;
}

} // namespace Nexil
