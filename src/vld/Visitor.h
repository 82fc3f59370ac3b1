#pragma once

#include <nexil/Export.h>
#include <vld/Traits.h>
#include <vld/VoxelTopology.h>

#include <memory>

namespace VLD::TileTree3D {

/// What `Container::reduceInternalNonInlined` takes along over the tiles of a container.
///
///     class Counter final : public Visitor<SmallTiles> {
///     public:
///         std::unique_ptr<Visitor> fork() const override { return std::make_unique<Counter>(); }
///         void visitLeaves(VoxelTopology<SmallTiles> const&, unsigned int begin, unsigned int end) override
///         {
///             count += end - begin;
///         }
///         void visitInner(VoxelTopology<SmallTiles> const&, unsigned int, unsigned int) override {}
///         void join(Visitor& right) override { count += static_cast<Counter&>(right).count; }
///         std::uint64_t count = 0;
///     };
///
/// Tiles come in runs, so that one virtual call pays for many.
template <class Traits>
class VELDRIN_PLATFORM_API Visitor {
public:
    virtual ~Visitor();

    /// A visitor of the same kind that has seen nothing yet. Called from several threads at once.
    [[nodiscard]] virtual std::unique_ptr<Visitor> fork() const = 0;
    /// Takes in the leaf tiles [begin, end).
    virtual void visitLeaves(VoxelTopology<Traits> const& topology, unsigned int begin, unsigned int end) = 0;
    /// Takes in the inner tiles [begin, end).
    virtual void visitInner(VoxelTopology<Traits> const& topology, unsigned int begin, unsigned int end) = 0;
    /// Takes in what `right`, which saw the tiles right after this one's, has found; `right` is not used again.
    virtual void join(Visitor& right) = 0;

protected:
    Visitor() = default;
    Visitor(Visitor const&) = default;
    Visitor& operator=(Visitor const&) = default;
};

extern template class Visitor<SmallTiles>;
extern template class Visitor<WideTiles>;

} // namespace VLD::TileTree3D
