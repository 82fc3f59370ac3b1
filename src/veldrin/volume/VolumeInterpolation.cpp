#include <veldrin/volume/VolumeInterpolation.h>

namespace Veldrin::Geometry {

using Common::DataInterpolationMode;
using VLD::TileTree3D::DataElementInitializerType;

DataElementInitializerType to_vld_volume_interp(DataInterpolationMode const& mode)
{
    switch (mode) {
    case DataInterpolationMode::Nearest: return DataElementInitializerType::Nearest;
    case DataInterpolationMode::Linear: return DataElementInitializerType::Linear;
    default: return DataElementInitializerType::DefaultValue;
    }
}

DataInterpolationMode to_object_interp(DataElementInitializerType const& initializer)
{
    switch (initializer) {
    case DataElementInitializerType::Nearest: return DataInterpolationMode::Nearest;
    case DataElementInitializerType::Linear: return DataInterpolationMode::Linear;
    default: return DataInterpolationMode::DefaultValue;
    }
}

} // namespace Veldrin::Geometry
