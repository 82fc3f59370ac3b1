#pragma once

#include <nexil/Ptr.h>
#include <veldrin/io/internal/Msgpack.h>
#include <veldrin/math/FCurve.h>

/// Animation curves as their serialization data tree: composites are maps, sequences arrays, nothing is nil.
namespace Veldrin::IO {

/// Builds a curve from its unpacked tree. Throws "unpack error" when the tree is no curve.
[[nodiscard]] Nexil::Ptr<Math::FCurve> unpackCurve(msgpack::object const& node);

/// Packs a tree.
template <class Stream>
void packTree(msgpack::packer<Stream>& packer, Nexil::SerializationData const& node)
{
    if (auto const* composite = node.asComposite()) {
        packer.pack_map(static_cast<std::uint32_t>(composite->size()));
        for (std::size_t i = 0; i < composite->size(); ++i) {
            auto const name = composite->nameAt(i).view();
            packer.pack_str(static_cast<std::uint32_t>(name.size()));
            packer.pack_str_body(name.data(), static_cast<std::uint32_t>(name.size()));
            packTree(packer, composite->childAt(i));
        }
    } else if (auto const* sequence = node.asSequence()) {
        packer.pack_array(static_cast<std::uint32_t>(sequence->size()));
        for (auto const& child : *sequence)
            packTree(packer, child);
    } else if (auto const* literal = node.asLiteral(); literal->isInt()) {
        packer.pack_unsigned_int(literal->asInt());
    } else if (literal->isDouble()) {
        packer.pack_double(literal->asDouble());
    } else {
        packer.pack_nil();
    }
}

} // namespace Veldrin::IO
