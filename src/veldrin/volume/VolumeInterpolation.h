#pragma once

#include <veldrin/geometry/DataInterpolationMode.h>
#include <veldrin/geometry/Export.h>
#include <vld/DataElementInitializerType.h>

namespace Veldrin::Geometry {

/// `Nearest` and `Linear` as such; the default value for any other mode.
[[nodiscard]] VELDRIN_API VLD::TileTree3D::DataElementInitializerType
to_vld_volume_interp(Common::DataInterpolationMode const& mode);

/// `Nearest` and `Linear` as such; `DefaultValue` for anything else.
[[nodiscard]] VELDRIN_API Common::DataInterpolationMode
to_object_interp(VLD::TileTree3D::DataElementInitializerType const& initializer);

} // namespace Veldrin::Geometry
