#include <vld/BuildFromPoints.h>

#include <nexil/parallel/Parallel.h>
#include <vld/BuildLevelSet.h>
#include <vld/internal/TopologyAssembly.h>
#include <vld/internal/VoxelOfPoint.h>

#include <algorithm>
#include <cmath>
#include <limits>
#include <numbers>

namespace VLD::TileTree3D {

namespace {

    using Veldrin::Math::double3;
    using Veldrin::Math::float3;

    namespace grain {
        constexpr std::size_t kPoints = 128;
        constexpr std::size_t kTiles = 64;
    } // namespace grain

    struct Sphere {
        double3 centre;
        double radius = 0;

        /// Distance of a position from the surface, negative inside.
        [[nodiscard]] double distance(double3 const& position) const { return length(position - centre) - radius; }
    };

    /// Which distances matter: from -inner to outer.
    struct Range {
        double inner;
        double outer;
    };

    struct TouchedLeaf {
        Coordinate leaf;
        unsigned int point;
    };

    /// What spheres do to tiles.
    struct Touched {
        Nexil::Array<TouchedLeaf> leaves;
        /// Cells of the size of a leaf tile, and inner tiles, that lie deeper in one sphere than distances go.
        Nexil::Array<Coordinate> insideCells;
        Nexil::Array<Coordinate> insideTiles;
        bool isWithinLimits = true;
    };

    class Spheres {
    public:
        Spheres(Nexil::Array<float3> const& positions, Nexil::Array<float> const& radii)
            : positions_(positions), radii_(radii)
        {
        }

        [[nodiscard]] std::uint64_t count() const { return positions_.size(); }
        [[nodiscard]] Sphere operator[](std::uint64_t point) const
        {
            float3 const& p = positions_[point];
            return {{p.x, p.y, p.z}, radii_[radii_.size() == 1 ? 0 : point]};
        }

    private:
        Nexil::Array<float3> const& positions_;
        Nexil::Array<float> const& radii_;
    };

    enum class Place { Outside, Inside, Near };

    Place placeOf(Sphere const& sphere, Range const& range, Coordinate const& origin, int width, double voxelSize)
    {
        double const distance = sphere.distance(Internal::centreOf(origin, width, voxelSize));
        // To the centres of the voxels in the corners, and a little for rounding.
        double const reach = (width - 1) * 0.5 * std::numbers::sqrt3 * voxelSize;
        double const slack = (reach + sphere.radius) * 1e-9;
        if (distance - reach >= range.outer + slack)
            return Place::Outside;
        return distance + reach <= -range.inner - slack ? Place::Inside : Place::Near;
    }

    /// Calls visit(origin), asking for cancellation in between.
    template <int Width, class Visit>
    void forEachTile(Coordinate const& low, Coordinate const& high, Visit const& visit)
    {
        // Within the limits, the step behind the last tile still fits an integer.
        for (int x = tileStart<Width>(low.x); x <= high.x; x += Width)
            for (int y = tileStart<Width>(low.y); y <= high.y; y += Width) {
                Nexil::Internal::throwIfJobCancelled();
                for (int z = tileStart<Width>(low.z); z <= high.z; z += Width)
                    visit(Coordinate{x, y, z});
            }
    }

    bool makesNothing(Sphere const& sphere)
    {
        auto const& c = sphere.centre;
        return !std::isfinite(c.x) || !std::isfinite(c.y) || !std::isfinite(c.z) || !std::isfinite(sphere.radius) ||
               !(sphere.radius > 0);
    }

    /// How many tiles a sphere will touch, on an average over where it may lie among them.
    struct TouchedCount {
        double entries;  // of `Touched`
        double elements; // of the volume, were it the only sphere
    };

    template <class Traits>
    TouchedCount touchedCount(Sphere const& sphere, Range const& range, double voxelSize)
    {
        // Tiles of which the centre lies within a radius.
        auto const tiles = [](double radius, double width) {
            double const r = std::max(radius, 0.0) / width;
            return 4.0 / 3.0 * std::numbers::pi * r * r * r;
        };
        auto const reach = [=](int width) { return (width - 1) * 0.5 * std::numbers::sqrt3 * voxelSize; };
        double const cellWidth = Traits::kDataWidth * voxelSize;
        double const outer = tiles(sphere.radius + range.outer + reach(Traits::kDataWidth), cellWidth);
        double const inner = tiles(sphere.radius - range.inner - reach(Traits::kDataWidth), cellWidth);
        double const core = sphere.radius - range.inner - reach(Traits::kInnerWidth);
        double const insideTiles = tiles(core, Traits::kInnerWidth * voxelSize);
        return {outer - tiles(core, cellWidth) + insideTiles,
                (outer - inner) * Traits::kLeafVoxels + insideTiles * Traits::kInnerCells};
    }

    /// Whether spheres touch too many tiles, or one alone has more elements than 32 bits count: others only add to its inside,
    /// and where they hide its surface they have more themselves. Told before any tile is touched, as that takes the memory.
    template <class Traits>
    bool touchTooMuch(Spheres const& spheres, Range const& range, double voxelSize)
    {
        double count = 0;
        for (std::uint64_t point = 0; point < spheres.count(); ++point) {
            if (makesNothing(spheres[point]))
                continue;
            auto const touched = touchedCount<Traits>(spheres[point], range, voxelSize);
            if (touched.elements >= kNoElement)
                return true;
            count += touched.entries;
        }
        return count > kMostTouchedTiles;
    }

    template <class Traits>
    void touch(Sphere const& sphere, unsigned int point, Range const& range, float voxelSize, Touched& touched)
    {
        if (makesNothing(sphere))
            return;
        double const reach = sphere.radius + range.outer;
        double3 const extent{reach, reach, reach};
        Coordinate low;
        Coordinate high;
        if (!Internal::voxelOfPoint(sphere.centre - extent, voxelSize, low) ||
            !Internal::voxelOfPoint(sphere.centre + extent, voxelSize, high)) {
            touched.isWithinLimits = false;
            return;
        }
        forEachTile<Traits::kInnerWidth>(low, high, [&](Coordinate const& inner) {
            Place const place = placeOf(sphere, range, inner, Traits::kInnerWidth, voxelSize);
            if (place == Place::Inside)
                touched.insideTiles.push_back(inner);
            if (place != Place::Near)
                return;
            for (unsigned int cell = 0; cell < Traits::kInnerCells; ++cell) {
                Coordinate const leaf = inner + cellAtPlace<Traits::kTileWidth>(cell) * int(Traits::kDataWidth);
                Place const leafPlace = placeOf(sphere, range, leaf, Traits::kDataWidth, voxelSize);
                if (leafPlace == Place::Near)
                    touched.leaves.push_back({leaf, point});
                else if (leafPlace == Place::Inside)
                    touched.insideCells.push_back(leaf);
            }
        });
    }

    /// One part of all chunks, which give it up.
    template <class T>
    Nexil::Array<T> joined(Nexil::Array<Touched>& chunks, Nexil::Array<T> Touched::*part)
    {
        if (chunks.size() == 1)
            return std::move(chunks[0].*part);
        std::uint64_t count = 0;
        for (Touched const& chunk : chunks)
            count += (chunk.*part).size();
        Nexil::Array<T> all;
        all.reserve(count);
        for (Touched& chunk : chunks) {
            for (T const& element : chunk.*part)
                all.push_back(element);
            chunk.*part = {};
        }
        return all;
    }

    template <class Traits>
    Touched touchAll(Spheres const& spheres, Range const& range, float voxelSize)
    {
        std::uint64_t const chunkCount = (spheres.count() + grain::kPoints - 1) / grain::kPoints;
        Nexil::Array<Touched> chunks;
        chunks.resize(chunkCount);
        Nexil::parallel::forRange(chunkCount, 1, [&](std::size_t first, std::size_t last) {
            for (std::size_t point = first * grain::kPoints;
                 point < std::min<std::uint64_t>(last * grain::kPoints, spheres.count()); ++point)
                touch<Traits>(spheres[point], static_cast<unsigned int>(point), range, voxelSize,
                              chunks[point / grain::kPoints]);
        });
        Touched all{joined(chunks, &Touched::leaves), joined(chunks, &Touched::insideCells),
                    joined(chunks, &Touched::insideTiles)};
        for (Touched const& chunk : chunks)
            all.isWithinLimits = all.isWithinLimits && chunk.isWithinLimits;
        Nexil::parallel::sort(all.leaves.begin(), all.leaves.end(), [](TouchedLeaf const& a, TouchedLeaf const& b) {
            return a.leaf == b.leaf ? a.point < b.point : isBefore(a.leaf, b.leaf);
        });
        Internal::sortUnique(all.insideCells);
        Internal::sortUnique(all.insideTiles);
        return all;
    }

    /// Whether it is one of sorted tiles. A hash would take twice their memory.
    bool contains(Nexil::Array<Coordinate> const& sorted, Coordinate const& tile)
    {
        return std::binary_search(sorted.begin(), sorted.end(), tile,
                                  [](Coordinate const& a, Coordinate const& b) { return isBefore(a, b); });
    }

    /// The inner tiles that have cells inside, some several times.
    template <class Traits>
    Nexil::Array<Coordinate> tilesWithoutVoxels(Touched const& touched)
    {
        Nexil::Array<Coordinate> tiles;
        tiles.reserve(touched.insideTiles.size() + touched.insideCells.size());
        for (Coordinate const& tile : touched.insideTiles)
            tiles.push_back(tile);
        for (Coordinate const& cell : touched.insideCells) {
            Coordinate const tile = tileOrigin<Traits::kInnerWidth>(cell);
            if (tiles.empty() || tiles[tiles.size() - 1] != tile)
                tiles.push_back(tile);
        }
        return tiles;
    }

    /// Takes the distances from one more sphere at the voxels of a leaf tile, where they are smaller.
    template <class Traits>
    void lowerDistances(Sphere const& sphere, Coordinate const& origin, double voxelSize, double* distances)
    {
        constexpr int w = Traits::kDataWidth;
        double squares[3][w];
        for (int axis = 0; axis < 3; ++axis)
            for (int i = 0; i < w; ++i) {
                double const offset = (origin[axis] + i + 0.5) * voxelSize - sphere.centre[axis];
                squares[axis][i] = offset * offset;
            }
        for (int x = 0; x < w; ++x)
            for (int y = 0; y < w; ++y)
                for (int z = 0; z < w; ++z, ++distances) {
                    // Most voxels are nearer to another sphere, which the square tells without its root.
                    double const reach = sphere.radius + *distances;
                    double const square = squares[0][x] + squares[1][y] + squares[2][z];
                    if (reach > 0 && square < reach * reach)
                        *distances = std::min(*distances, std::sqrt(square) - sphere.radius);
                }
    }

    /// value(distance) turns a distance within the range into what a voxel holds.
    template <class Traits, class Value>
    Grid<Traits> build(GridDescription const& description, Spheres const& spheres, Range const& range, float background,
                       Value const& value)
    {
        if (touchTooMuch<Traits>(spheres, range, description.voxelSize))
            return {};
        Touched touched = touchAll<Traits>(spheres, range, description.voxelSize);
        if (!touched.isWithinLimits)
            return {};

        // What lies deep in one sphere has its value, whichever others reach there.
        auto isInside = [&](Coordinate const& cell) {
            return contains(touched.insideCells, cell) ||
                   contains(touched.insideTiles, tileOrigin<Traits::kInnerWidth>(cell));
        };
        Nexil::Array<Coordinate> leaves;
        Nexil::Array<std::uint64_t> starts;
        for (std::uint64_t i = 0; i < touched.leaves.size(); ++i) {
            Coordinate const& leaf = touched.leaves[i].leaf;
            if ((i == 0 || touched.leaves[i - 1].leaf != leaf) && !isInside(leaf)) {
                leaves.push_back(leaf);
                starts.push_back(i);
            }
        }
        auto topology = Internal::assembleTopology<Traits>(description.topologyName, std::move(leaves),
                                                           tilesWithoutVoxels<Traits>(touched));
        if (!topology)
            return {};

        double const voxelSize = description.voxelSize;
        Nexil::Array<float> values;
        Nexil::Internal::resizeUninitialized(values, topology->elementCount());
        Nexil::parallel::forRange(topology->leafCount(), grain::kTiles, [&](std::size_t begin, std::size_t end) {
            for (std::size_t leaf = begin; leaf < end; ++leaf) {
                Coordinate const& origin = topology->leafOrigins()[leaf];
                double distances[Traits::kLeafVoxels];
                std::fill(std::begin(distances), std::end(distances), range.outer);
                for (std::uint64_t i = starts[leaf]; i < touched.leaves.size() && touched.leaves[i].leaf == origin;
                     ++i) {
                    lowerDistances<Traits>(spheres[touched.leaves[i].point], origin, voxelSize, distances);
                }
                for (unsigned int place = 0; place < Traits::kLeafVoxels; ++place)
                    values[leaf * Traits::kLeafVoxels + place] = value(std::max(distances[place], -range.inner));
            }
        });
        float const deepest = value(-range.inner);
        Nexil::parallel::forRange(topology->innerCount(), grain::kTiles, [&](std::size_t begin, std::size_t end) {
            for (std::size_t cell = begin * Traits::kInnerCells; cell < end * Traits::kInnerCells; ++cell) {
                std::uint64_t const element = topology->voxelCount() + cell;
                bool const isDeep = topology->innerChildren()[cell] == kNoTile &&
                                    isInside(topology->elementCube(static_cast<unsigned int>(element)).origin);
                values[element] = isDeep ? deepest : background;
            }
        });
        return Internal::gridOf(description, std::move(topology), std::move(values), background);
    }

    bool isUsable(GridDescription const& description, Nexil::Array<float3> const& positions,
                  Nexil::Array<float> const& radii, float width)
    {
        return Internal::isUsable(description) && std::isfinite(width) && width > 0 && positions.size() < kNoElement &&
               (radii.size() == 1 || radii.size() == positions.size());
    }

} // namespace

template <class Traits>
Grid<Traits> buildLevelSetFromPoints(GridDescription const& description, Nexil::Array<float3> const& positions,
                                     Nexil::Array<float> const& radii, float band)
{
    if (!isUsable(description, positions, radii, band))
        return {};
    return build<Traits>(description, Spheres(positions, radii), {band, band}, band,
                         [](double distance) { return static_cast<float>(distance); });
}

template <class Traits>
Grid<Traits> buildFogFromPoints(GridDescription const& description, Nexil::Array<float3> const& positions,
                                Nexil::Array<float> const& radii, float falloff)
{
    if (!isUsable(description, positions, radii, falloff))
        return {};
    return build<Traits>(description, Spheres(positions, radii), {falloff, 0}, 0, [falloff](double distance) {
        return static_cast<float>(std::max(-distance, 0.0) / double(falloff));
    });
}

template VELDRIN_PLATFORM_API Grid<SmallTiles>
buildLevelSetFromPoints(GridDescription const&, Nexil::Array<float3> const&, Nexil::Array<float> const&, float);
template VELDRIN_PLATFORM_API Grid<WideTiles>
buildLevelSetFromPoints(GridDescription const&, Nexil::Array<float3> const&, Nexil::Array<float> const&, float);
template VELDRIN_PLATFORM_API Grid<SmallTiles> buildFogFromPoints(GridDescription const&, Nexil::Array<float3> const&,
                                                                  Nexil::Array<float> const&, float);
template VELDRIN_PLATFORM_API Grid<WideTiles> buildFogFromPoints(GridDescription const&, Nexil::Array<float3> const&,
                                                                 Nexil::Array<float> const&, float);

} // namespace VLD::TileTree3D
