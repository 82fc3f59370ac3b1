#pragma once

#include <nexil/Export.h>
#include <nexil/Ptr.h>
#include <nexil/String.h>
#include <vld/Component.h>
#include <vld/Traits.h>
#include <vld/Visitor.h>
#include <vld/VoxelTopology.h>

#include <cstdint>
#include <utility>

namespace VLD::TileTree3D {

/// Tiles placed in space: what channels belong to.
///
/// Voxel (i, j, k) is the cube from (i, j, k) * voxelSize to (i + 1, j + 1, k + 1) * voxelSize.
/// Threads: reading is safe from any number of them; a writer must be alone.
template <class Traits>
class VELDRIN_PLATFORM_API Container final : public Component {
public:
    /// topology: may be null; the container then has no elements and is not consistent.
    Container(Nexil::String name, Nexil::Ptr<VoxelTopology<Traits>> topology, float voxelSize);
    ~Container() override;
    Container(Container const&);

    /// Edge length of a voxel; finite and positive in a consistent container.
    [[nodiscard]] float voxelSize() const noexcept { return voxelSize_; }
    [[nodiscard]] Nexil::Ptr<VoxelTopology<Traits>> const& topology() const noexcept { return topology_; }
    /// Name of the topology that this container refers to in a volume.
    [[nodiscard]] Nexil::String const& topologyName() const noexcept { return topologyName_; }
    /// Refers to another topology of the volume by name; the tiles stay.
    void setTopologyName(Nexil::String name) noexcept { topologyName_ = std::move(name); }
    [[nodiscard]] std::uint64_t elementCount() const noexcept { return topology_ ? topology_->elementCount() : 0; }

    /// True when the topology is there and fits together, and the voxel size is finite and positive.
    ///
    /// report: prints what is wrong to standard output. Cost: linear in the tiles, parallel.
    [[nodiscard]] bool checkConsistency(bool report) const;

    /// Shows every tile to the visitor or to forks of it, and joins the forks in the order of the tiles, leaf tiles first:
    /// one result, bit for bit, for every number of threads.
    ///
    /// Errors: what the visitor throws; std::runtime_error when the job is cancelled.
    void reduceInternalNonInlined(Visitor<Traits>& visitor) const;

private:
    Nexil::Ptr<VoxelTopology<Traits>> topology_;
    Nexil::String topologyName_;
    float voxelSize_ = 1;
};

extern template class Container<SmallTiles>;
extern template class Container<WideTiles>;

} // namespace VLD::TileTree3D
