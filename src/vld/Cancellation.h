#pragma once

#include <nexil/Export.h>
#include <nexil/String.h>

namespace VLD {

/// The text of the std::runtime_error by which a cancelled job leaves: "Job cancelled".
VELDRIN_PLATFORM_API extern Nexil::String const exceptionMessage;

} // namespace VLD
