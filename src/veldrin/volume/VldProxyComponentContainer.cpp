#include <veldrin/volume/VldProxyComponentContainer.h>

#include <veldrin/geometry/Names.h>
#include <veldrin/volume/internal/Configurations.h>
#include <vld/Container.h>

namespace Veldrin::Geometry {

namespace {

    using IndicesPtr = Nexil::Ptr<Nexil::Array<unsigned int>>;
    using NamesPtr = Nexil::Ptr<Nexil::Array<Nexil::String>>;
    using VLD::TileTree3D::Container;

    IndicesPtr indicesOf(VLD::Component const* component)
    {
        IndicesPtr indices;
        Internal::forEachConfiguration([&]<class Traits>() {
            if (auto const* const container = dynamic_cast<Container<Traits> const*>(component);
                container && container->topology())
                indices = container->topology()->elementIndices();
        });
        return indices ? indices : Nexil::makePtr<Nexil::Array<unsigned int>>();
    }

    std::uint64_t elementCountOf(VLD::Component const* component)
    {
        std::uint64_t count = 0;
        Internal::forEachConfiguration([&]<class Traits>() {
            if (auto const* const container = dynamic_cast<Container<Traits> const*>(component))
                count = container->elementCount();
        });
        return count;
    }

    void setTopologyName(VLD::Component& component, Nexil::String name) noexcept
    {
        Internal::forEachConfiguration([&]<class Traits>() {
            if (auto* const container = dynamic_cast<Container<Traits>*>(&component))
                container->setTopologyName(std::move(name));
        });
    }

} // namespace

VldProxyComponentContainer::VldProxyComponentContainer(VldProxyComponentContainer const&) = default;
VldProxyComponentContainer& VldProxyComponentContainer::operator=(VldProxyComponentContainer const&) = default;
VldProxyComponentContainer::~VldProxyComponentContainer() = default;

std::uint64_t VldProxyComponentContainer::size() const
{
    return 3;
}

bool VldProxyComponentContainer::empty() const
{
    return false;
}

bool VldProxyComponentContainer::hasProperty(Nexil::String const& key) const
{
    return key == sIndices || key == sTarget || key == sDependsOn;
}

Nexil::Any VldProxyComponentContainer::getProperty(Nexil::String const& key) const
{
    if (key == sIndices)
        return indicesOf(component_.get());
    if (key == sTarget)
        return target_;
    if (key == sDependsOn)
        return Nexil::makePtr<Nexil::Array<Nexil::String>>();
    return {};
}

Nexil::Any VldProxyComponentContainer::extractProperty(Nexil::String const&)
{
    return {};
}

bool VldProxyComponentContainer::eraseProperty(Nexil::String const&)
{
    return false;
}

void VldProxyComponentContainer::eraseAllProperties() {}

Nexil::Array<Nexil::String> VldProxyComponentContainer::keys() const
{
    return {sIndices, sTarget, sDependsOn};
}

bool VldProxyComponentContainer::setPropertyAny(Nexil::String const& key, Nexil::Any&& value)
{
    auto* const target = value.get<Nexil::String>();
    if (key != sTarget || !target)
        return false;
    Nexil::String newTarget = *target;
    if (component_) {
        Nexil::MutablePtr<VLD::Component> own(std::move(component_));
        setTopologyName(*own, std::move(newTarget));
        component_ = std::move(own);
    }
    target_ = std::move(*target);
    value.reset();
    return true;
}

PropertyInfo VldProxyComponentContainer::propertyInfo(Nexil::String const& key) const
{
    if (key == sIndices)
        return {true, true, Nexil::TypeId::of<IndicesPtr>(), elementCountOf(component_.get())};
    if (key == sTarget)
        return {true, false, Nexil::TypeId::of<Nexil::String>(), 0};
    if (key == sDependsOn)
        return {true, true, Nexil::TypeId::of<NamesPtr>(), 0};
    return {};
}

} // namespace Veldrin::Geometry
