#include <veldrin/tags/TagData.h>

#include <veldrin/geometry/GeoProperties.h>
#include <veldrin/object/Properties.h>

#include <string>
#include <string_view>
#include <utility>

namespace Veldrin::Geometry {

namespace {

    using Mask = Nexil::Array<bool>;
    using MaskPtr = Nexil::Ptr<Mask>;

    bool startsLonger(std::string_view text, std::string_view beginning)
    {
        return text.size() > beginning.size() && text.starts_with(beginning);
    }

    bool endsLonger(std::string_view text, std::string_view ending)
    {
        return text.size() > ending.size() && text.ends_with(ending);
    }

    /// The value under `key` when it is a T. The type is asked first, so that nothing of another type is built.
    template <class T>
    T valueOfType(Object const& object, Nexil::String const& key)
    {
        return object.propertyInfo(key).type == Nexil::TypeId::of<T>() ? getPropertyAs<T>(object, key) : T();
    }

} // namespace

Nexil::String createTagName(Nexil::String const& component, Nexil::String const& tag)
{
    std::string_view stem = component.view();
    if (endsLonger(stem, sComponentSuffix))
        stem.remove_suffix(std::string_view(sComponentSuffix).size());
    std::string name(tag.view());
    if (!stem.empty() && !startsLonger(name, stem))
        name = std::string(stem) + '_' + name;
    if (!endsLonger(name, sComponentTagSuffix))
        name += sComponentTagSuffix;
    return Nexil::String(std::move(name));
}

bool getTagData(Object const& geometry, Nexil::String const& name, MaskPtr& data, Nexil::String& component)
{
    auto const tag = valueOfType<Nexil::Ptr<Object>>(geometry, name);
    if (!tag)
        return false;
    auto mask = valueOfType<MaskPtr>(*tag, sData);
    if (!mask)
        return false;
    auto target = getTargetComponent(geometry, name);
    data = std::move(mask);
    component = std::move(target);
    return true;
}

void populateTag(Nexil::String const& target, MaskPtr const& data, Object& tagProperty)
{
    createDataGeoProperty<bool>(false, target, data, tagProperty);
}

MaskPtr convertTagData(Object const& geometry, MaskPtr data, Nexil::String const& from, Nexil::String const& to,
                       TagConversionStyle style, bool* ok)
{
    if (ok)
        *ok = true;
    if (!data)
        data = Nexil::makePtr<Mask>();
    if (from == to && !from.empty())
        return data;
    auto const isBetween = [&](char const* source, char const* target) { return from == source && to == target; };
    if (isBetween(sFaceComp, sFaceVertexComp))
        return facesToFaceVertices(geometry, *data, ok);
    if (isBetween(sFaceComp, sPointComp))
        return facesToPoints(geometry, *data, ok);
    if (isBetween(sFaceVertexComp, sPointComp))
        return faceVerticesToPoints(geometry, *data, ok);
    if (isBetween(sFaceVertexComp, sFaceComp))
        return faceVerticesToFaces(geometry, *data, style, ok);
    if (isBetween(sStrandComp, sPointComp))
        return strandsToPoints(geometry, *data, ok);
    if (isBetween(sPointComp, sStrandComp))
        return pointsToStrands(geometry, *data, style, ok);
    if (isBetween(sPointComp, sFaceComp))
        return pointsToFaces(geometry, *data, style, ok);
    if (isBetween(sPointComp, sFaceVertexComp))
        return pointsToFaceVertices(geometry, *data, ok);
    if (ok)
        *ok = false;
    return Nexil::makePtr<Mask>();
}

} // namespace Veldrin::Geometry
