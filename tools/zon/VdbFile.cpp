#include "VdbFile.h"

#include "Command.h"
#include "OutputFile.h"
#include "ValueRows.h"
#include "VdbOpening.h"
#include "VolumeParts.h"

#include <veldrin/geometry/Names.h>
#include <veldrin/object/Properties.h>
#include <veldrin/volume/VolumeNames.h>
#include <vld/PointTopology.h>

#include <openvdb/openvdb.h>
#include <openvdb/tools/MeshToVolume.h>
#include <openvdb/tools/Prune.h>

#include <fmt/format.h>

#include <unistd.h>

#include <algorithm>
#include <cmath>
#include <cstring>
#include <functional>
#include <numbers>
#include <optional>
#include <string_view>
#include <type_traits>

// Their leaves are blocks of 8 x 8 x 8 voxels that start at multiples of 8: each is one inner tile of our small ones.
namespace Zon {

namespace {

    using namespace Veldrin;
    using namespace VLD::TileTree3D;
    using Math::double4;
    using Math::float3;

    constexpr char kTransform[] = "vdb_transform";
    constexpr char kActive[] = "_active";
    constexpr int kBlockWidth = SmallTiles::kInnerWidth;
    // Blocks of one value that are taken: some for all grids of a file, which is half a gigabyte at most, and more by the
    // blocks of a grid that have voxels of their own, so that the inside of a large surface has its place.
    constexpr double kFreeBlocks = 1 << 21;
    constexpr double kBlocksPerLeaf = 64;

    // Their largest tiles are as wide as this; filling a part of one that ends at the last coordinate never ends.
    constexpr std::int64_t kEndOfGrids = (std::int64_t(1) << 31) - 4096;

    // Their arithmetic on coordinates is of 32 bits, and goes a few voxels beyond the band.
    constexpr double kMostMeshCoordinate = 1 << 30;
    // What is taken for one while a mesh is turned into a level set, on an average over surfaces, as measured.
    constexpr double kBytesPerBandVoxel = 32;

    /// Calls visit.operator()<E>() for the element types that both sides have.
    template <class Visit>
    void forEachElementType(Visit const& visit)
    {
        visit.template operator()<float>();
        visit.template operator()<double>();
        visit.template operator()<int>();
        visit.template operator()<bool>();
        visit.template operator()<float3>();
    }

    template <class T>
    T ours(T value)
    {
        return value;
    }
    float3 ours(openvdb::Vec3s const& v)
    {
        return {v.x(), v.y(), v.z()};
    }
    template <class T>
    T theirs(T value)
    {
        return value;
    }
    openvdb::Vec3s theirs(float3 const& v)
    {
        return {v.x, v.y, v.z};
    }
    openvdb::Coord theirs(Coordinate const& c)
    {
        return {c.x, c.y, c.z};
    }

    /// Their usual tree over values of that type: `openvdb::FloatGrid` for float.
    template <class E>
    using VdbGrid = openvdb::Grid<typename openvdb::tree::Tree4<decltype(theirs(E())), 5, 4, 3>::Type>;

    /// What the inside of a level set has where there is no band.
    template <class E>
    E inside(E const& background)
    {
        if constexpr (std::is_floating_point_v<E>)
            return -background;
        else
            return background;
    }

    template <class E>
    bool isSame(E const& a, E const& b)
    {
        return std::memcmp(&a, &b, sizeof(E)) == 0;
    }

    bool isLevelSet(Nexil::String const& channelName)
    {
        return channelName == Geometry::sVoxelSignedDistance;
    }

    /// Which values count as active where nothing else tells.
    template <class E>
    struct ActiveRule {
        E background;
        bool isLevelSet;

        bool operator()(E const& value) const
        {
            return !isSame(value, background) && !(isLevelSet && isSame(value, inside(background)));
        }
    };

    /// Where the centres of a grid's voxels lie: at `translation` + voxel * `voxelSize`.
    struct Placement {
        double translation[3] = {0, 0, 0};
        double voxelSize = 1;

        /// Voxels of ours of that size: centred half a voxel behind their corner.
        static Placement ofOurs(float voxelSize)
        {
            double const size = voxelSize;
            return {{size * 0.5, size * 0.5, size * 0.5}, size};
        }

        /// How far their voxels lie from ours of the same coordinates, in voxels along the axis where it is most.
        [[nodiscard]] double distanceToOurs() const
        {
            double most = 0;
            for (double const t : translation)
                most = std::max(most, std::abs(t / voxelSize - 0.5));
            return most;
        }

        friend bool operator==(Placement const&, Placement const&) = default;
    };

    /// Nothing for any other transform than one positive scale and a translation.
    std::optional<Placement> placementOf(openvdb::math::Transform const& transform)
    {
        if (!transform.isLinear())
            return std::nullopt;
        // Of the map itself, as its matrix is the product of several in some maps.
        auto const origin = transform.indexToWorld(openvdb::Vec3d(0));
        Placement const placement{{origin.x(), origin.y(), origin.z()}, transform.voxelSize().x()};
        auto const size = static_cast<float>(placement.voxelSize);
        if (!std::isfinite(size) || !(size > 0))
            return std::nullopt;
        auto const matrix = transform.baseMap()->getAffineMap()->getMat4();
        for (int row = 0; row < 3; ++row)
            for (int column = 0; column < 3; ++column)
                if (!(std::abs(matrix(row, column) - (row == column ? placement.voxelSize : 0)) <=
                      1e-9 * placement.voxelSize))
                    return std::nullopt;
        return placement;
    }

    openvdb::math::Transform::Ptr transformOf(Placement const& placement)
    {
        auto const& t = placement.translation;
        try {
            // A scale, and behind it a translation: x * voxelSize + t.
            openvdb::math::MapBase::Ptr const map =
                std::make_shared<openvdb::math::UniformScaleTranslateMap>(placement.voxelSize, openvdb::Vec3d(t));
            return std::make_shared<openvdb::math::Transform>(map);
        } catch (openvdb::ArithmeticError const&) {
            throw Failure(fmt::format("OpenVDB takes no voxels of size {}", static_cast<float>(placement.voxelSize)));
        }
    }

    /// Turns one grid into a volume.
    template <class E>
    class GridReader {
    public:
        using Grid = VdbGrid<E>;
        using Leaf = typename Grid::TreeType::LeafNodeType;
        static_assert(Leaf::DIM == kBlockWidth);

        GridReader(Grid const& grid, Nexil::String const& channelName, double& freeBlocks)
            : grid_(grid), channelName_(channelName), background_(ours(grid.background())),
              isActive_{background_, isLevelSet(channelName)}, freeBlocks_(freeBlocks)
        {
        }

        /// Throws Failure with the reason for what no volume holds.
        Nexil::MutablePtr<VLD::Object> read(float voxelSize)
        {
            collectBlocks();
            collectLeaves();
            auto topology = VoxelTopology<SmallTiles>::create(Geometry::sVoxelComp, layOutTiles());
            if (!topology)
                throw Failure("it has more voxels than a volume holds, or some beyond the coordinates that there are");
            return makeVolume(std::move(topology), voxelSize);
        }

    private:
        /// A region of 8 x 8 x 8 voxels: a leaf of theirs, or constant.
        struct Block {
            Coordinate origin;
            Leaf const* leaf;
            E value;
            bool isActive;
        };

        /// One of our leaf tiles: the cell of a block.
        struct PlacedLeaf {
            Coordinate origin;
            unsigned int block;
            unsigned int cell;
        };

        void collectBlocks()
        {
            auto const& root = grid_.tree().root();
            double const ownBlocks = kBlocksPerLeaf * static_cast<double>(grid_.tree().leafCount());
            mostBlocks_ = freeBlocks_ + ownBlocks;
            for (auto child = root.cbeginChildOn(); child; ++child)
                collectBlocks(*child);
            for (auto tile = root.cbeginValueAll(); tile; ++tile)
                addTile(tile.getCoord(), std::int64_t(std::decay_t<decltype(root)>::ChildNodeType::DIM), ours(*tile),
                        tile.isValueOn());
            if (constantBlockCount_ > mostBlocks_)
                throw Failure(
                    fmt::format("its regions of one value cover {:.0f} blocks of {} x {} x {} voxels, and more "
                                "than {:.0f} are not taken",
                                constantBlockCount_, kBlockWidth, kBlockWidth, kBlockWidth, mostBlocks_));
            freeBlocks_ -= std::max(0.0, constantBlockCount_ - ownBlocks);
            std::sort(blocks_.begin(), blocks_.end(),
                      [](Block const& a, Block const& b) { return isBefore(a.origin, b.origin); });
        }

        void collectBlocks(Leaf const& leaf)
        {
            auto const& origin = leaf.origin();
            blocks_.push_back({{origin.x(), origin.y(), origin.z()}, &leaf, background_, false});
        }

        // Their iterators over a whole tree take a minute to compile.
        template <class Node>
        void collectBlocks(Node const& node)
        {
            for (openvdb::Index i = 0; i < Node::NUM_VALUES; ++i) {
                auto const& slot = node.getTable()[i];
                if (node.isChildMaskOn(i))
                    collectBlocks(*slot.getChild());
                else
                    addTile(node.offsetToGlobalCoord(i), Node::ChildNodeType::DIM, ours(slot.getValue()),
                            node.isValueMaskOn(i));
            }
        }

        /// Takes a cube of equal voxels apart; what is too much is only counted.
        void addTile(openvdb::Coord const& origin, std::int64_t width, E const& value, bool isOn)
        {
            if (!isOn && isSame(value, background_))
                return;
            auto const blocksAlong = static_cast<double>(width / kBlockWidth);
            constantBlockCount_ += blocksAlong * blocksAlong * blocksAlong;
            if (constantBlockCount_ > mostBlocks_)
                return;
            for (int x = 0; x < width; x += kBlockWidth)
                for (int y = 0; y < width; y += kBlockWidth)
                    for (int z = 0; z < width; z += kBlockWidth)
                        blocks_.push_back({{origin.x() + x, origin.y() + y, origin.z() + z}, nullptr, value, isOn});
        }

        /// Calls visit(place in our leaf tile, offset in their leaf) for the voxels of a cell.
        template <class Visit>
        static void forEachVoxel(unsigned int cell, Visit const& visit)
        {
            constexpr int w = SmallTiles::kDataWidth;
            Coordinate const low = cellAtPlace<SmallTiles::kTileWidth>(cell) * w;
            for (unsigned int place = 0; place < SmallTiles::kLeafVoxels; ++place) {
                Coordinate const voxel = low + cellAtPlace<w>(place);
                visit(place, Leaf::coordToOffset(theirs(voxel)));
            }
        }

        /// Cells in which voxels differ become leaf tiles.
        void collectLeaves()
        {
            for (unsigned int number = 0; number < blocks_.size(); ++number) {
                Block const& block = blocks_[number];
                if (!block.leaf)
                    continue;
                for (unsigned int cell = 0; cell < SmallTiles::kInnerCells; ++cell) {
                    auto const [first, isFirstOn] = firstOf(block, cell);
                    bool isConstant = true;
                    forEachVoxel(cell, [&](unsigned int, openvdb::Index offset) {
                        isConstant = isConstant && isSame(ours(block.leaf->getValue(offset)), first) &&
                                     block.leaf->isValueOn(offset) == isFirstOn;
                    });
                    if (!isConstant)
                        leaves_.push_back(
                            {block.origin + cellAtPlace<SmallTiles::kTileWidth>(cell) * int(SmallTiles::kDataWidth),
                             number, cell});
                }
            }
            std::sort(leaves_.begin(), leaves_.end(),
                      [](PlacedLeaf const& a, PlacedLeaf const& b) { return isBefore(a.origin, b.origin); });
        }

        /// Value and state of a cell's lowest voxel: of all its voxels where it is constant.
        std::pair<E, bool> firstOf(Block const& block, unsigned int cell) const
        {
            if (!block.leaf)
                return {block.value, block.isActive};
            auto const offset =
                Leaf::coordToOffset(theirs(cellAtPlace<SmallTiles::kTileWidth>(cell) * int(SmallTiles::kDataWidth)));
            return {ours(block.leaf->getValue(offset)), block.leaf->isValueOn(offset)};
        }

        TileLevels layOutTiles() const
        {
            TileLevels levels;
            levels.innerOrigins.reserve(blocks_.size());
            for (Block const& block : blocks_)
                levels.innerOrigins.push_back(block.origin);
            levels.innerChildren.resize(blocks_.size() * SmallTiles::kInnerCells);
            std::fill(levels.innerChildren.begin(), levels.innerChildren.end(), kNoTile);
            for (PlacedLeaf const& leaf : leaves_) {
                levels.innerChildren[leaf.block * std::uint64_t(SmallTiles::kInnerCells) + leaf.cell] =
                    static_cast<unsigned int>(levels.leafOrigins.size());
                levels.leafOrigins.push_back(leaf.origin);
                levels.leafParents.push_back(leaf.block);
            }
            return levels;
        }

        Nexil::MutablePtr<VLD::Object> makeVolume(Nexil::Ptr<VoxelTopology<SmallTiles>> topology, float voxelSize) const
        {
            Nexil::Array<E> values;
            Nexil::Array<bool> states;
            values.resize(topology->elementCount());
            states.resize(topology->elementCount());
            bool followsRule = true;
            auto store = [&](std::uint64_t element, E const& value, bool isOn) {
                values[element] = value;
                states[element] = isOn;
                followsRule = followsRule && isActive_(value) == isOn;
            };
            for (std::uint64_t leaf = 0; leaf < leaves_.size(); ++leaf) {
                Leaf const& from = *blocks_[leaves_[leaf].block].leaf;
                forEachVoxel(leaves_[leaf].cell, [&](unsigned int place, openvdb::Index offset) {
                    store(leaf * SmallTiles::kLeafVoxels + place, ours(from.getValue(offset)), from.isValueOn(offset));
                });
            }
            for (std::uint64_t element = topology->voxelCount(); element < values.size(); ++element) {
                auto const cell = element - topology->voxelCount();
                auto const [value, isOn] =
                    firstOf(blocks_[cell / SmallTiles::kInnerCells], unsigned(cell % SmallTiles::kInnerCells));
                if (topology->isCellWithLeaf(static_cast<unsigned int>(element)))
                    store(element, background_, false);
                else
                    store(element, value, isOn);
            }
            auto volume = VLD::createObject();
            volume->addComponent(topology);
            volume->addComponent(Nexil::makePtr<Container<SmallTiles>>(Geometry::sVoxelTileTree, topology, voxelSize));
            volume->addComponent(Nexil::makePtr<Channel<SmallTiles>>(channelName_, Geometry::sVoxelTileTree,
                                                                     Nexil::makePtr<Nexil::Array<E>>(std::move(values)),
                                                                     background_));
            if (!followsRule)
                volume->addComponent(Nexil::makePtr<Channel<SmallTiles>>(
                    channelName_ + kActive, Geometry::sVoxelTileTree,
                    Nexil::makePtr<Nexil::Array<bool>>(std::move(states)), false, DataElementInitializerType::Nearest));
            return volume;
        }

        Grid const& grid_;
        Nexil::String channelName_;
        E background_;
        ActiveRule<E> isActive_;
        std::vector<Block> blocks_;
        double& freeBlocks_;            // that are left for this grid and the file's next ones
        double constantBlockCount_ = 0; // of those that there would be
        double mostBlocks_ = 0;
        std::vector<PlacedLeaf> leaves_;
    };

    Nexil::String channelNameOf(openvdb::GridBase const& grid, bool isDistance)
    {
        if (isDistance && grid.getGridClass() == openvdb::GRID_LEVEL_SET)
            return Geometry::sVoxelSignedDistance;
        if (isDistance && grid.getGridClass() == openvdb::GRID_FOG_VOLUME)
            return Geometry::sVoxelFogDensity;
        Nexil::String const name = grid.getName().empty() ? "values" : grid.getName().c_str();
        Nexil::String const mapped = mapGeoPropertyNameFromVLDVolume(name, Object());
        // The tiles have these names.
        bool const isTaken = mapped == Geometry::sVoxelComp || mapped == Geometry::sVoxelTileTree;
        return isTaken ? mapped + "_values" : mapped;
    }

    /// The grid as geometry; throws Failure with the reason. freeBlocks: what is left of `kFreeBlocks` for its file.
    Nexil::Ptr<Object> objectOf(openvdb::GridBase const& grid, double& freeBlocks)
    {
        auto const placement = placementOf(grid.constTransform());
        if (!placement)
            throw Failure("its transform is not one positive scale and a translation");
        auto const voxelSize = static_cast<float>(placement->voxelSize);
        Nexil::MutablePtr<Object> object;
        Nexil::String channelName;
        bool isKnown = false;
        forEachElementType([&]<class E>() {
            using Grid = VdbGrid<E>;
            if (grid.type() != Grid::gridType())
                return;
            isKnown = true;
            channelName = channelNameOf(grid, std::is_floating_point_v<E>);
            auto volume = GridReader<E>(static_cast<Grid const&>(grid), channelName, freeBlocks).read(voxelSize);
            object = Geometry::move_vld_volume_to_object(*volume);
        });
        if (!isKnown)
            throw Failure("it is a grid of type " + grid.type());
        // A grid that is called like its channel has no name of its own.
        if (Nexil::String const name = grid.getName().c_str(); !name.empty() && name != channelName)
            setProperty(*object, "name", name);
        if (*placement != Placement::ofOurs(voxelSize)) {
            auto const& t = placement->translation;
            setProperty(*object, kTransform, double4{t[0], t[1], t[2], placement->voxelSize});
        }
        return object;
    }

    /// A topology of either configuration; what follows is compiled once for both.
    struct AnyTopology {
        std::uint64_t voxelCount;
        std::uint64_t elementCount;
        std::function<VoxelCube(unsigned int element)> cubeOf;
        std::function<bool(unsigned int element)> isCellWithLeaf;

        template <class Traits>
        explicit AnyTopology(VoxelTopology<Traits> const& topology)
            : voxelCount(topology.voxelCount()), elementCount(topology.elementCount()),
              cubeOf([&topology](unsigned int element) { return topology.elementCube(element); }),
              isCellWithLeaf([&topology](unsigned int element) { return topology.isCellWithLeaf(element); })
        {
        }
    };

    /// Writes one channel of a volume into a grid; throws Failure for values that no grid has a place for.
    template <class E>
    openvdb::GridBase::Ptr gridOf(AnyTopology const& topology, ChannelBase const& channel,
                                  Nexil::Array<bool> const* states)
    {
        auto const values = channel.values<E>();
        E const background = *channel.defaultValue().get<E>();
        ActiveRule<E> const isActive{background, isLevelSet(channel.name())};
        auto const stateOf = [&](std::uint64_t element) {
            return states ? (*states)[element] : isActive((*values)[element]);
        };
        auto const cubeOf = [&](unsigned int element) {
            VoxelCube const cube = topology.cubeOf(element);
            if (std::int64_t(std::max({cube.origin.x, cube.origin.y, cube.origin.z})) + cube.width > kEndOfGrids)
                throw Failure(fmt::format("it has values beyond coordinate {}", kEndOfGrids));
            return cube;
        };
        auto grid = VdbGrid<E>::create(theirs(background));
        grid->setGridClass(isLevelSet(channel.name())                     ? openvdb::GRID_LEVEL_SET
                           : channel.name() == Geometry::sVoxelFogDensity ? openvdb::GRID_FOG_VOLUME
                                                                          : openvdb::GRID_UNKNOWN);
        // Cells first: what they fill, the leaf tiles beside them share blocks with.
        for (std::uint64_t element = topology.voxelCount; element < topology.elementCount; ++element) {
            auto const number = static_cast<unsigned int>(element);
            bool const isOn = stateOf(element);
            if (topology.isCellWithLeaf(number) || (!isOn && isSame((*values)[element], background)))
                continue;
            VoxelCube const cube = cubeOf(number);
            grid->tree().fill(openvdb::CoordBBox::createCube(theirs(cube.origin), cube.width),
                              theirs((*values)[element]), isOn);
        }
        auto accessor = grid->getAccessor();
        for (std::uint64_t element = 0; element < topology.voxelCount; ++element) {
            bool const isOn = stateOf(element);
            if (!isOn && isSame((*values)[element], background))
                continue;
            auto const voxel = theirs(cubeOf(static_cast<unsigned int>(element)).origin);
            if (isOn)
                accessor.setValueOn(voxel, theirs((*values)[element]));
            else
                accessor.setValueOff(voxel, theirs((*values)[element]));
        }
        openvdb::tools::prune(grid->tree());
        return grid;
    }

    /// The transform that the object was read with, where it still fits.
    std::optional<Placement> placementIn(Object const& object, float voxelSize)
    {
        auto const held = object.getProperty(kTransform);
        auto const* const t = held.get<double4>();
        if (!t || static_cast<float>(t->w) != voxelSize)
            return std::nullopt;
        return Placement{{t->x, t->y, t->z}, t->w};
    }

    /// The grids of one object; adds to `leftOut` what is none.
    class ObjectWriter {
    public:
        ObjectWriter(Object const& object, std::string place, openvdb::GridPtrVec& grids,
                     std::vector<std::string>& leftOut)
            : object_(object), place_(std::move(place)), grids_(grids), leftOut_(leftOut)
        {
        }

        void write()
        {
            auto const volume = Geometry::shallow_copy_object_to_vld_volume(object_);
            if (!volume || volume->empty()) {
                leave("no volume");
                return;
            }
            std::size_t const gridsBefore = grids_.size();
            forEachContainer(*volume, [&](auto const& container) { writeContainer(*volume, container); });
            // The name that the object has is that of its grid, where there is one.
            auto const name = getPropertyAs<Nexil::String>(object_, "name");
            bool const hasNamed = grids_.size() == gridsBefore + 1 && !name.empty();
            if (hasNamed)
                grids_.back()->setName(name.c_str());
            auto const isKept = [&](Nexil::String const& key) {
                return (key == "name" && hasNamed) || (key == kTransform && hasPlaced_) ||
                       volume->hasComponentFromName(key);
            };
            for (Nexil::String const& key : object_.keys())
                if (!isKept(key))
                    leave(std::string(key.view()));
            for (Nexil::String const& key : volume->componentRange())
                if (volume->component<PointTopology<SmallTiles>>(key) ||
                    volume->component<PointTopology<WideTiles>>(key))
                    leave(std::string(key.view()) + ": points");
        }

    private:
        void leave(std::string const& what) { leftOut_.push_back(place_ + what); }

        template <class Traits>
        void writeContainer(VLD::Object const& volume, Container<Traits> const& container)
        {
            auto const placement = placementIn(object_, container.voxelSize());
            auto const channels = channelsOf(volume, container);
            auto find = [&](Nexil::String const& name) {
                auto const place = std::find_if(channels.begin(), channels.end(),
                                                [&](auto const& channel) { return channel->name() == name; });
                return place == channels.end() ? nullptr : *place;
            };
            for (auto const& channel : channels) {
                auto const name = channel->name().view();
                // The states of another channel's voxels go into its grid.
                if (name.ends_with(kActive) && channel->template values<bool>() &&
                    find(Nexil::String(name.substr(0, name.size() - std::strlen(kActive)))))
                    continue;
                auto const stateChannel = find(channel->name() + kActive);
                auto const states = stateChannel ? stateChannel->template values<bool>() : nullptr;
                openvdb::GridBase::Ptr grid;
                try {
                    forEachElementType([&]<class E>() {
                        if (channel->template values<E>())
                            grid = gridOf<E>(AnyTopology(*container.topology()), *channel, states.get());
                    });
                    if (grid)
                        grid->setTransform(transformOf(placement.value_or(Placement::ofOurs(container.voxelSize()))));
                } catch (Failure const& failure) {
                    leave(std::string(name) + ": " + failure.what());
                    continue;
                }
                if (!grid) {
                    leave(std::string(name) + ": " + typeName(channel->data()));
                    continue;
                }
                grid->setName(std::string(name));
                grids_.push_back(grid);
                hasPlaced_ = hasPlaced_ || placement;
            }
        }

        Object const& object_;
        std::string place_;
        openvdb::GridPtrVec& grids_;
        std::vector<std::string>& leftOut_;
        bool hasPlaced_ = false; // a grid where the object says
    };

    /// Throws Failure for a surface whose level set has no place among the coordinates, or in the memory of this machine: it
    /// would be taken voxel by voxel until there is none.
    void refuseWhatIsTooLarge(std::vector<openvdb::Vec3s> const& points, std::vector<openvdb::Vec3I> const& triangles,
                              float halfBand)
    {
        for (openvdb::Vec3s const& p : points)
            for (int axis = 0; axis < 3; ++axis)
                if (!(std::abs(double(p[axis])) + double(halfBand) < kMostMeshCoordinate))
                    throw Failure("with voxels that small its level set lies beyond the coordinates that there are");
        // Voxels of the band, by the areas. What is long and narrow has at least a row of them, small triangles share theirs.
        double area = 0;
        for (openvdb::Vec3I const& t : triangles) {
            openvdb::Vec3d const a(points[t[0]]), b(points[t[1]]), c(points[t[2]]);
            double const longest = std::max({(b - a).length(), (c - b).length(), (a - c).length()});
            area += std::max((b - a).cross(c - a).length(), longest > kBlockWidth ? longest : 0) / 2;
        }
        double const band = halfBand;
        double const voxels = std::max(area * 2 * band, 4.0 / 3.0 * std::numbers::pi * band * band * band);
        auto const memory = double(sysconf(_SC_PHYS_PAGES)) * double(sysconf(_SC_PAGESIZE));
        if (voxels * kBytesPerBandVoxel > memory)
            throw Failure(
                fmt::format("with voxels that small its level set has some {:.2g} voxels, more than the memory of "
                            "this machine holds",
                            voxels));
    }

    /// Runs body() with the library ready, and turns what it throws into a Failure that names the file.
    template <class Body>
    auto withVdb(std::string const& path, Body const& body)
    {
        try {
            openvdb::initialize();
            return body();
        } catch (openvdb::Exception const& exception) {
            throw Failure(path + ": " + exception.what());
        }
    }

} // namespace

VdbVolumes readVdb(std::string const& path)
{
    return withVdb(path, [&] {
        auto const file = openVdb(path);
        VdbVolumes result;
        double freeBlocks = kFreeBlocks;
        for (auto name = file->beginName(); name != file->endName(); ++name) {
            openvdb::GridBase::Ptr grid;
            try {
                grid = file->readGrid(*name);
            } catch (openvdb::KeyError const& error) {
                auto const type = VdbStandIns::typeIn(error);
                if (!type)
                    throw;
                result.leftOut.push_back("grid '" + openvdb::io::GridDescriptor::stripSuffix(*name) +
                                         "': it is a grid of type " + *type);
                continue;
            }
            try {
                result.objects.push_back(objectOf(*grid, freeBlocks));
            } catch (Failure const& failure) {
                result.leftOut.push_back("grid '" + grid->getName() + "': " + failure.what());
                continue;
            }
            auto const placement = placementOf(grid->constTransform());
            // Half a voxel is how the two sides differ by custom.
            if (placement->distanceToOurs() > 0.5 + 1e-6)
                result.leftOut.push_back("grid '" + grid->getName() + "': its translation, but as vdb_transform");
        }
        if (result.objects.empty())
            throw Failure(path + ": there is no grid in it that a zon file holds" +
                          (result.leftOut.empty() ? "" : "; " + result.leftOut[0]));
        return result;
    });
}

VdbReport writeVdb(Objects const& objects, std::string const& path)
{
    return withVdb(path, [&] {
        openvdb::GridPtrVec grids;
        std::vector<std::string> leftOut;
        for (std::uint64_t i = 0; i < objects.size(); ++i) {
            auto const place = fmt::format("object {}: ", i);
            if (objects[i])
                ObjectWriter(*objects[i], place, grids, leftOut).write();
            else
                leftOut.push_back(place + "no volume");
        }
        if (grids.empty())
            return VdbReport{0, std::move(leftOut)};
        OutputFile output(path);
        openvdb::io::File file(output.pathToWrite());
        file.write(grids);
        file.close();
        output.commit();
        return VdbReport{grids.size(), std::move(leftOut)};
    });
}

Nexil::Ptr<Object> levelSetOfMesh(Nexil::Array<float3> const& positions, Nexil::Array<unsigned int> const& triangles,
                                  float voxelSize, float halfBand)
{
    return withVdb("mesh", [&] {
        auto const transform = transformOf(Placement::ofOurs(voxelSize));
        // In voxels, whose centres lie at whole numbers there.
        std::vector<openvdb::Vec3s> points;
        points.reserve(positions.size());
        for (float3 const& p : positions)
            points.emplace_back(transform->worldToIndex(openvdb::Vec3d(double(p.x), double(p.y), double(p.z))));
        std::vector<openvdb::Vec3I> corners;
        corners.reserve(triangles.size() / 3);
        for (std::uint64_t i = 0; i + 2 < triangles.size(); i += 3)
            corners.emplace_back(triangles[i], triangles[i + 1], triangles[i + 2]);
        refuseWhatIsTooLarge(points, corners, halfBand);
        // By this adapter, as it is compiled into the library.
        openvdb::tools::QuadAndTriangleDataAdapter<openvdb::Vec3s, openvdb::Vec3I> const surface(points, corners);
        auto const grid = openvdb::tools::meshToVolume<openvdb::FloatGrid>(surface, *transform, halfBand, halfBand);
        grid->setGridClass(openvdb::GRID_LEVEL_SET);
        double freeBlocks = kFreeBlocks;
        return objectOf(*grid, freeBlocks);
    });
}

} // namespace Zon
