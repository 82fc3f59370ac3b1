#include <veldrin/volume/VldProxyDescription.h>

#include <veldrin/geometry/Names.h>
#include <veldrin/object/Properties.h>
#include <veldrin/volume/VldProxyComponentChannel.h>
#include <veldrin/volume/VldProxyComponentContainer.h>
#include <veldrin/volume/VldProxyComponentTopology.h>
#include <veldrin/volume/internal/Configurations.h>
#include <veldrin/volume/internal/ProxyKeys.h>
#include <vld/Container.h>
#include <vld/PointTopology.h>

namespace Veldrin::Geometry {

namespace {

    using namespace Internal;
    using namespace VLD::TileTree3D;

    void setKind(Object& description, char const* kind, VLD::Component const& component)
    {
        setProperty(description, kKind, kind);
        setProperty(description, kName, component.name());
    }

    void setParameters(Object& description, TileParameters const& parameters)
    {
        setProperty(description, kTileWidth, parameters.tileWidth);
        setProperty(description, kTileDataWidth, parameters.dataWidth);
        setProperty(description, kOffsetType, parameters.offsetType);
        setProperty(description, kInnerLevels, parameters.innerLevels);
    }

    bool describeTopology(VldProxyComponentTopology const& proxy, Object& description)
    {
        auto const component = proxy.getVldComponent();
        bool isDescribed = false;
        forEachConfiguration([&]<class Traits>() {
            if (auto const voxels = Nexil::dynamicPtrCast<VoxelTopology<Traits>>(component)) {
                description.setPropertyAny(sCount, proxy.getProperty(sCount));
                setKind(description, kVoxelTopologyKind, *voxels);
                setParameters(description, Traits::parameters());
                setProperty(description, kLeafOrigins, voxels->levels().leafOrigins);
                setProperty(description, kLeafParents, voxels->levels().leafParents);
                setProperty(description, kInnerOrigins, voxels->levels().innerOrigins);
                setProperty(description, kInnerChildren, voxels->levels().innerChildren);
                isDescribed = true;
            } else if (auto const points = Nexil::dynamicPtrCast<PointTopology<Traits>>(component)) {
                setKind(description, kPointTopologyKind, *points);
                setParameters(description, Traits::parameters());
                setProperty(description, kLeafOrigins, points->sharedLeafOrigins());
                setProperty(description, kOffsets, points->sharedOffsets());
                isDescribed = true;
            }
        });
        return isDescribed;
    }

    bool describeContainer(VldProxyComponentContainer const& proxy, Object& description)
    {
        bool isDescribed = false;
        forEachConfiguration([&]<class Traits>() {
            auto const container = Nexil::dynamicPtrCast<Container<Traits>>(proxy.getVldComponent());
            if (!container)
                return;
            setProperty(description, sIndices, Nexil::makePtr<Nexil::Array<unsigned int>>());
            description.setPropertyAny(sTarget, proxy.getProperty(sTarget));
            description.setPropertyAny(sDependsOn, proxy.getProperty(sDependsOn));
            setKind(description, kContainerKind, *container);
            setProperty(description, kTopology, container->topologyName());
            setProperty(description, kVoxelSize, container->voxelSize());
            isDescribed = true;
        });
        return isDescribed;
    }

    bool describeChannel(VldProxyComponentChannel const& proxy, Object& description)
    {
        auto const channel = proxy.getVldComponent();
        if (!channel)
            return false;
        for (Nexil::String const& key : proxy.keys())
            description.setPropertyAny(key, proxy.getProperty(key));
        setKind(description, kChannelKind, *channel);
        setParameters(description, channel->tileParameters());
        setProperty(description, kContainer, channel->containerName());
        return true;
    }

} // namespace

bool describeVldProxy(Object const& proxy, Object& description)
{
    if (auto const* const topology = dynamic_cast<VldProxyComponentTopology const*>(&proxy))
        return describeTopology(*topology, description);
    if (auto const* const container = dynamic_cast<VldProxyComponentContainer const*>(&proxy))
        return describeContainer(*container, description);
    auto const* const channel = dynamic_cast<VldProxyComponentChannel const*>(&proxy);
    return channel && describeChannel(*channel, description);
}

} // namespace Veldrin::Geometry
