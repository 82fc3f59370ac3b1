#pragma once

#include <veldrin/validation/internal/Findings.h>

namespace Veldrin::Geometry::Internal {

/// Judges every geo property that has not failed yet.
void judgeGeoProperties(Object const& object, Findings& findings);

} // namespace Veldrin::Geometry::Internal
