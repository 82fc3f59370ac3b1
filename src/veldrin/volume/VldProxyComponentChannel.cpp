#include <veldrin/volume/VldProxyComponentChannel.h>

#include <veldrin/geometry/Names.h>
#include <veldrin/volume/VolumeInterpolation.h>

namespace Veldrin::Geometry {

namespace {

    using Common::DataInterpolationMode;
    using NamesPtr = Nexil::Ptr<Nexil::Array<Nexil::String>>;
    using VLD::TileTree3D::ChannelBase;

    bool accepts(ChannelBase const& channel, Nexil::String const& name, Nexil::Any const& value)
    {
        if (name == sTarget)
            return value.holds<Nexil::String>();
        if (name == sData)
            return channel.acceptsData(value);
        if (name == sDefault)
            return channel.acceptsDefaultValue(value);
        return name == sInterp && value.holds<DataInterpolationMode>();
    }

    void set(ChannelBase& channel, Nexil::String const& name, Nexil::Any&& value) noexcept
    {
        if (name == sTarget)
            channel.setContainerName(std::move(*value.get<Nexil::String>()));
        else if (name == sData)
            channel.setData(std::move(value));
        else if (name == sDefault)
            channel.setDefaultValue(std::move(value));
        else
            channel.setInitializer(to_vld_volume_interp(*value.get<DataInterpolationMode>()));
    }

} // namespace

VldProxyComponentChannel::VldProxyComponentChannel(VldProxyComponentChannel const&) = default;
VldProxyComponentChannel& VldProxyComponentChannel::operator=(VldProxyComponentChannel const&) = default;
VldProxyComponentChannel::~VldProxyComponentChannel() = default;

std::uint64_t VldProxyComponentChannel::size() const
{
    return 5;
}

bool VldProxyComponentChannel::empty() const
{
    return false;
}

bool VldProxyComponentChannel::hasProperty(Nexil::String const& key) const
{
    return key == sData || key == sTarget || key == sDependsOn || key == sDefault || key == sInterp;
}

Nexil::Any VldProxyComponentChannel::getProperty(Nexil::String const& key) const
{
    if (key == sTarget)
        return target_;
    if (!channel_)
        return {};
    if (key == sData)
        return channel_->data();
    if (key == sDefault)
        return channel_->defaultValue();
    if (key == sInterp)
        return to_object_interp(channel_->initializer());
    if (key == sDependsOn)
        return Nexil::makePtr<Nexil::Array<Nexil::String>>();
    return {};
}

Nexil::Any VldProxyComponentChannel::extractProperty(Nexil::String const&)
{
    return {};
}

bool VldProxyComponentChannel::eraseProperty(Nexil::String const&)
{
    return false;
}

void VldProxyComponentChannel::eraseAllProperties() {}

Nexil::Array<Nexil::String> VldProxyComponentChannel::keys() const
{
    return {sData, sTarget, sDependsOn, sDefault, sInterp};
}

bool VldProxyComponentChannel::setPropertyAny(Nexil::String const& key, Nexil::Any&& value)
{
    if (!setInternalPropertyAny(key, false, value))
        return false;
    value.reset();
    return true;
}

bool VldProxyComponentChannel::setInPlacePropertyAny(Nexil::String const& name, Nexil::Any const& value)
{
    return setInternalPropertyAny(name, true, value);
}

bool VldProxyComponentChannel::setInternalPropertyAny(Nexil::String const& name, bool inPlace, Nexil::Any const& value)
{
    if (!channel_ || !accepts(*channel_, name, value))
        return false;
    // Whatever takes memory comes first, so that nothing is half set when there is none.
    Nexil::Any copy = value;
    Nexil::String newTarget = name == sTarget ? *value.get<Nexil::String>() : target_;
    if (inPlace) {
        // Channels are made writable, so the cast restores what this one is.
        set(const_cast<ChannelBase&>(*channel_), name, std::move(copy));
    } else {
        Nexil::MutablePtr<ChannelBase> own(std::move(channel_));
        set(*own, name, std::move(copy));
        channel_ = std::move(own);
    }
    target_ = std::move(newTarget);
    return true;
}

PropertyInfo VldProxyComponentChannel::propertyInfo(Nexil::String const& key) const
{
    if (key == sTarget)
        return {true, false, Nexil::TypeId::of<Nexil::String>(), 0};
    if (!channel_)
        return {hasProperty(key), false, {}, 0};
    if (key == sData)
        return {true, true, channel_->data().type(), channel_->elementCount()};
    if (key == sDefault)
        return {true, false, channel_->elementType(), 0};
    if (key == sInterp)
        return {true, false, Nexil::TypeId::of<DataInterpolationMode>(), 0};
    if (key == sDependsOn)
        return {true, true, Nexil::TypeId::of<NamesPtr>(), 0};
    return {};
}

} // namespace Veldrin::Geometry
