#pragma once

#include <nexil/Array.h>
#include <nexil/Export.h>
#include <nexil/Ptr.h>
#include <nexil/String.h>
#include <veldrin/math/Vector.h>
#include <vld/Component.h>
#include <vld/Coordinates.h>
#include <vld/Traits.h>

#include <cstdint>

namespace VLD::TileTree3D {

/// Points sorted into leaf tiles: the points of tile t are those from `offsets[t]` up to `offsets[t + 1]` - 1.
///
/// Its elements are its points; channels that belong to it hold one value for each.
/// Immutable once made. Threads: safe from any number of them.
template <class Traits>
class VELDRIN_PLATFORM_API PointTopology final : public Component {
public:
    /// Takes tiles that are known to fit together; what comes from elsewhere goes through `create`.
    PointTopology(Nexil::String name, Nexil::Array<Coordinate> leafOrigins, Nexil::Array<unsigned int> offsets);
    /// The same from shared arrays, none of them null, which stay shared.
    PointTopology(Nexil::String name, Nexil::Ptr<Nexil::Array<Coordinate>> leafOrigins,
                  Nexil::Ptr<Nexil::Array<unsigned int>> offsets);
    /// The same points under another name, shared. Cost: constant.
    PointTopology(Nexil::String name, PointTopology const& points);
    ~PointTopology() override;
    PointTopology(PointTopology const&);

    /// Null when `isConsistent` would be false, or the name is empty.
    [[nodiscard]] static Nexil::Ptr<PointTopology> create(Nexil::String name, Nexil::Array<Coordinate> leafOrigins,
                                                          Nexil::Array<unsigned int> offsets);
    /// The same from shared arrays, which stay shared; null also when one of them is null.
    [[nodiscard]] static Nexil::Ptr<PointTopology> create(Nexil::String name,
                                                          Nexil::Ptr<Nexil::Array<Coordinate>> leafOrigins,
                                                          Nexil::Ptr<Nexil::Array<unsigned int>> offsets);

    /// Sorts points into tiles of voxels of the given size.
    ///
    /// order: for each element the index of its point; within a tile, points keep their order. Untouched on failure.
    /// Null for a name that is empty, a voxel size that is not finite and positive, a point outside the coordinate
    /// limits, and more points than 32 bits count. Cost: n log n, parallel. Threads: one result for every number of them.
    [[nodiscard]] static Nexil::Ptr<PointTopology> build(Nexil::String name,
                                                         Nexil::Array<Veldrin::Math::float3> const& positions,
                                                         float voxelSize, Nexil::Array<unsigned int>& order);

    [[nodiscard]] Nexil::Array<Coordinate> const& leafOrigins() const noexcept { return *leafOrigins_; }
    [[nodiscard]] Nexil::Array<unsigned int> const& offsets() const noexcept { return *offsets_; }
    [[nodiscard]] Nexil::Ptr<Nexil::Array<Coordinate>> const& sharedLeafOrigins() const noexcept
    {
        return leafOrigins_;
    }
    [[nodiscard]] Nexil::Ptr<Nexil::Array<unsigned int>> const& sharedOffsets() const noexcept { return offsets_; }
    [[nodiscard]] std::uint64_t elementCount() const noexcept
    {
        return offsets().empty() ? 0 : offsets()[offsets().size() - 1];
    }

    /// True when origins are increasing, unique, aligned and within the limits, and offsets start at 0, do not fall, and
    /// are one more than the tiles.
    [[nodiscard]] bool isConsistent() const;

private:
    Nexil::Ptr<Nexil::Array<Coordinate>> leafOrigins_;
    Nexil::Ptr<Nexil::Array<unsigned int>> offsets_;
};

extern template class PointTopology<SmallTiles>;
extern template class PointTopology<WideTiles>;

} // namespace VLD::TileTree3D
