#include <veldrin/volume/VldProxyComponentTopology.h>

#include <veldrin/geometry/Names.h>
#include <veldrin/volume/internal/Configurations.h>
#include <vld/VoxelTopology.h>

namespace Veldrin::Geometry {

namespace {

    /// The topology's number of elements; empty for what is no voxel topology, and for a count that 32 bits do not hold.
    Nexil::Any countOf(VLD::Component const* component)
    {
        Nexil::Any count;
        Internal::forEachConfiguration([&]<class Traits>() {
            auto const* const topology = dynamic_cast<VLD::TileTree3D::VoxelTopology<Traits> const*>(component);
            if (topology && topology->elementCount() <= 0xFFFFFFFFu)
                count = static_cast<unsigned int>(topology->elementCount());
        });
        return count;
    }

} // namespace

VldProxyComponentTopology::VldProxyComponentTopology(VldProxyComponentTopology const&) = default;
VldProxyComponentTopology& VldProxyComponentTopology::operator=(VldProxyComponentTopology const&) = default;
VldProxyComponentTopology::~VldProxyComponentTopology() = default;

std::uint64_t VldProxyComponentTopology::size() const
{
    return 1;
}

bool VldProxyComponentTopology::empty() const
{
    return false;
}

bool VldProxyComponentTopology::hasProperty(Nexil::String const& key) const
{
    return key == sCount;
}

Nexil::Any VldProxyComponentTopology::getProperty(Nexil::String const& key) const
{
    return hasProperty(key) ? countOf(component_.get()) : Nexil::Any();
}

Nexil::Any VldProxyComponentTopology::extractProperty(Nexil::String const&)
{
    return {};
}

bool VldProxyComponentTopology::eraseProperty(Nexil::String const&)
{
    return false;
}

void VldProxyComponentTopology::eraseAllProperties() {}

Nexil::Array<Nexil::String> VldProxyComponentTopology::keys() const
{
    return {sCount};
}

bool VldProxyComponentTopology::setPropertyAny(Nexil::String const&, Nexil::Any&&)
{
    return false;
}

PropertyInfo VldProxyComponentTopology::propertyInfo(Nexil::String const& key) const
{
    return {hasProperty(key), false, getProperty(key).type(), 0};
}

} // namespace Veldrin::Geometry
