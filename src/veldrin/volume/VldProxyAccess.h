#pragma once

#include <nexil/Ptr.h>
#include <veldrin/geometry/Export.h>
#include <veldrin/object/Object.h>
#include <vld/Channel.h>
#include <vld/Component.h>

namespace Veldrin::Geometry {

/// The components that proxies hold.
///
/// Errors: std::runtime_error when `proxy` is null, is no proxy of that kind, or holds nothing. It says "Could not find VLD
/// component channel from proxy of type: ", or container or topology instead of channel, followed by the type of the object
/// or "null".
[[nodiscard]] VELDRIN_API Nexil::Ptr<VLD::Component> getVldTopologyFromProxy(Nexil::Ptr<Object> const& proxy);
[[nodiscard]] VELDRIN_API Nexil::Ptr<VLD::Component> getVldContainerFromProxy(Nexil::Ptr<Object> const& proxy);
[[nodiscard]] VELDRIN_API Nexil::Ptr<VLD::TileTree3D::ChannelBase>
getVldChannelFromProxy(Nexil::Ptr<Object> const& proxy);

} // namespace Veldrin::Geometry
