#include "RandomObjects.h"

#include "../volume/Samples.h"

#include <support/Geometry.h>
#include <support/Streams.h>

#include <veldrin/math/FCurve.h>
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
        std::string text;
        for (auto length = below(random, 30); length > 0; --length)
            text += static_cast<char>(below(random, 256));
        return Nexil::String(std::string_view(text));
    }

    /// Any bits, floats that are no numbers among them; arrays of one value over and over among arrays of noise.
    void fillWithBits(void* memory, std::uint64_t size, bool isFlags, Random& random)
    {
        auto* const bytes = static_cast<unsigned char*>(memory);
        bool const isNoise = below(random, 2) == 0;
        auto const repeated = below(random, 256);
        std::uint64_t const step = sizeof(std::uint64_t);
        for (std::uint64_t at = 0; at < size; at += step) {
            std::uint64_t const bits = isNoise ? random() : repeated + at / 64;
            std::memcpy(bytes + at, &bits, std::min(step, size - at));
        }
        for (std::uint64_t i = 0; isFlags && i < size; ++i)
            bytes[i] &= 1;
    }

    template <class T>
    void fillWithBits(T* values, std::uint64_t count, Random& random)
    {
        fillWithBits(values, count * sizeof(T), std::is_same_v<T, bool>, random);
    }

    template <class T>
    Nexil::Any randomArray(Random& random)
    {
        Nexil::Array<T> values;
        values.resize(randomSize(random));
        fillWithBits(values.data(), values.size(), random);
        return Nexil::makePtr<Nexil::Array<T>>(std::move(values));
    }

    Nexil::Any randomTexts(Random& random)
    {
        Nexil::Array<Nexil::String> values;
        for (auto count = below(random, 20); count > 0; --count)
            values.push_back(randomText(random));
        return Nexil::makePtr<Nexil::Array<Nexil::String>>(std::move(values));
    }

    Nexil::Any randomCurve(Random& random)
    {
        Math::FCurve curve;
        for (auto count = below(random, 6); count > 0; --count)
            curve.setKey({.time = static_cast<double>(below(random, 1000)) / 8, .value = -0.5});
        return Nexil::makePtr<Math::FCurve>(std::move(curve));
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
        case 2: return randomArray<unsigned int>(random);
        case 3: return randomArray<Math::float4x4>(random);
        case 4: return randomArray<Math::double3>(random);
        case 5: return randomArray<bool>(random);
        case 6: return randomTexts(random);
        case 7: return randomCurve(random);
        default: return everyType()[below(random, everyType().size())];
        }
    }

    Nexil::Ptr<Nexil::Array<Math::float3>> randomPositions(Random& random, std::uint64_t count)
    {
        std::uniform_real_distribution<float> coordinate(-10, 10);
        Nexil::Array<Math::float3> positions;
        for (std::uint64_t i = 0; i < count; ++i) {
            float const x = coordinate(random);
            float const y = coordinate(random);
            positions.push_back({x, y, coordinate(random)});
        }
        return Nexil::makePtr<Nexil::Array<Math::float3>>(std::move(positions));
    }

    /// Offsets of `count` ranges of up to `most` elements, or as far as `end` goes.
    Nexil::Ptr<Nexil::Array<unsigned int>> randomOffsets(Random& random, std::uint64_t count, std::uint64_t most,
                                                         std::uint64_t end)
    {
        Nexil::Array<unsigned int> offsets{0};
        for (std::uint64_t i = 0; i < count; ++i)
            offsets.push_back(
                static_cast<unsigned int>(std::min<std::uint64_t>(end, offsets[i] + below(random, most + 1))));
        return Nexil::makePtr<Nexil::Array<unsigned int>>(std::move(offsets));
    }

    ObjectPtr randomMesh(Random& random)
    {
        auto made = createObject();
        std::uint64_t const pointCount = 3 + randomSize(random);
        auto const offsets = randomOffsets(random, 1 + randomSize(random), 5, ~0u);
        Nexil::Array<unsigned int> corners;
        for (std::uint64_t i = 0; i <= (*offsets)[offsets->size() - 1]; ++i)
            corners.push_back(static_cast<unsigned int>(below(random, pointCount)));
        auto const cornerCount = corners.size();
        Geometry::populateMesh(randomPositions(random, pointCount),
                               Nexil::makePtr<Nexil::Array<unsigned int>>(std::move(corners)), offsets, *made);
        // Values shared out, as texture coordinates are.
        std::uint64_t const valueCount = 1 + below(random, cornerCount);
        Nexil::Array<unsigned int> indices;
        for (std::uint64_t i = 0; i < cornerCount; ++i)
            indices.push_back(static_cast<unsigned int>(below(random, valueCount)));
        auto range = createObject();
        Geometry::populateRangeGeoProperty(Nexil::makePtr<Nexil::Array<unsigned int>>(std::move(indices)),
                                           Geometry::sFaceVertexComp, *range);
        setProperty(*made, "face_vertex_color_index", std::move(range));
        auto data = createObject();
        Geometry::createDataGeoProperty(Math::float3{}, "face_vertex_color_index", randomPositions(random, valueCount),
                                        *data);
        setProperty(*made, "face_vertex_color", std::move(data));
        return made;
    }

    ObjectPtr randomStrands(Random& random)
    {
        auto made = createObject();
        std::uint64_t const pointCount = 1 + randomSize(random);
        Geometry::populateStrand(randomPositions(random, pointCount),
                                 randomOffsets(random, randomSize(random), 10, pointCount), *made);
        return made;
    }

    template <class Traits>
    ObjectPtr randomVolume(Random& random)
    {
        return Veldrin::Geometry::move_vld_volume_to_object(
            *support::sphereVolume<Traits>(static_cast<int>(1 + below(random, 8))));
    }

} // namespace

JudgedObject randomGeometry(Random& random)
{
    using Kind = JudgedObject::Kind;
    switch (below(random, 6)) {
    case 0: return {Kind::Strands, randomStrands(random)};
    case 1: {
        auto cloud = createObject();
        Veldrin::Geometry::populatePointCloud(randomPositions(random, 1 + randomSize(random)), *cloud);
        return {Kind::PointCloud, std::move(cloud)};
    }
    case 2: return {Kind::Volume, randomVolume<VLD::TileTree3D::SmallTiles>(random)};
    case 3: return {Kind::Volume, randomVolume<VLD::TileTree3D::WideTiles>(random)};
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
