#include <vld/Object.h>

namespace VLD {

Nexil::Array<Nexil::String> Object::componentRange() const
{
    Nexil::Array<Nexil::String> names;
    names.reserve(components_.size());
    for (auto const& component : components_)
        names.push_back(component->name());
    return names;
}

bool Object::hasComponentFromName(Nexil::String const& name) const
{
    return places_.find(name) != places_.end();
}

bool Object::addComponent(Nexil::Ptr<Component> component)
{
    if (!component || component->name().empty())
        return false;
    auto const [place, isNew] = places_.emplace(component->name(), components_.size());
    if (!isNew)
        return false;
    try {
        components_.push_back(std::move(component));
    } catch (...) {
        places_.erase(place);
        throw;
    }
    return true;
}

void Object::clear() noexcept
{
    components_.clear();
    places_.clear();
}

Nexil::Ptr<Component> Object::find(Nexil::String const& name) const
{
    auto const place = places_.find(name);
    return place == places_.end() ? Nexil::Ptr<Component>() : components_[place->second];
}

Nexil::MutablePtr<Object> createObject()
{
    return Nexil::makeMutable<Object>();
}

} // namespace VLD
