#pragma once

#include <nexil/Any.h>
#include <nexil/RuntimeMessage.h>
#include <veldrin/io/internal/ByteSink.h>
#include <veldrin/io/internal/ChunkWriter.h>
#include <veldrin/io/internal/ObjectGraph.h>
#include <veldrin/io/internal/StreamTypes.h>
#include <veldrin/object/Object.h>

namespace Veldrin::IO::V3 {

/// Writes values as the current format has them. Throws `Nexil::String` and WriteFailure.
class PackVisitor {
public:
    /// graph: which pointers are written as references; null when everything is written inline.
    /// services: hears of properties that are left out; may be null.
    PackVisitor(ByteSink& sink, int compressionLevel, ObjectGraph const* graph, Nexil::RuntimeServices const* services);

    /// Writes the frame [code, payload] of a pointer, its value inline whatever the graph says: an entry's own bytes.
    void packEntry(Nexil::Any const& pointer);

    /// Writes an object as [name, frame, name, frame, ...]. Properties of unknown type are left out with a warning.
    void packObject(Object const& object);

private:
    void packFrame(Nexil::Any const& value, StreamType const& type);
    void packPayload(Nexil::Any const& value, StreamType const& type);
    void packPointer(Nexil::Any const& pointer, StreamType const& type);
    void packPointee(Nexil::Any const& pointer, StreamType const& type);
    void packScalar(unsigned int code, std::byte const* bytes);
    void packString(Nexil::String const& text);
    void packElement(Nexil::Any const& element);
    template <class Elements, class PackOne>
    void packElements(Elements const& elements, PackOne const& packOne);
    void warnOfUnknown(Nexil::String const& name, Nexil::Any const& value) const;

    ByteSink& sink_;
    Packer packer_;
    int compressionLevel_;
    ObjectGraph const* graph_;
    Nexil::RuntimeServices const* services_;
};

} // namespace Veldrin::IO::V3
