#pragma once

#include <nexil/Any.h>
#include <nexil/Array.h>
#include <nexil/Ptr.h>
#include <nexil/String.h>
#include <veldrin/geometry/Export.h>
#include <veldrin/object/Object.h>
#include <vld/Channel.h>

#include <cstdint>
#include <utility>

namespace Veldrin::Geometry {

/// A channel of the volume library as a data geo property: "data", "target", "depends_on", "default" and
/// "interpolation_mode".
///
/// "data" is the channel's own array, shared and never copied; its element type, and that of "default", is the channel's.
/// "depends_on" is empty. A null channel has a "target" and no other values.
/// All but "depends_on" can be set: "data" to an array of the same element type and size, the others to a value of the
/// type they have. `setPropertyAny` writes a copy of the channel when others hold it, `setInPlacePropertyAny` the one that
/// others hold as well; neither writes an array. Extracting gives an empty value, erasing false, erasing everything does
/// nothing.
/// Copies share the channel. Cost: constant.
/// Threads: as of any object; a write in place needs everybody who shares the channel to look away.
class VELDRIN_API VldProxyComponentChannel final : public Object {
public:
    explicit VldProxyComponentChannel(Nexil::Ptr<VLD::TileTree3D::ChannelBase> channel,
                                      Nexil::String target = {}) noexcept
        : channel_(std::move(channel)), target_(std::move(target))
    {
    }
    VldProxyComponentChannel(VldProxyComponentChannel const&);
    VldProxyComponentChannel& operator=(VldProxyComponentChannel const&);

    ~VldProxyComponentChannel() override;
    [[nodiscard]] std::uint64_t size() const override;
    [[nodiscard]] bool empty() const override;
    [[nodiscard]] bool hasProperty(Nexil::String const& key) const override;
    [[nodiscard]] Nexil::Any getProperty(Nexil::String const& key) const override;
    Nexil::Any extractProperty(Nexil::String const& key) override;
    bool eraseProperty(Nexil::String const& key) override;
    void eraseAllProperties() override;
    [[nodiscard]] Nexil::Array<Nexil::String> keys() const override;
    bool setPropertyAny(Nexil::String const& key, Nexil::Any&& value) override;
    [[nodiscard]] PropertyInfo propertyInfo(Nexil::String const& key) const override;

    [[nodiscard]] Nexil::Ptr<VLD::TileTree3D::ChannelBase> getVldComponent() const { return channel_; }

    /// Sets a property of the channel itself, for everybody who shares it; "target" only names this proxy's target as well.
    bool setInPlacePropertyAny(Nexil::String const& name, Nexil::Any const& value);

private:
    /// The step behind both ways to set; false, and nothing changed, for a property or a value that is refused.
    bool setInternalPropertyAny(Nexil::String const& name, bool inPlace, Nexil::Any const& value);

    Nexil::Ptr<VLD::TileTree3D::ChannelBase> channel_;
    Nexil::String target_;
};

} // namespace Veldrin::Geometry
