#include <veldrin/volume/VolumeNames.h>

#include <veldrin/geometry/Names.h>

#include <string>
#include <string_view>

namespace Veldrin {

namespace {

    constexpr std::string_view kVoxelPrefix = "voxel_";
    constexpr std::string_view kPointPrefix = "point_";

    std::string_view prefixOf(Object const& object)
    {
        return object.hasProperty(Geometry::sPointComp) ? kPointPrefix : kVoxelPrefix;
    }

    Nexil::String exchangePrefix(Nexil::String const& name, std::string_view from, std::string_view to)
    {
        std::string_view rest = name.view();
        if (rest.starts_with(from))
            rest.remove_prefix(from.size());
        return Nexil::String(std::string(to).append(rest));
    }

} // namespace

Nexil::String mapGeoPropertyName(Nexil::String const& name, Object const& from, Object const& to)
{
    return exchangePrefix(name, prefixOf(from), prefixOf(to));
}

Nexil::String mapGeoPropertyNameFromVLDVolume(Nexil::String const& name, Object const& to)
{
    return exchangePrefix(name, kVoxelPrefix, prefixOf(to));
}

Nexil::String mapGeoPropertyNameToVLDVolume(Nexil::String const& name, Object const& from)
{
    return exchangePrefix(name, prefixOf(from), kVoxelPrefix);
}

} // namespace Veldrin
