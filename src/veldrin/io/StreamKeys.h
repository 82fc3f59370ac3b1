#pragma once

#include <veldrin/geometry/Export.h>

/// Names of the properties of a stream's header.
namespace Veldrin::IO {

VELDRIN_API extern char const* const sStreamIdentifier; ///< "file_identifier": `unsigned int`, always 6611198
VELDRIN_API extern char const* const sStreamVersion;    ///< "file_version": `unsigned int`
VELDRIN_API extern char const* const sCompressionLevel; ///< "compression_level": `int`
VELDRIN_API extern char const* const sStreamHandles;    ///< "serialize_handles": `bool`

} // namespace Veldrin::IO
