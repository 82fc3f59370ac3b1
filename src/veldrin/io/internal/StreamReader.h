#pragma once

#include <nexil/Array.h>
#include <nexil/Ptr.h>
#include <veldrin/io/internal/ByteSource.h>
#include <veldrin/object/Object.h>
#include <veldrin/volume/internal/ProxyDescription.h>

/// Readers of everything behind the header, by version. Each answers the top-level objects. They throw `Nexil::String` and
/// msgpack errors.
namespace Veldrin::IO {

/// Versions 1 to 4: objects one behind the other, to the end of the stream.
[[nodiscard]] Nexil::Array<Nexil::Ptr<Object>> readSequentialStream(ByteSource& source, Object const& header,
                                                                    unsigned int version);

/// Versions 5 and 6: items told by an entry table.
///
/// hasHashes: version 6.
/// proxies:   rebuilds volumes; null leaves them plain objects.
[[nodiscard]] Nexil::Array<Nexil::Ptr<Object>> readEntryStream(ByteSource& source, Object const& header, bool hasHashes,
                                                               Geometry::Internal::ProxyRebuilder* proxies);

} // namespace Veldrin::IO
