#include <veldrin/io/internal/CurveTree.h>

#include <nexil/String.h>

#include <limits>

namespace Veldrin::IO {

namespace {

    // Recursion ends with the nesting of an item, which is bounded.
    Nexil::SerializationData unpackTree(msgpack::object const& node)
    {
        switch (node.type) {
        case msgpack::type::MAP: {
            Nexil::CompositeSerializationData composite;
            for (auto const& pair : node.via.map) {
                if (pair.key.type != msgpack::type::STR)
                    throw Nexil::String("unpack error");
                composite[Nexil::String(pair.key.via.str.ptr, pair.key.via.str.size)] = unpackTree(pair.val);
            }
            return composite;
        }
        case msgpack::type::ARRAY: {
            Nexil::SequenceSerializationData sequence;
            for (auto const& child : node.via.array)
                sequence.push_back(unpackTree(child));
            return sequence;
        }
        case msgpack::type::POSITIVE_INTEGER:
            if (node.via.u64 > std::numeric_limits<unsigned int>::max())
                throw Nexil::String("unpack error");
            return static_cast<unsigned int>(node.via.u64);
        case msgpack::type::FLOAT64: return node.via.f64;
        case msgpack::type::NIL: return {};
        default: throw Nexil::String("unpack error");
        }
    }

} // namespace

Nexil::Ptr<Math::FCurve> unpackCurve(msgpack::object const& node)
{
    auto curve = Nexil::makeMutable<Math::FCurve>();
    if (!Nexil::deserializeFCurve(unpackTree(node), *curve))
        throw Nexil::String("unpack error");
    return curve;
}

void packTree(Packer& packer, Nexil::SerializationData const& node)
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
        packer.packDouble(literal->asDouble());
    } else {
        packer.pack_nil();
    }
}

} // namespace Veldrin::IO
