#include <vld/Container.h>

#include <nexil/parallel/Parallel.h>

#include <algorithm>
#include <cmath>
#include <iostream>
#include <memory>

namespace VLD::TileTree3D {

namespace {

    namespace grain {
        constexpr std::size_t kTiles = 512;
    } // namespace grain

} // namespace

template <class Traits>
Visitor<Traits>::~Visitor() = default;

template <class Traits>
Container<Traits>::Container(Nexil::String name, Nexil::Ptr<VoxelTopology<Traits>> topology, float voxelSize)
    : Component(std::move(name)), topology_(std::move(topology)),
      topologyName_(topology_ ? topology_->name() : Nexil::String()), voxelSize_(voxelSize)
{
}

template <class Traits>
Container<Traits>::~Container() = default;

template <class Traits>
Container<Traits>::Container(Container const&) = default;

template <class Traits>
bool Container<Traits>::checkConsistency(bool report) const
{
    if (!topology_) {
        if (report)
            std::cout << "container " << this->name().view() << ": no topology\n";
        return false;
    }
    bool const isSized = std::isfinite(voxelSize_) && voxelSize_ > 0;
    if (!isSized && report)
        std::cout << "container " << this->name().view() << ": voxel size " << voxelSize_ << "\n";
    return topology_->isConsistent(report) && isSized;
}

template <class Traits>
void Container<Traits>::reduceInternalNonInlined(Visitor<Traits>& visitor) const
{
    if (!topology_)
        return;
    std::size_t const leafCount = topology_->leafCount();
    std::size_t const tileCount = leafCount + topology_->innerCount();
    // Shared, as a reduction copies its identity, which is null.
    using Part = std::shared_ptr<Visitor<Traits>>;
    Part const found = Nexil::parallel::reduceInOrder(
        tileCount, grain::kTiles, Part(),
        [&](std::size_t begin, std::size_t end, Part part) {
            if (!part)
                part = visitor.fork();
            if (begin < leafCount)
                part->visitLeaves(*topology_, static_cast<unsigned int>(begin),
                                  static_cast<unsigned int>(std::min(end, leafCount)));
            if (end > leafCount)
                part->visitInner(*topology_, static_cast<unsigned int>(std::max(begin, leafCount) - leafCount),
                                 static_cast<unsigned int>(end - leafCount));
            return part;
        },
        [](Part left, Part const& right) {
            left->join(*right);
            return left;
        });
    if (found)
        visitor.join(*found);
}

template class Visitor<SmallTiles>;
template class Visitor<WideTiles>;
template class Container<SmallTiles>;
template class Container<WideTiles>;

} // namespace VLD::TileTree3D
