#include <veldrin/geometry/GeoProperties.h>

#include <veldrin/geometry/Prototypes.h>
#include <veldrin/object/Properties.h>
#include <vld/ChannelParser.h>

#include <set>
#include <string>
#include <string_view>

namespace Veldrin::Geometry {

namespace {

    using ObjectPtr = Nexil::Ptr<Object>;
    using IndicesPtr = Nexil::Ptr<Nexil::Array<unsigned int>>;

    ObjectPtr objectUnder(Object const& obj, Nexil::String const& name)
    {
        return getPropertyAs<ObjectPtr>(obj, name);
    }

    /// Sets a property of the object under `name`, copying it first when it is shared.
    bool setInside(Object& obj, Nexil::String const& name, char const* key, Nexil::Any&& value)
    {
        auto part = objectUnder(obj, name);
        if (!part)
            return false;
        // Only what nobody else holds is written in place, so the stored reference is given up first. The null pointer
        // keeps the key in its place meanwhile.
        if (!setProperty(obj, name, ObjectPtr()))
            return false;
        auto const original = part.useCount() > 1 ? part : ObjectPtr();
        Nexil::MutablePtr<Object> writable;
        bool isSet = false;
        try {
            writable = Nexil::MutablePtr<Object>(std::move(part));
            isSet = writable->setPropertyAny(key, std::move(value));
        } catch (...) {
            setProperty(obj, name, original ? original : ObjectPtr(std::move(writable)));
            throw;
        }
        setProperty(obj, name, isSet || !original ? ObjectPtr(std::move(writable)) : original);
        return isSet;
    }

    /// Calls visit(name, object) for every object stored in `obj`. Nothing else is read: behind another type may stand
    /// data that reading would have to build.
    template <class Visit>
    void forEachObject(Object const& obj, Visit const& visit)
    {
        for (Nexil::String const& name : obj.keys()) {
            if (obj.propertyInfo(name).type != Nexil::TypeId::of<ObjectPtr>())
                continue;
            if (auto part = objectUnder(obj, name))
                visit(name, std::move(part));
        }
    }

    bool hasTarget(Object const& geoProp, Nexil::String const& target)
    {
        auto const value = geoProp.getProperty(sTarget);
        auto const* name = value.get<Nexil::String>();
        return name && *name == target;
    }

    /// The names of a chain so far; tells in logarithmic time whether one was met before.
    class ChainNames {
    public:
        /// Appends the name unless it was met before; false then.
        bool append(Nexil::String const& name)
        {
            if (!met_.insert(name).second)
                return false;
            names_.push_back(name);
            return true;
        }
        Nexil::Array<Nexil::String> take() { return std::move(names_); }

    private:
        Nexil::Array<Nexil::String> names_;
        std::set<Nexil::String> met_;
    };

    std::string_view withoutTrailingDigits(std::string_view name)
    {
        // All but the last non-digit's successors; npos + 1 is 0 for a name of digits only.
        return name.substr(0, name.find_last_not_of("0123456789") + 1);
    }

} // namespace

unsigned int getElementCount(Object const& component)
{
    return getPropertyAs<unsigned int>(component, sCount);
}

unsigned int getElementCount(Object const& obj, Nexil::String const& name)
{
    auto const component = objectUnder(obj, name);
    return component ? getElementCount(*component) : 0;
}

bool setElementCount(Nexil::String const& name, unsigned int count, Object& obj)
{
    return setInside(obj, name, sCount, count);
}

Nexil::Ptr<Object> getDataGeoProperty(Object const& obj, Nexil::String const& name)
{
    auto geoProp = objectUnder(obj, name);
    return geoProp && Object::isA(*geoProp, *getDataGeoPropPrototype(name)) ? geoProp : nullptr;
}

Nexil::Ptr<Object> getRangeGeoProperty(Object const& obj, Nexil::String const& name)
{
    auto geoProp = objectUnder(obj, name);
    return geoProp && Object::isA(*geoProp, *getRangeGeoPropPrototype()) ? geoProp : nullptr;
}

Nexil::Ptr<Nexil::Array<unsigned int>> getRangeGeoPropIndices(Object const& geoProp)
{
    return getPropertyAs<IndicesPtr>(geoProp, sIndices);
}

Nexil::Ptr<Nexil::Array<unsigned int>> getRangeGeoPropIndices(Object const& obj, Nexil::String const& name)
{
    auto const range = getRangeGeoProperty(obj, name);
    return range ? getRangeGeoPropIndices(*range) : nullptr;
}

bool setRangeGeoPropIndices(Nexil::String const& name, Nexil::Ptr<Nexil::Array<unsigned int>> indices, Object& obj)
{
    if (!indices)
        indices = Nexil::makePtr<Nexil::Array<unsigned int>>();
    return setInside(obj, name, sIndices, std::move(indices));
}

Nexil::Array<Nexil::String> getGeoPropNamesByPrototype(Object const& obj, Object const& prototype)
{
    Nexil::Array<Nexil::String> names;
    forEachObject(obj, [&](Nexil::String const& name, ObjectPtr const& part) {
        if (Object::isA(*part, prototype))
            names.push_back(name);
    });
    return names;
}

Nexil::Array<Nexil::Ptr<Object>> getGeoPropsByPrototype(Object const& obj, Object const& prototype)
{
    Nexil::Array<ObjectPtr> parts;
    forEachObject(obj, [&](Nexil::String const&, ObjectPtr&& part) {
        if (Object::isA(*part, prototype))
            parts.push_back(std::move(part));
    });
    return parts;
}

Nexil::Array<Nexil::String> getGeoPropNamesByTarget(Object const& obj, Nexil::String const& target)
{
    Nexil::Array<Nexil::String> names;
    forEachObject(obj, [&](Nexil::String const& name, ObjectPtr const& part) {
        if (hasTarget(*part, target))
            names.push_back(name);
    });
    return names;
}

Nexil::Array<Nexil::Ptr<Object>> getGeoPropsByTarget(Object const& obj, Nexil::String const& target)
{
    Nexil::Array<ObjectPtr> parts;
    forEachObject(obj, [&](Nexil::String const&, ObjectPtr&& part) {
        if (hasTarget(*part, target))
            parts.push_back(std::move(part));
    });
    return parts;
}

Nexil::Array<Nexil::String> getGeoPropsByName(Object const& obj, Nexil::String const& pattern)
{
    Nexil::Array<Nexil::String> accepted;
    VLD::Utils::ChannelParser parser;
    if (!parser.parses(pattern))
        return accepted;
    for (Nexil::String& name : getGeoPropNamesByPrototype(obj, *getDataGeoPropPrototype(sGenericDataGeoProp)))
        if (parser.accepts(name))
            accepted.push_back(std::move(name));
    return accepted;
}

Nexil::Ptr<Object> getGeoPropTarget(Object const& obj, Object const& geoProp)
{
    auto const target = getGeoPropTargetName(geoProp);
    return target.empty() ? nullptr : objectUnder(obj, target);
}

Nexil::String getGeoPropTargetName(Object const& geoProp)
{
    return getPropertyAs<Nexil::String>(geoProp, sTarget);
}

Nexil::String getGeoPropTargetName(Object const& obj, Nexil::String const& name)
{
    auto const geoProp = objectUnder(obj, name);
    return geoProp ? getGeoPropTargetName(*geoProp) : Nexil::String();
}

Nexil::Array<Nexil::String> getTargetChain(Object const& obj, Nexil::String const& name)
{
    ChainNames chain;
    auto current = objectUnder(obj, name);
    if (current)
        chain.append(name);
    while (current) {
        auto const value = current->getProperty(sTarget);
        auto const* target = value.get<Nexil::String>();
        if (!target || !chain.append(*target))
            break;
        current = objectUnder(obj, *target);
    }
    return chain.take();
}

Nexil::String getTargetComponent(Object const& obj, Nexil::String const& name)
{
    auto chain = getTargetChain(obj, name);
    return chain.empty() ? Nexil::String() : std::move(chain[chain.size() - 1]);
}

Nexil::String getUniqueGeoPropName(Nexil::String const& name, Object const& obj)
{
    if (!obj.hasProperty(name))
        return name;
    Nexil::String const base(withoutTrailingDigits(name.view()));
    for (unsigned long long number = 1;; ++number) {
        auto candidate = base + std::to_string(number).c_str();
        if (!obj.hasProperty(candidate))
            return candidate;
    }
}

} // namespace Veldrin::Geometry
