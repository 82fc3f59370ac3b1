#pragma once

#include <nexil/Array.h>
#include <nexil/Ptr.h>
#include <nexil/RuntimeMessage.h>
#include <nexil/Stream.h>
#include <nexil/String.h>
#include <veldrin/geometry/Export.h>
#include <veldrin/io/StreamOptions.h>
#include <veldrin/object/Object.h>

/// The zon object stream: objects with everything they hold, to bytes and back.
///
///     Nexil::Array<Nexil::Ptr<Veldrin::Object>> objects{cube};
///     if (!Veldrin::IO::serialize(objects, "cube.zon", {}, &services))
///         ...                                          // services heard why
///     Nexil::Array<Nexil::Ptr<Veldrin::Object>> loaded;
///     Veldrin::IO::deserialize("cube.zon", loaded, {}, &services);
///
/// An object or array that is held more than once is stored once and comes back shared. Every value carries a checksum:
/// a damaged file is refused, never read as something else. The format is described in docs/zon-format.md.
///
/// Every function answers true for success. On false the services (which may be null) have heard one message of category
/// Error that says why, unless the job was cancelled or the stream's version is 0. No failure leaves as an exception but
/// std::bad_alloc.
/// Threads: calls on different streams may run at once. Objects are only read while they are written out.
namespace Veldrin::IO {

/// Writes the objects to the file `path`, created or cut to nothing first.
///
/// objects: may hold null pointers, and one object several times.
/// A property whose type a stream cannot hold is left out with a warning.
/// Errors: "Cannot open file for writing: " or "Cannot write to file: " and the path (full disk); "Bad parent" for an
/// object that holds itself. A failed write leaves what was written; write to another name and rename where the old file
/// must survive.
/// Cost: with level 0 one pass over the arrays' bytes, without copies; else that of the compressor.
VELDRIN_API bool serialize(Nexil::Array<Nexil::Ptr<Object>> const& objects, Nexil::String const& path,
                           SerializationOptions const& options, Nexil::RuntimeServices const* services);

/// The same to a stream, which must be able to seek; positions in it count from its own start. The stream is left behind
/// its table offset, so a caller who goes on writing seeks to the end first. A reader takes everything up to the end for
/// this one: what stood there before and reaches further must be cut off by the caller.
VELDRIN_API bool serialize(Nexil::Array<Nexil::Ptr<Object>> const& objects, Nexil::OutputStream& stream,
                           SerializationOptions const& options, Nexil::RuntimeServices const* services);

/// The same for the caller's handles: the stream also holds the handles' addresses, by which equal handles can be told.
/// A null handle is written like a null pointer. Readers never turn the addresses into pointers.
VELDRIN_API bool serialize(Nexil::Array<Nexil::Ptr<Object>*> const& handles, Nexil::OutputStream& stream,
                           SerializationOptions const& options, Nexil::RuntimeServices const* services);

/// Reads a stream of any version and appends its top-level objects to `out`, which is untouched on failure.
///
/// The stream is read from where it stands, to its end, where it is left; after a failure it stands anywhere. One that
/// cannot seek is first read into memory.
/// Memory: never more than 300 times the stream's bytes and 64 MiB, whatever the bytes are; for honest streams near the
/// size of the result.
/// Errors: docs/zon-format.md lists each message at its cause.
VELDRIN_API bool deserialize(Nexil::InputStream& stream, Nexil::Array<Nexil::Ptr<Object>>& out,
                             DeserializationOptions const& options, Nexil::RuntimeServices const* services);

/// The same from the file `path`. Errors: also "Cannot open file for reading: " and the path.
VELDRIN_API bool deserialize(Nexil::String const& path, Nexil::Array<Nexil::Ptr<Object>>& out,
                             DeserializationOptions const& options, Nexil::RuntimeServices const* services);

/// Reads the header alone into `header`, which is untouched on failure; nothing behind it is consumed.
/// Errors: "bad header" when the first item is no object, "Incorrect zon stream identifier".
VELDRIN_API bool deserializeHeader(Nexil::InputStream& stream, Object& header, Nexil::RuntimeServices const* services);

/// The same from the file `path`. Cost: independent of the file's size.
VELDRIN_API bool deserializeHeader(Nexil::String const& path, Object& header, Nexil::RuntimeServices const* services);

} // namespace Veldrin::IO
