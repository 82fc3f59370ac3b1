#pragma once

#include <nexil/Array.h>
#include <nexil/Export.h>
#include <veldrin/math/Vector.h>
#include <vld/Coordinates.h>
#include <vld/Grid.h>

#include <algorithm>
#include <cstdint>

/// Level sets from a distance function.
///
///     auto sphere = [](Veldrin::Math::double3 const& p) { return Veldrin::Math::length(p) - 2.0; };
///     GridDescription description{.channelName = "voxel_signed_distance", .voxelSize = 0.1f};
///     auto grid = buildLevelSet<SmallTiles>(description, {{-32, -32, -32}, {64, 64, 64}}, 0.3f, sphere);
namespace VLD::TileTree3D {

/// A box of voxels: `size` of them along each axis from `origin` on.
struct VoxelBox {
    Coordinate origin;
    Coordinate size;
};

namespace Internal {

    /// A distance function of whatever type, asked for a tile at a time.
    struct DistanceField {
        void const* function = nullptr;
        double (*at)(void const* function, Veldrin::Math::double3 const& position) = nullptr;
        /// Writes the distances, within -band and band, at the centres of `width` voxels per axis from `origin` on.
        void (*fill)(void const* function, Coordinate const& origin, int width, double voxelSize, float band,
                     float* distances) = nullptr;
    };

    /// The centre of a cube of voxels.
    [[nodiscard]] constexpr Veldrin::Math::double3 centreOf(Coordinate const& origin, int width,
                                                            double voxelSize) noexcept
    {
        double const half = width * 0.5;
        return {(origin.x + half) * voxelSize, (origin.y + half) * voxelSize, (origin.z + half) * voxelSize};
    }

    template <class Distance>
    [[nodiscard]] DistanceField fieldOf(Distance const& distance)
    {
        DistanceField field;
        field.function = &distance;
        field.at = [](void const* function, Veldrin::Math::double3 const& position) {
            return static_cast<double>((*static_cast<Distance const*>(function))(position));
        };
        field.fill = [](void const* function, Coordinate const& origin, int width, double voxelSize, float limit,
                        float* distances) {
            auto const& at = *static_cast<Distance const*>(function);
            for (int x = 0; x < width; ++x)
                for (int y = 0; y < width; ++y)
                    for (int z = 0; z < width; ++z) {
                        Coordinate const voxel = origin + Coordinate{x, y, z};
                        auto const value = static_cast<float>(at(centreOf(voxel, 1, voxelSize)));
                        *distances++ = std::clamp(value, -limit, limit);
                    }
        };
        return field;
    }

    /// mostElements: an empty grid where tiles with more elements are found, which ends the search for them.
    template <class Traits>
    VELDRIN_PLATFORM_API Grid<Traits> buildLevelSet(GridDescription const& description, VoxelBox const& box, float band,
                                                    DistanceField const& field, std::uint64_t mostElements);

} // namespace Internal

/// Samples a distance function at the centres of a box's voxels.
///
/// box:      the voxels that may have content; all others are outside.
/// band:     distances are cut off at -band and band, in the unit of the voxel size. A tile gets voxels where the surface
///           may be that near to one of them; the others inside are cells with -band, those outside read as band, which
///           is the channel's default.
/// distance: called as distance(double3 position); negative inside. Its value must not change faster than by the distance
///           between two positions, as no true distance does; tiles where it is large are judged by it at their centre.
///           Called from several threads at once. A result that is not a number stays one.
/// Errors: an empty grid for a description with an empty or repeated name or a voxel size that is not finite and positive,
/// a band that is not, a box without voxels, beyond the coordinate limits or of more blocks than 64 bits count, and more
/// elements than 32 bits count.
/// std::bad_alloc; what `distance` throws; std::runtime_error when the job is cancelled.
/// Cost: by blocks of some 64 voxels per axis over the box, by tiles near the surface, by cells inside.
/// Threads: parallel inside; one result, bit for bit, for every number of threads.
template <class Traits, class Distance>
[[nodiscard]] Grid<Traits> buildLevelSet(GridDescription const& description, VoxelBox const& box, float band,
                                         Distance const& distance)
{
    return Internal::buildLevelSet<Traits>(description, box, band, Internal::fieldOf(distance), kNoElement - 1);
}

} // namespace VLD::TileTree3D
