#include <veldrin/geometry/Population.h>

#include <veldrin/geometry/GeoPropertyCreation.h>
#include <veldrin/object/Properties.h>

#include <cstdint>
#include <initializer_list>
#include <limits>

namespace Veldrin::Geometry {

namespace {

    using ObjectPtr = Nexil::Ptr<Object>;
    using Positions = Nexil::Ptr<Nexil::Array<Math::float3>>;
    using Indices = Nexil::Ptr<Nexil::Array<unsigned int>>;

    struct Part {
        char const* name;
        ObjectPtr object;
    };

    bool storeParts(Object& geometry, std::initializer_list<Part> parts)
    {
        Object made;
        for (Part const& part : parts)
            setProperty(made, part.name, part.object);
        return moveProperties(made, geometry);
    }

    template <class T>
    bool isFilled(Nexil::Ptr<Nexil::Array<T>> const& array, std::uint64_t mostElements)
    {
        return array && !array->empty() && array->size() <= mostElements;
    }

    constexpr std::uint64_t kMostElements = std::numeric_limits<unsigned int>::max();
    constexpr std::uint64_t kMostOffsets = kMostElements + 1;

    /// A component that counts what is in an array already known to fit.
    ObjectPtr component(std::uint64_t count)
    {
        auto made = createObject();
        populateComponentGeoProperty(static_cast<unsigned int>(count), *made);
        return made;
    }

    template <class T>
    ObjectPtr dataOver(char const* target, T const& defaultValue, Nexil::Ptr<Nexil::Array<T>> data)
    {
        auto made = createObject();
        createDataGeoProperty(defaultValue, target, std::move(data), *made);
        return made;
    }

    ObjectPtr positionsOver(char const* target, Positions positions)
    {
        return dataOver(target, Math::float3{}, std::move(positions));
    }

    ObjectPtr indicesOver(char const* target, Indices indices)
    {
        return dataOver(target, kInvalidIndex, std::move(indices));
    }

    ObjectPtr tileTree()
    {
        auto made = createObject();
        populateRangeGeoProperty(nullptr, sVoxelComp, *made);
        return made;
    }

    Positions noPositions()
    {
        return Nexil::makePtr<Nexil::Array<Math::float3>>();
    }

    /// The offsets of no elements.
    Indices onlyZero()
    {
        return Nexil::makePtr<Nexil::Array<unsigned int>>(Nexil::Array<unsigned int>{0});
    }

    bool storeMesh(Positions positions, Indices faceVertex, Indices faceOffset, Object& mesh)
    {
        auto const points = component(positions->size());
        auto const corners = component(faceVertex->size());
        auto const faces = component(faceOffset->size() - 1);
        return storeParts(mesh, {{sPointComp, points},
                                 {sFaceVertexComp, corners},
                                 {sFaceComp, faces},
                                 {sPointPosition, positionsOver(sPointComp, std::move(positions))},
                                 {sFaceVertex, indicesOver(sFaceVertexComp, std::move(faceVertex))},
                                 {sFaceOffset, indicesOver(sFaceComp, std::move(faceOffset))}});
    }

    bool storePointCloud(Positions positions, Object& pointCloud)
    {
        auto const points = component(positions->size());
        return storeParts(pointCloud,
                          {{sPointComp, points}, {sPointPosition, positionsOver(sPointComp, std::move(positions))}});
    }

    bool storeStrand(Positions positions, Indices strandOffset, Object& strand)
    {
        auto const points = component(positions->size());
        auto const strands = component(strandOffset->size() - 1);
        return storeParts(strand, {{sPointComp, points},
                                   {sStrandComp, strands},
                                   {sPointPosition, positionsOver(sPointComp, std::move(positions))},
                                   {sStrandOffset, indicesOver(sStrandComp, std::move(strandOffset))}});
    }

    void storeVolumeWith(char const* channel, Object& volume)
    {
        storeParts(volume, {{sVoxelComp, component(0)},
                            {sVoxelTileTree, tileTree()},
                            {channel, dataOver<float>(sVoxelTileTree, 0.0f, nullptr)}});
    }

} // namespace

void populateMesh(Object& mesh)
{
    storeMesh(noPositions(), Nexil::makePtr<Nexil::Array<unsigned int>>(), onlyZero(), mesh);
}

bool populateMesh(Nexil::Ptr<Nexil::Array<Math::float3>> positions, Nexil::Ptr<Nexil::Array<unsigned int>> faceVertex,
                  Nexil::Ptr<Nexil::Array<unsigned int>> faceOffset, Object& mesh)
{
    return isFilled(positions, kMostElements) && isFilled(faceVertex, kMostElements) &&
           isFilled(faceOffset, kMostOffsets) &&
           storeMesh(std::move(positions), std::move(faceVertex), std::move(faceOffset), mesh);
}

void populatePointCloud(Object& pointCloud)
{
    storePointCloud(noPositions(), pointCloud);
}

bool populatePointCloud(Nexil::Ptr<Nexil::Array<Math::float3>> positions, Object& pointCloud)
{
    return isFilled(positions, kMostElements) && storePointCloud(std::move(positions), pointCloud);
}

void populateStrand(Object& strand)
{
    storeStrand(noPositions(), onlyZero(), strand);
}

bool populateStrand(Nexil::Ptr<Nexil::Array<Math::float3>> positions,
                    Nexil::Ptr<Nexil::Array<unsigned int>> strandOffset, Object& strand)
{
    return isFilled(positions, kMostElements) && isFilled(strandOffset, kMostOffsets) &&
           storeStrand(std::move(positions), std::move(strandOffset), strand);
}

void populateVolume(Object& volume)
{
    storeParts(volume, {{sVoxelComp, component(0)}, {sVoxelTileTree, tileTree()}});
}

void populateLevelSet(Object& levelSet)
{
    storeVolumeWith(sVoxelSignedDistance, levelSet);
}

void populateFogVolume(Object& fogVolume)
{
    storeVolumeWith(sVoxelFogDensity, fogVolume);
}

void populateInstances(Object& instances)
{
    storeParts(instances, {{sInstanceShape, dataOver<ObjectPtr>(sNullString, nullptr, nullptr)}});
}

} // namespace Veldrin::Geometry
