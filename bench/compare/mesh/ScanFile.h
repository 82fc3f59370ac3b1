#pragma once

#include "PlainMesh.h"

namespace compare {

/// The triangle mesh in a zon file; one without faces when there is none.
[[nodiscard]] PlainMesh readScan(char const* path);

} // namespace compare
