#pragma once

#include <nexil/Array.h>
#include <nexil/Ptr.h>
#include <nexil/RuntimeMessage.h>
#include <veldrin/io/StreamOptions.h>
#include <veldrin/object/Object.h>

#include <ostream>

namespace Veldrin::IO {

/// The options of a call, and what the kind of call adds to them.
struct WriterContext {
    SerializationOptions options;
    bool serializeHandles = false;
    /// Addresses of the caller's handles, one per object; null unless serializeHandles.
    Nexil::Ptr<Nexil::Array<unsigned long long>> handleAddresses;
    Nexil::RuntimeServices const* services = nullptr;
};

/// Writes a whole stream of the current version. Throws `Nexil::String`, WriteFailure, and what the stream buffer throws.
void writeStream(Nexil::Array<Nexil::Ptr<Object>> const& objects, WriterContext const& context, std::ostream& stream);

} // namespace Veldrin::IO
