#pragma once

#include <nexil/Any.h>
#include <nexil/Ptr.h>
#include <nexil/String.h>
#include <veldrin/object/Object.h>
#include <vld/Component.h>

#include <cstddef>
#include <unordered_map>
#include <vector>

/// From descriptions of proxies, as `describeVldProxy` makes them and files hold them, back to proxies.
namespace Veldrin::Geometry::Internal {

/// True for an object that claims to be a description.
[[nodiscard]] bool isProxyDescription(Object const& object);

/// Turns descriptions that were read back into proxies.
///
/// What several geometries share is rebuilt once: proxies with one description, and topologies with the same arrays. No array
/// is looked at twice, however often descriptions refer to it.
class ProxyRebuilder {
public:
    /// Replaces every description in `geometry` by a proxy, in its place. One that does not fit together, by itself or with
    /// what it targets, stays as it is, and its name is kept for `damaged`.
    void rebuild(Object& geometry);

    [[nodiscard]] std::vector<Nexil::String> const& damaged() const noexcept { return damaged_; }

private:
    class Pass;

    /// A proxy that was rebuilt. What from is held too, so that its address stays its own.
    struct Rebuilt {
        Nexil::Ptr<Object> description;
        Nexil::Ptr<VLD::Component> target;
        Nexil::Ptr<Object> proxy;
    };

    /// Arrays of tiles that were looked at together, and what they make; null when they do not fit together.
    struct Tiles {
        std::vector<void const*> addresses;
        std::vector<Nexil::Any> arrays; // so that the addresses stay their own
        Nexil::Ptr<VLD::Component> topology;
    };

    std::unordered_map<Object const*, Rebuilt> rebuilt_;
    std::vector<Tiles> tiles_;
    std::unordered_map<void const*, std::size_t> tilesOfArray_;
    std::vector<Nexil::String> damaged_;
};

} // namespace Veldrin::Geometry::Internal
