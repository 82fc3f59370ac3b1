#pragma once

#include <nexil/Ptr.h>
#include <nexil/SerializationData.h>
#include <veldrin/io/internal/Packer.h>
#include <veldrin/math/FCurve.h>

/// Animation curves as their serialization data tree: composites are maps, sequences arrays, nothing is nil.
namespace Veldrin::IO {

/// Builds a curve from its unpacked tree. Throws "unpack error" when the tree is no curve.
[[nodiscard]] Nexil::Ptr<Math::FCurve> unpackCurve(msgpack::object const& node);

/// Packs a tree.
void packTree(Packer& packer, Nexil::SerializationData const& node);

} // namespace Veldrin::IO
