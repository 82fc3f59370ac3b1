#pragma once

#include <nexil/Any.h>
#include <nexil/Ptr.h>
#include <nexil/String.h>
#include <veldrin/object/Object.h>
#include <vld/Component.h>

#include <cstdint>
#include <map>
#include <typeindex>
#include <unordered_map>
#include <unordered_set>
#include <utility>
#include <vector>

/// From descriptions of proxies, as `describeVldProxy` makes them and files hold them, back to proxies.
namespace Veldrin::Geometry::Internal {

/// True for an object that claims to be a description.
[[nodiscard]] bool isProxyDescription(Object const& object);

/// Turns descriptions that were read back into proxies.
///
/// What several geometries share is rebuilt once: proxies with one description, and topologies with the same arrays.
/// Topologies that share only some of their arrays are checked each for itself, but no more of them than the arrays justify:
/// each array pays for `kLooksPerArray` looks at as many bytes, and whatever goes beyond counts as damaged.
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

    /// A kind of topology and the addresses of its arrays.
    using TilesKey = std::pair<std::type_index, std::vector<void const*>>;

    /// What arrays of tiles make together; null when they do not fit.
    struct Tiles {
        std::vector<Nexil::Any> arrays; // so that the addresses stay their own
        Nexil::Ptr<VLD::Component> topology;
    };

    static constexpr std::uint64_t kLooksPerArray = 16;
    // So that small ones need not be counted closely.
    static constexpr std::uint64_t kFreeBytes = 1 << 24;

    std::unordered_map<Object const*, Rebuilt> rebuilt_;
    std::map<TilesKey, Tiles> tiles_;
    /// Of each kind of topology and array of inner tiles, a topology that has it.
    std::map<std::pair<std::type_index, void const*>, Nexil::Ptr<VLD::Component>> topologyOfInnerTiles_;
    std::unordered_set<void const*> paidArrays_;
    std::uint64_t bytesToLookAt_ = kFreeBytes;
    std::vector<Nexil::String> damaged_;
};

} // namespace Veldrin::Geometry::Internal
