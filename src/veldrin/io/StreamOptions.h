#pragma once

#include <nexil/String.h>
#include <veldrin/geometry/Export.h>

namespace Veldrin::IO {

/// How a stream is written.
struct VELDRIN_API SerializationOptions {
    SerializationOptions();
    SerializationOptions(SerializationOptions const&);
    SerializationOptions(SerializationOptions&&) noexcept;
    SerializationOptions& operator=(SerializationOptions const&);
    SerializationOptions& operator=(SerializationOptions&&) noexcept;
    ~SerializationOptions();

    /// Below 1: array bytes are stored as they are. 1 to 9: compressed, quickest to smallest. The compressor refuses levels
    /// above 9 ("compression error").
    int compressionLevel = 9;

    /// Reserved for choosing geometry by name; has no effect on the stream.
    Nexil::String geometryFilter;
};

/// How a stream is read.
struct VELDRIN_API DeserializationOptions {
    DeserializationOptions();
    DeserializationOptions(DeserializationOptions const&);
    DeserializationOptions& operator=(DeserializationOptions const&);

    /// Whether content of older conventions is brought up to date. No version so far needs it.
    bool upgradeContent = true;
};

} // namespace Veldrin::IO
