#include <vld/VoxelTopology.h>

#include <nexil/parallel/Parallel.h>

#include <algorithm>
#include <iostream>
#include <limits>

namespace VLD::TileTree3D {

namespace {

    namespace grain {
        constexpr std::size_t kTiles = 4096;
        constexpr std::size_t kIndices = 65536;
    } // namespace grain

    constexpr std::uint64_t kNone = std::numeric_limits<std::uint64_t>::max();

    /// The lowest index in [0, count) for which `isWrong` holds, or kNone.
    template <class IsWrong>
    std::uint64_t firstWrong(std::uint64_t count, IsWrong const& isWrong)
    {
        return Nexil::parallel::reduceInOrder(
            count, grain::kTiles, kNone,
            [&](std::size_t begin, std::size_t end, std::uint64_t found) {
                for (std::size_t i = begin; i < end && found == kNone; ++i)
                    found = isWrong(i) ? i : kNone;
                return found;
            },
            [](std::uint64_t left, std::uint64_t right) { return std::min(left, right); });
    }

    template <int Width>
    std::uint64_t firstWrongOrigin(Nexil::Array<Coordinate> const& origins)
    {
        return firstWrong(origins.size(), [&](std::uint64_t i) {
            return !isWithinLimits(origins[i]) || tileOrigin<Width>(origins[i]) != origins[i] ||
                   (i > 0 && !isBefore(origins[i - 1], origins[i]));
        });
    }

    /// True where there is nothing to complain about; otherwise prints it when asked to.
    class Findings {
    public:
        Findings(Nexil::String const& name, bool report) : name_(name), report_(report) {}

        bool accept(bool isRight, char const* complaint) const
        {
            if (!isRight && report_)
                std::cout << "topology " << name_.view() << ": " << complaint << "\n";
            return isRight;
        }
        bool acceptAll(std::uint64_t firstWrong, char const* complaint) const
        {
            if (firstWrong != kNone && report_)
                std::cout << "topology " << name_.view() << ": " << complaint << " " << firstWrong << "\n";
            return firstWrong == kNone;
        }

    private:
        Nexil::String const& name_;
        bool report_;
    };

    template <class T>
    Nexil::Ptr<Nexil::Array<T>> shared(Nexil::Array<T>&& array)
    {
        return Nexil::makePtr<Nexil::Array<T>>(std::move(array));
    }

    SharedTileLevels shared(TileLevels&& levels)
    {
        return {shared(std::move(levels.leafOrigins)), shared(std::move(levels.leafParents)),
                shared(std::move(levels.innerOrigins)), shared(std::move(levels.innerChildren))};
    }

    /// The place among its inner tile's cells of the leaf tile at `leaf`.
    template <class Traits>
    unsigned int cellOfLeaf(Coordinate const& leaf)
    {
        Coordinate const offset = leaf - tileOrigin<Traits::kInnerWidth>(leaf);
        return placeInTile<Traits::kTileWidth>(offset.x / Traits::kDataWidth, offset.y / Traits::kDataWidth,
                                               offset.z / Traits::kDataWidth);
    }

    template <class Traits>
    bool areConsistent(SharedTileLevels const& levels, Findings const& findings)
    {
        auto const& leafOrigins = *levels.leafOrigins;
        auto const& leafParents = *levels.leafParents;
        auto const& innerOrigins = *levels.innerOrigins;
        auto const& innerChildren = *levels.innerChildren;
        std::uint64_t const leafCount = leafOrigins.size();
        std::uint64_t const innerCount = innerOrigins.size();
        if (!findings.accept(leafParents.size() == leafCount, "parents are not one per leaf tile") ||
            !findings.accept(innerChildren.size() == innerCount * Traits::kInnerCells,
                             "children are not one per cell") ||
            !findings.accept(leafCount * Traits::kLeafVoxels + innerCount * Traits::kInnerCells < kNoElement,
                             "more elements than 32 bits count") ||
            !findings.acceptAll(firstWrongOrigin<Traits::kDataWidth>(leafOrigins), "wrong origin of leaf tile") ||
            !findings.acceptAll(firstWrongOrigin<Traits::kInnerWidth>(innerOrigins), "wrong origin of inner tile"))
            return false;

        auto const wrongParent = firstWrong(leafCount, [&](std::uint64_t leaf) {
            Coordinate const& origin = leafOrigins[leaf];
            std::uint64_t const parent = leafParents[leaf];
            return parent >= innerCount || innerOrigins[parent] != tileOrigin<Traits::kInnerWidth>(origin) ||
                   innerChildren[parent * Traits::kInnerCells + cellOfLeaf<Traits>(origin)] != leaf;
        });
        if (!findings.acceptAll(wrongParent, "no cell of its parent points at leaf tile"))
            return false;

        // Together with the check above: each cell in use belongs to a leaf tile that knows it.
        auto const wrongChild = firstWrong(innerChildren.size(), [&](std::uint64_t cell) {
            unsigned int const leaf = innerChildren[cell];
            return leaf != kNoTile && (leaf >= leafCount || leafParents[leaf] != cell / Traits::kInnerCells ||
                                       cellOfLeaf<Traits>(leafOrigins[leaf]) != cell % Traits::kInnerCells);
        });
        return findings.acceptAll(wrongChild, "wrong child in cell");
    }

    template <class Traits>
    bool canCreate(Nexil::String const& name, SharedTileLevels const& levels)
    {
        return !name.empty() && levels.leafOrigins && levels.leafParents && levels.innerOrigins &&
               levels.innerChildren && areConsistent<Traits>(levels, Findings(name, false));
    }

} // namespace

template <class Traits>
VoxelTopology<Traits>::VoxelTopology(Nexil::String name, TileLevels levels)
    : VoxelTopology(std::move(name), shared(std::move(levels)))
{
}

template <class Traits>
VoxelTopology<Traits>::VoxelTopology(Nexil::String name, SharedTileLevels levels)
    : Component(std::move(name)), levels_(std::move(levels)), hash_(Nexil::makePtr<TileHash>(innerOrigins()))
{
}

template <class Traits>
VoxelTopology<Traits>::VoxelTopology(Nexil::String name, VoxelTopology const& tiles)
    : Component(std::move(name)), levels_(tiles.levels_), hash_(tiles.hash_)
{
}

template <class Traits>
VoxelTopology<Traits>::~VoxelTopology() = default;

template <class Traits>
VoxelTopology<Traits>::VoxelTopology(VoxelTopology const&) = default;

template <class Traits>
Nexil::Ptr<VoxelTopology<Traits>> VoxelTopology<Traits>::create(Nexil::String name, TileLevels levels)
{
    return create(std::move(name), shared(std::move(levels)));
}

template <class Traits>
Nexil::Ptr<VoxelTopology<Traits>> VoxelTopology<Traits>::create(Nexil::String name, SharedTileLevels levels)
{
    if (!canCreate<Traits>(name, levels))
        return nullptr;
    return Nexil::makePtr<VoxelTopology>(std::move(name), std::move(levels));
}

template <class Traits>
Nexil::Ptr<VoxelTopology<Traits>> VoxelTopology<Traits>::create(Nexil::String name, SharedTileLevels levels,
                                                                VoxelTopology const& like)
{
    if (!(levels.innerOrigins == like.levels_.innerOrigins))
        return create(std::move(name), std::move(levels));
    if (!canCreate<Traits>(name, levels))
        return nullptr;
    auto made = Nexil::makeMutable<VoxelTopology>(std::move(name), like);
    made->levels_ = std::move(levels);
    return made;
}

template <class Traits>
bool VoxelTopology<Traits>::isConsistent(bool report) const
{
    return areConsistent<Traits>(levels_, Findings(name(), report));
}

template <class Traits>
Nexil::Ptr<Nexil::Array<unsigned int>> VoxelTopology<Traits>::elementIndices() const
{
    {
        std::lock_guard const lock(indexCache_.mutex);
        if (indexCache_.indices)
            return indexCache_.indices;
    }
    // Made without the lock, as parallel work must not be waited for under one; of several made at once the first stays.
    Nexil::Array<unsigned int> indices;
    if (elementCount() < kNoElement)
        Nexil::Internal::resizeUninitialized(indices, elementCount());
    Nexil::parallel::forRange(indices.size(), grain::kIndices, [&](std::size_t begin, std::size_t end) {
        for (std::size_t i = begin; i < end; ++i)
            indices[i] = static_cast<unsigned int>(i);
    });
    auto made = Nexil::makePtr<Nexil::Array<unsigned int>>(std::move(indices));
    std::lock_guard const lock(indexCache_.mutex);
    if (!indexCache_.indices)
        indexCache_.indices = std::move(made);
    return indexCache_.indices;
}

template <class Traits>
std::uint64_t VoxelTopology<Traits>::byteSize() const noexcept
{
    return sizeof(*this) + sizeof(TileHash) + hash_->byteSize() +
           (leafOrigins().size() + innerOrigins().size()) * sizeof(Coordinate) +
           (leafParents().size() + innerChildren().size()) * sizeof(unsigned int);
}

template class VoxelTopology<SmallTiles>;
template class VoxelTopology<WideTiles>;

} // namespace VLD::TileTree3D
