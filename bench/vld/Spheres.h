#pragma once

#include <vld/BuildLevelSet.h>

#include <random>

/// Level sets of spheres as benchmarks use them: voxels of size 1, a band of three of them to each side.
namespace bench {

constexpr float kBand = 3;

template <class Traits>
VLD::TileTree3D::Grid<Traits> sphere(int radius)
{
    int const reach = radius + 4;
    return VLD::TileTree3D::buildLevelSet<Traits>(
        {.channelName = "voxel_signed_distance"}, {{-reach, -reach, -reach}, {2 * reach, 2 * reach, 2 * reach}}, kBand,
        [radius](Veldrin::Math::double3 const& p) { return length(p) - radius; });
}

/// Voxels at random in the shell of a sphere, up to a voxel beside its surface.
inline Nexil::Array<VLD::TileTree3D::Coordinate> voxelsInShell(int radius, std::uint64_t count)
{
    std::mt19937 random(1);
    std::normal_distribution<double> direction;
    std::uniform_real_distribution<double> depth(-1, 1);
    Nexil::Array<VLD::TileTree3D::Coordinate> voxels;
    while (voxels.size() < count) {
        Veldrin::Math::double3 const d{direction(random), direction(random), direction(random)};
        double const scale = (radius + depth(random)) / length(d);
        auto at = [scale](double v) { return static_cast<int>(std::floor(v * scale)); };
        voxels.push_back({at(d.x), at(d.y), at(d.z)});
    }
    return voxels;
}

/// A list of voxels with their values.
struct BandVoxels {
    Nexil::Array<VLD::TileTree3D::Coordinate> voxels;
    Nexil::Array<float> values;

    /// All voxels of a grid within its band, tile after tile or at random.
    template <class Traits>
    BandVoxels(VLD::TileTree3D::Grid<Traits> const& grid, bool isShuffled)
    {
        auto const all = grid.channel->template values<float>();
        for (unsigned int element = 0; element < grid.topology->voxelCount(); ++element)
            if ((*all)[element] > -kBand && (*all)[element] < kBand) {
                voxels.push_back(grid.topology->elementCube(element).origin);
                values.push_back((*all)[element]);
            }
        if (isShuffled)
            shuffle();
    }

private:
    void shuffle()
    {
        std::mt19937 random(1);
        for (std::uint64_t i = voxels.size(); i > 1; --i) {
            std::uint64_t const j = random() % i;
            std::swap(voxels[i - 1], voxels[j]);
            std::swap(values[i - 1], values[j]);
        }
    }
};

} // namespace bench
