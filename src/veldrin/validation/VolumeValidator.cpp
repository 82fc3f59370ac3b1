#include <veldrin/validation/VolumeValidator.h>

#include <veldrin/geometry/Names.h>
#include <veldrin/geometry/Prototypes.h>
#include <veldrin/validation/internal/Findings.h>
#include <veldrin/validation/internal/Messages.h>
#include <veldrin/volume/VolumeConversion.h>
#include <veldrin/volume/internal/Configurations.h>
#include <vld/Container.h>
#include <vld/VoxelTopology.h>

namespace Veldrin::Geometry {

namespace {

    template <class Traits>
    bool isConsistent(VLD::Object const& volume)
    {
        auto const topology = volume.component<VLD::TileTree3D::VoxelTopology<Traits>>(sVoxelComp);
        auto const container = volume.component<VLD::TileTree3D::Container<Traits>>(sVoxelTileTree);
        return !topology || !container || container->checkConsistency(false);
    }

    bool isVolume(Object const& object)
    {
        if (!Object::isA(object, *getVolumePrototype()))
            return false;
        auto const volume = shallow_copy_object_to_vld_volume(object);
        if (!volume)
            return false;
        bool areConsistent = true;
        Internal::forEachConfiguration(
            [&]<class Traits>() { areConsistent = areConsistent && isConsistent<Traits>(*volume); });
        return areConsistent;
    }

    void judgeVolume(Object const& object, Internal::Findings& findings)
    {
        if (!isVolume(object))
            findings.take(Internal::notOfKind("volume"));
    }

} // namespace

GeoValidator::Status VolumeValidator::validate(Object const& object)
{
    return Internal::firstFailure(object, judgeVolume);
}

Nexil::Array<GeoValidator::Failure> VolumeValidator::findFailures(Object const& object) const
{
    return Internal::everyFailure(object, judgeVolume);
}

} // namespace Veldrin::Geometry
