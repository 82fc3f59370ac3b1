#include <veldrin/volume/VolumeBounds.h>

#include <veldrin/geometry/Names.h>
#include <veldrin/volume/VolumeConversion.h>
#include <veldrin/volume/internal/Configurations.h>
#include <vld/Channel.h>
#include <vld/Visitor.h>

#include <algorithm>
#include <cmath>
#include <cstdint>
#include <limits>
#include <memory>

namespace Veldrin::GeometryAlgorithms {

namespace {

    using VLD::TileTree3D::ChannelBase;
    using VLD::TileTree3D::Container;
    using VLD::TileTree3D::Coordinate;
    using VLD::TileTree3D::kNoTile;
    using VLD::TileTree3D::Visitor;
    using VLD::TileTree3D::VoxelTopology;
    using Box = Math::bbox<Math::float3, float>;

    struct IsInside {
        template <class T>
        bool operator()(T distance) const
        {
            return distance <= 0;
        }
    };

    struct IsFog {
        template <class T>
        bool operator()(T density) const
        {
            return density > 0;
        }
    };

    /// A box of voxels, both corners inside; empty at first.
    struct VoxelExtent {
        Coordinate low{std::numeric_limits<int>::max(), std::numeric_limits<int>::max(),
                       std::numeric_limits<int>::max()};
        Coordinate high{std::numeric_limits<int>::min(), std::numeric_limits<int>::min(),
                        std::numeric_limits<int>::min()};

        void extend(Coordinate const& first, Coordinate const& last)
        {
            for (int axis = 0; axis < 3; ++axis) {
                low[axis] = std::min(low[axis], first[axis]);
                high[axis] = std::max(high[axis], last[axis]);
            }
        }
        [[nodiscard]] bool holds(Coordinate const& first, Coordinate const& last) const
        {
            return first.x >= low.x && first.y >= low.y && first.z >= low.z && last.x <= high.x && last.y <= high.y &&
                   last.z <= high.z;
        }
        [[nodiscard]] bool isEmpty() const { return low.x > high.x; }
    };

    template <class Traits, class T, class IsContent>
    class ContentVisitor final : public Visitor<Traits> {
    public:
        explicit ContentVisitor(T const* values) : values_(values) {}

        [[nodiscard]] std::unique_ptr<Visitor<Traits>> fork() const override
        {
            return std::make_unique<ContentVisitor>(values_);
        }

        void visitLeaves(VoxelTopology<Traits> const& topology, unsigned int begin, unsigned int end) override
        {
            constexpr int w = Traits::kDataWidth;
            for (unsigned int leaf = begin; leaf < end; ++leaf) {
                Coordinate const& origin = topology.leafOrigins()[leaf];
                if (extent_.holds(origin, lastOf(origin, w)))
                    continue;
                T const* const values = values_ + std::uint64_t(leaf) * Traits::kLeafVoxels;
                // Without an exit, so that many values are compared at once; most tiles are all content or none.
                unsigned int contentCount = 0;
                for (unsigned int place = 0; place < Traits::kLeafVoxels; ++place)
                    contentCount += isContent_(values[place]) ? 1u : 0u;
                if (contentCount == Traits::kLeafVoxels)
                    extent_.extend(origin, lastOf(origin, w));
                else if (contentCount != 0)
                    extendByVoxels(origin, values);
            }
        }

        void visitInner(VoxelTopology<Traits> const& topology, unsigned int begin, unsigned int end) override
        {
            for (unsigned int inner = begin; inner < end; ++inner) {
                Coordinate const& origin = topology.innerOrigins()[inner];
                if (extent_.holds(origin, lastOf(origin, Traits::kInnerWidth)))
                    continue;
                std::uint64_t const first = std::uint64_t(inner) * Traits::kInnerCells;
                for (unsigned int cell = 0; cell < Traits::kInnerCells; ++cell) {
                    if (topology.innerChildren()[first + cell] != kNoTile ||
                        !isContent_(values_[topology.voxelCount() + first + cell]))
                        continue;
                    Coordinate const low =
                        origin + VLD::TileTree3D::cellAtPlace<Traits::kTileWidth>(cell) * int(Traits::kDataWidth);
                    extent_.extend(low, lastOf(low, Traits::kDataWidth));
                }
            }
        }

        void join(Visitor<Traits>& right) override
        {
            VoxelExtent const& other = static_cast<ContentVisitor&>(right).extent_;
            extent_.extend(other.low, other.high);
        }

        [[nodiscard]] VoxelExtent const& extent() const { return extent_; }

    private:
        static Coordinate lastOf(Coordinate const& origin, int width)
        {
            return origin + Coordinate{width - 1, width - 1, width - 1};
        }

        /// Which planes of the tile have content, along each axis. Without a branch, as half the voxels decide each way.
        void extendByVoxels(Coordinate const& origin, T const* values)
        {
            constexpr int w = Traits::kDataWidth;
            bool inX[w]{}, inY[w]{}, inZ[w]{};
            for (int x = 0; x < w; ++x)
                for (int y = 0; y < w; ++y, values += w) {
                    bool inRow = false;
                    for (int z = 0; z < w; ++z) {
                        bool const isContent = isContent_(values[z]);
                        inZ[z] |= isContent;
                        inRow |= isContent;
                    }
                    inX[x] |= inRow;
                    inY[y] |= inRow;
                }
            auto first = [](bool const* in) { return static_cast<int>(std::find(in, in + w, true) - in); };
            auto last = [](bool const* in) {
                int plane = w - 1;
                while (!in[plane])
                    --plane;
                return plane;
            };
            extent_.extend(origin + Coordinate{first(inX), first(inY), first(inZ)},
                           origin + Coordinate{last(inX), last(inY), last(inZ)});
        }

        T const* values_;
        IsContent isContent_;
        VoxelExtent extent_;
    };

    /// Where the voxel of a number starts along an axis; where no float is there, the next one on the side of `outside`.
    float positionOf(std::int64_t number, float voxelSize, float outside)
    {
        // Wide enough to be exact for all voxels, and so that 0.1f * 10 compares as what it is, not as 1.
        long double const position = static_cast<long double>(number) * voxelSize;
        auto const nearest = static_cast<float>(position);
        bool const isBeyond = outside < 0 ? nearest <= position : nearest >= position;
        return isBeyond ? nearest : std::nextafter(nearest, outside);
    }

    template <class IsContent, class T, class Traits>
    bool growByValues(ChannelBase const& channel, Container<Traits> const& container, Box& box)
    {
        auto const values = channel.values<T>();
        if (!values)
            return false;
        ContentVisitor<Traits, T, IsContent> visitor(values->data());
        container.reduceInternalNonInlined(visitor);
        VoxelExtent const& extent = visitor.extent();
        if (extent.isEmpty())
            return true;
        auto corner = [&](Coordinate const& voxel, int step, float outside) {
            auto at = [&](int v) { return positionOf(std::int64_t(v) + step, container.voxelSize(), outside); };
            return Math::float3{at(voxel.x), at(voxel.y), at(voxel.z)};
        };
        constexpr float kInfinity = std::numeric_limits<float>::infinity();
        box.extend(corner(extent.low, 0, -kInfinity));
        box.extend(corner(extent.high, 1, kInfinity));
        return true;
    }

    /// A topology that nobody checked may lack children of its cells.
    template <class Traits>
    bool hasAllChildren(VoxelTopology<Traits> const& topology)
    {
        return topology.innerChildren().size() == std::uint64_t(topology.innerCount()) * Traits::kInnerCells;
    }

    template <class IsContent, class Traits>
    bool growByChannel(VLD::Object const& volume, char const* name, Container<Traits> const& container,
                       VoxelTopology<Traits> const& topology, Box& box)
    {
        auto const channel = volume.component<ChannelBase>(name);
        if (!channel || !container.topology() || channel->containerName() != container.name() ||
            channel->tileParameters() != Traits::parameters() || channel->elementCount() != topology.elementCount() ||
            container.elementCount() != topology.elementCount() || !hasAllChildren(*container.topology()))
            return false;
        return growByValues<IsContent, float>(*channel, container, box) ||
               growByValues<IsContent, double>(*channel, container, box);
    }

} // namespace

template <class Traits>
bool volumeBounds(VLD::Object const& volume, Container<Traits> const& container, VoxelTopology<Traits> const& topology,
                  Box& box)
{
    bool const hasDistance = growByChannel<IsInside>(volume, Geometry::sVoxelSignedDistance, container, topology, box);
    bool const hasFog = growByChannel<IsFog>(volume, Geometry::sVoxelFogDensity, container, topology, box);
    return hasDistance || hasFog;
}

template VELDRIN_API bool volumeBounds(VLD::Object const&, Container<VLD::TileTree3D::SmallTiles> const&,
                                       VoxelTopology<VLD::TileTree3D::SmallTiles> const&, Box&);
template VELDRIN_API bool volumeBounds(VLD::Object const&, Container<VLD::TileTree3D::WideTiles> const&,
                                       VoxelTopology<VLD::TileTree3D::WideTiles> const&, Box&);

void getVolumeBounds(Object const& geometry, Box& box)
{
    auto const volume = Geometry::shallow_copy_object_to_vld_volume(geometry);
    if (!volume)
        return;
    Box grown = box;
    for (Nexil::String const& name : volume->componentRange())
        Geometry::Internal::forEachConfiguration([&]<class Traits>() {
            auto const container = volume->component<Container<Traits>>(name);
            if (!container)
                return;
            if (auto const topology = volume->component<VoxelTopology<Traits>>(container->topologyName()))
                volumeBounds(*volume, *container, *topology, grown);
        });
    box = grown;
}

} // namespace Veldrin::GeometryAlgorithms
