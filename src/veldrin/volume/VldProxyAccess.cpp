#include <veldrin/volume/VldProxyAccess.h>

#include <nexil/TypeId.h>
#include <veldrin/volume/VldProxyComponentChannel.h>
#include <veldrin/volume/VldProxyComponentContainer.h>
#include <veldrin/volume/VldProxyComponentTopology.h>

#include <stdexcept>
#include <string>
#include <typeinfo>

namespace Veldrin::Geometry {

namespace {

    template <class Proxy>
    auto componentOf(Nexil::Ptr<Object> const& object, char const* kind)
    {
        auto const* const proxy = dynamic_cast<Proxy const*>(object.get());
        if (proxy)
            if (auto component = proxy->getVldComponent())
                return component;
        Nexil::String type = "null";
        if (object) {
            Object const& held = *object;
            type = Nexil::Internal::DebugTypeId::getTypeNameForDebugOnly(typeid(held));
        }
        throw std::runtime_error(std::string("Could not find VLD component ")
                                     .append(kind)
                                     .append(" from proxy of type: ")
                                     .append(type.view()));
    }

} // namespace

Nexil::Ptr<VLD::Component> getVldTopologyFromProxy(Nexil::Ptr<Object> const& proxy)
{
    return componentOf<VldProxyComponentTopology>(proxy, "topology");
}

Nexil::Ptr<VLD::Component> getVldContainerFromProxy(Nexil::Ptr<Object> const& proxy)
{
    return componentOf<VldProxyComponentContainer>(proxy, "container");
}

Nexil::Ptr<VLD::TileTree3D::ChannelBase> getVldChannelFromProxy(Nexil::Ptr<Object> const& proxy)
{
    return componentOf<VldProxyComponentChannel>(proxy, "channel");
}

} // namespace Veldrin::Geometry
