#include "RandomObjects.h"

#include "../volume/Samples.h"

#include <support/Geometry.h>
#include <support/Streams.h>

#include <veldrin/math/Matrix.h>
#include <veldrin/volume/VolumeConversion.h>

#include <cstring>
#include <stdexcept>
#include <string>
#include <type_traits>
#include <vector>

namespace soak {

namespace {

    using namespace Veldrin;
    using ObjectPtr = Nexil::Ptr<Object>;
    using Indices = std::vector<unsigned int>;

    std::uint64_t below(Random& random, std::uint64_t end)
    {
        return std::uniform_int_distribution<std::uint64_t>(0, end - 1)(random);
    }

    /// Mostly small, now and then of many chunks.
    std::uint64_t randomSize(Random& random)
    {
        switch (below(random, 16)) {
        case 0: return 0;
        case 1: return below(random, 100000);
        case 2: return below(random, 3000);
        default: return 1 + below(random, 40);
        }
    }

    Nexil::String randomText(Random& random)
    {
        std::string text(below(random, 30), ' ');
        for (char& c : text)
            c = static_cast<char>(below(random, 256));
        return Nexil::String(std::string_view(text));
    }

    /// Any bits, floats that are no numbers among them; arrays of one value over and over among arrays of noise.
    template <class T>
    Nexil::Any randomArray(Random& random)
    {
        Nexil::Array<T> values;
        values.resize(randomSize(random));
        bool const isNoise = below(random, 2) == 0;
        auto const repeated = below(random, 256);
        auto* const bytes = static_cast<char*>(static_cast<void*>(values.data()));
        std::uint64_t const size = values.size() * sizeof(T);
        for (std::uint64_t at = 0; at < size; at += sizeof(std::uint64_t)) {
            std::uint64_t bits = isNoise ? random() : repeated + at / 64;
            if (std::is_same_v<T, bool>)
                bits &= 0x0101010101010101u;
            std::memcpy(bytes + at, &bits, std::min(sizeof(bits), size - at));
        }
        return Nexil::makePtr<Nexil::Array<T>>(std::move(values));
    }

    /// A value of each type that a stream can hold, alone, in arrays, and in arrays of arrays: made once, and kept as files.
    std::vector<Nexil::Any> const& everyType()
    {
        static auto const all = [] {
            std::vector<Nexil::Any> values;
            for (char const* name : {"v6_every_type_level0", "v6_walk", "v6_odd_bytes", "v6_curve_loose"})
                for (auto const& object : support::read(support::fileBytes(VELDRIN_TEST_CORPUS "/streams/valid/" +
                                                                           std::string(name) + ".zon"))
                                              .objects)
                    for (auto const& key : object ? object->keys() : Nexil::Array<Nexil::String>())
                        values.push_back(object->getProperty(key));
            if (values.size() < 360)
                throw std::runtime_error("the kept streams do not hold every type");
            return values;
        }();
        return all;
    }

    Nexil::Any randomPlainValue(Random& random)
    {
        switch (below(random, 12)) {
        case 0: return randomArray<float>(random);
        case 1: return randomArray<unsigned char>(random);
        case 2: return randomArray<Math::float4x4>(random);
        case 3: return randomArray<bool>(random);
        default: return everyType()[below(random, everyType().size())];
        }
    }

    Nexil::Ptr<Nexil::Array<Math::float3>> randomPositions(Random& random, std::uint64_t count)
    {
        std::uniform_real_distribution<float> coordinate(-10, 10);
        std::vector<Math::float3> positions(count);
        for (auto& position : positions)
            for (unsigned int axis = 0; axis < 3; ++axis)
                position[axis] = coordinate(random);
        return support::array(positions);
    }

    Indices randomIndices(Random& random, std::uint64_t count, std::uint64_t end)
    {
        Indices indices(count);
        for (auto& index : indices)
            index = static_cast<unsigned int>(below(random, end));
        return indices;
    }

    /// Offsets of `count` ranges of up to five elements, or as far as `end` goes.
    Indices randomOffsets(Random& random, std::uint64_t count, std::uint64_t end)
    {
        Indices offsets{0};
        for (std::uint64_t i = 0; i < count; ++i)
            offsets.push_back(static_cast<unsigned int>(std::min(end, offsets[i] + below(random, 6))));
        return offsets;
    }

    ObjectPtr randomMesh(Random& random)
    {
        auto made = createObject();
        std::uint64_t const pointCount = 3 + randomSize(random);
        auto const offsets = randomOffsets(random, 1 + randomSize(random), ~0u);
        auto const corners = randomIndices(random, offsets.back() + 1, pointCount);
        Geometry::populateMesh(randomPositions(random, pointCount), support::array(corners), support::array(offsets),
                               *made);
        // Values shared out, as texture coordinates are.
        std::uint64_t const valueCount = 1 + below(random, corners.size());
        auto range = createObject();
        Geometry::populateRangeGeoProperty(support::array(randomIndices(random, corners.size(), valueCount)),
                                           Geometry::sFaceVertexComp, *range);
        setProperty(*made, "face_vertex_color_index", std::move(range));
        auto data = createObject();
        Geometry::createDataGeoProperty(Math::float3{}, "face_vertex_color_index", randomPositions(random, valueCount),
                                        *data);
        setProperty(*made, "face_vertex_color", std::move(data));
        return made;
    }

} // namespace

JudgedObject randomGeometry(Random& random)
{
    using Kind = JudgedObject::Kind;
    std::uint64_t const pointCount = 1 + randomSize(random);
    int const radius = static_cast<int>(1 + below(random, 8));
    auto made = createObject();
    switch (below(random, 6)) {
    case 0:
        Geometry::populateStrand(randomPositions(random, pointCount),
                                 support::array(randomOffsets(random, randomSize(random), pointCount)), *made);
        return {Kind::Strands, std::move(made)};
    case 1:
        Geometry::populatePointCloud(randomPositions(random, pointCount), *made);
        return {Kind::PointCloud, std::move(made)};
    case 2:
        return {Kind::Volume,
                Geometry::move_vld_volume_to_object(*support::sphereVolume<VLD::TileTree3D::SmallTiles>(radius))};
    case 3:
        return {Kind::Volume,
                Geometry::move_vld_volume_to_object(*support::sphereVolume<VLD::TileTree3D::WideTiles>(radius))};
    default: return {Kind::Mesh, randomMesh(random)};
    }
}

ObjectPtr randomObject(Random& random, int depth)
{
    auto made = createObject();
    for (auto count = below(random, 12); count > 0; --count) {
        auto name = randomText(random) + "x";
        auto const kind = below(random, 10);
        if (depth > 0 && kind == 0) {
            setProperty(*made, name, randomObject(random, depth - 1));
        } else if (depth > 0 && kind == 1) {
            // One object twice in a list, and a place without any.
            auto const shared = randomObject(random, depth - 1);
            setProperty(*made, name, Nexil::makePtr<Objects>(Objects{shared, nullptr, shared}));
        } else if (kind == 2) {
            setProperty(*made, name, randomGeometry(random).object);
        } else {
            auto value = randomPlainValue(random);
            if (below(random, 6) == 0)
                made->setPropertyAny(name + "again", Nexil::Any(value));
            made->setPropertyAny(name, std::move(value));
        }
    }
    return made;
}

} // namespace soak
