#include <veldrin/validation/internal/GeoPropertyCheck.h>

#include <veldrin/geometry/GeoProperties.h>
#include <veldrin/geometry/Prototypes.h>
#include <veldrin/object/Properties.h>
#include <veldrin/validation/internal/IndexScan.h>
#include <veldrin/validation/internal/Messages.h>
#include <veldrin/volume/VldProxyComponentContainer.h>

namespace Veldrin::Geometry::Internal {

namespace {

    using IndicesPtr = Nexil::Ptr<Nexil::Array<unsigned int>>;
    using ObjectPtr = Nexil::Ptr<Object>;

    bool isComponent(Object const& object)
    {
        return Object::isA(object, *getComponentGeoPropPrototype());
    }

    bool isRange(Object const& object)
    {
        return Object::isA(object, *getRangeGeoPropPrototype());
    }

    bool isData(Object const& object)
    {
        return Object::isA(object, *getDataGeoPropPrototype(sGenericDataGeoProp));
    }

    /// A range under a data property: whether its last index may stand for the end of the values.
    bool mayHaveEnd(Object const& geometry, Object const& range, std::uint64_t indexCount)
    {
        auto const component = getGeoPropTarget(geometry, range);
        return component && isComponent(*component) && indexCount == std::uint64_t(getElementCount(*component)) + 1;
    }

    /// Data over the container of a volume, whose indices count up: they are not made to be looked at, as they are far more
    /// than what a small file says of its tiles.
    PropertyVerdict judgeDataOfContainer(Object const& geometry, Nexil::String const& name,
                                         Nexil::String const& targetName, Object const& container,
                                         std::uint64_t valueCount)
    {
        auto const indexCount = container.propertyInfo(sIndices).arraySize;
        if (indexCount <= valueCount + (mayHaveEnd(geometry, container, indexCount) ? 1 : 0))
            return {};
        return invalidIndex(name, targetName, name);
    }

    PropertyVerdict judgeData(Object const& geometry, Nexil::String const& name, Object const& data)
    {
        auto const targetName = getGeoPropTargetName(data);
        auto const target = getGeoPropTarget(geometry, data);
        if (!target)
            return missingTarget(name);
        if (targetName == name)
            return targetsItself(name);
        auto const valueCount = data.propertyInfo(sData).arraySize;
        if (isComponent(*target)) {
            if (valueCount < getElementCount(*target))
                return tooFewElements(name, name);
            return {};
        }
        if (dynamic_cast<VldProxyComponentContainer const*>(target.get()))
            return judgeDataOfContainer(geometry, name, targetName, *target, valueCount);
        auto const indices = isRange(*target) ? getRangeGeoPropIndices(*target) : IndicesPtr();
        if (!indices)
            return invalidTarget(name, targetName);
        return IndexQuestion{name, targetName, indices, valueCount, mayHaveEnd(geometry, *target, indices->size())};
    }

    /// Whether the indices are there at all; only a null pointer in their place has to be told apart by reading it.
    bool hasIndices(Object const& range, std::uint64_t indexCount)
    {
        return indexCount > 0 || getRangeGeoPropIndices(range);
    }

    PropertyVerdict judgeRange(Object const& geometry, Nexil::String const& name, Object const& range)
    {
        auto const targetName = getGeoPropTargetName(range);
        auto const target = getGeoPropTarget(geometry, range);
        if (!target)
            return missingTarget(name);
        if (targetName == name)
            return targetsItself(name);
        auto const indexCount = range.propertyInfo(sIndices).arraySize;
        if (!hasIndices(range, indexCount))
            return invalidField(name, sIndices);
        if (!isComponent(*target))
            return invalidTarget(name, targetName);
        if (indexCount < getElementCount(*target))
            return tooFewElements(name, sIndices);
        return {};
    }

} // namespace

PropertyVerdict judgeGeoProperty(Object const& geometry, Nexil::String const& name)
{
    // Behind another type may stand data that reading would have to build.
    if (geometry.propertyInfo(name).type != Nexil::TypeId::of<ObjectPtr>())
        return {};
    auto const object = getPropertyAs<ObjectPtr>(geometry, name);
    if (!object)
        return {};
    if (isData(*object))
        return judgeData(geometry, name, *object);
    if (isRange(*object))
        return judgeRange(geometry, name, *object);
    return {};
}

std::optional<Failure> IndexAnswers::failureOf(IndexQuestion const& question)
{
    auto const& indices = *question.indices;
    if (indices.empty())
        return std::nullopt;
    unsigned int const last = indices[indices.size() - 1];
    bool const isLastValid =
        last < question.valueCount || last == kInvalidIndex || (question.mayHaveEnd && last == question.valueCount);
    if (isLastValid && boundBeforeLast(question.indices) <= question.valueCount)
        return std::nullopt;
    return invalidIndex(question.property, question.range, question.property);
}

unsigned int IndexAnswers::boundBeforeLast(Nexil::Ptr<Nexil::Array<unsigned int>> const& indices)
{
    auto const place = known_.find(indices->data());
    if (place != known_.end())
        return place->second.boundBeforeLast;
    auto const bound = elementBound(indices->data(), indices->size() - 1);
    known_.emplace(indices->data(), Known{indices, bound});
    return bound;
}

} // namespace Veldrin::Geometry::Internal
