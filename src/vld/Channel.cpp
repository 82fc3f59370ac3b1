#include <vld/Channel.h>

namespace VLD::TileTree3D {

ChannelBase::ChannelBase(Nexil::String name, Nexil::String containerName, TileParameters const& parameters,
                         Nexil::Any data, Nexil::Any defaultValue, DataElementInitializerType initializer) noexcept
    : Component(std::move(name)), containerName_(std::move(containerName)), data_(std::move(data)),
      defaultValue_(std::move(defaultValue)), parameters_(parameters), initializer_(initializer)
{
}

ChannelBase::ChannelBase(ChannelBase const&) = default;
ChannelBase::~ChannelBase() = default;

bool ChannelBase::acceptsData(Nexil::Any const& data) const noexcept
{
    return data.type() == data_.type() && Nexil::AnyArray::get_any_array_size(data) == elementCount();
}

bool ChannelBase::setData(Nexil::Any data)
{
    if (!acceptsData(data))
        return false;
    // A null pointer has size 0, as an empty array has. Where there is nothing, nothing needs to be replaced.
    if (elementCount() != 0)
        data_ = std::move(data);
    return true;
}

bool ChannelBase::setDefaultValue(Nexil::Any value)
{
    if (!acceptsDefaultValue(value))
        return false;
    defaultValue_ = std::move(value);
    return true;
}

template <class Traits>
Channel<Traits>::~Channel() = default;

template <class Traits>
Channel<Traits>::Channel(Channel const&) = default;

template class Channel<SmallTiles>;
template class Channel<WideTiles>;

} // namespace VLD::TileTree3D
