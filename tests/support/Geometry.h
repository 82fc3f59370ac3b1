#pragma once

#include <support/Threads.h>

#include <nexil/Array.h>
#include <veldrin/geometry/DebugDump.h>
#include <veldrin/geometry/GeoProperties.h>
#include <veldrin/geometry/Population.h>
#include <veldrin/object/Properties.h>

#include <algorithm>
#include <cstdint>
#include <string>
#include <type_traits>
#include <vector>

/// Builders and readers of geometry for tests.
namespace support {

/// Without spare capacity, so that a read just beyond the array is one beyond its memory.
template <class T>
Nexil::Ptr<Nexil::Array<T>> array(std::vector<T> const& values)
{
    if constexpr (std::is_same_v<T, bool>) {
        Nexil::Array<bool> made;
        made.resize(values.size());
        std::ranges::copy(values, made.begin());
        return Nexil::makePtr<Nexil::Array<bool>>(std::move(made));
    } else {
        return Nexil::makePtr<Nexil::Array<T>>(values.data(), values.size());
    }
}

using Indices = std::vector<unsigned int>;
using Polygons = std::vector<Indices>;

inline Nexil::MutablePtr<Veldrin::Object> mesh(std::vector<Veldrin::Math::float3> const& points, Indices const& corners,
                                               Indices const& offsets)
{
    auto made = Veldrin::createObject();
    Veldrin::Geometry::populateMesh(array(points), array(corners), array(offsets), *made);
    return made;
}

/// A mesh with these corners per face.
inline Nexil::MutablePtr<Veldrin::Object> mesh(std::vector<Veldrin::Math::float3> const& points, Polygons const& faces)
{
    Indices corners, offsets{0};
    for (auto const& face : faces) {
        corners.insert(corners.end(), face.begin(), face.end());
        offsets.push_back(static_cast<unsigned int>(corners.size()));
    }
    return mesh(points, corners, offsets);
}

inline Nexil::MutablePtr<Veldrin::Object> strands(std::vector<Veldrin::Math::float3> const& points,
                                                  Indices const& offsets)
{
    auto made = Veldrin::createObject();
    Veldrin::Geometry::populateStrand(array(points), array(offsets), *made);
    return made;
}

/// An object filled by one of the populate functions.
template <class Populate>
Nexil::MutablePtr<Veldrin::Object> filled(Populate const& populate)
{
    auto object = Veldrin::createObject();
    populate(*object);
    return object;
}

/// The object stored under a name; null when there is none.
inline Nexil::Ptr<Veldrin::Object> part(Veldrin::Object const& geometry, char const* name)
{
    return Veldrin::getPropertyAs<Nexil::Ptr<Veldrin::Object>>(geometry, name);
}

/// The array under `key` of the object under `name`; null when it is not there or of another type.
template <class T>
Nexil::Ptr<Nexil::Array<T>> arrayIn(Veldrin::Object const& geometry, char const* name,
                                    char const* key = Veldrin::Geometry::sData)
{
    auto const object = part(geometry, name);
    return object ? Veldrin::getPropertyAs<Nexil::Ptr<Nexil::Array<T>>>(*object, key) : nullptr;
}

/// Its elements; none when it is not there.
template <class T>
std::vector<T> valuesIn(Veldrin::Object const& geometry, char const* name, char const* key = Veldrin::Geometry::sData)
{
    auto const values = arrayIn<T>(geometry, name, key);
    return values ? std::vector<T>(values->begin(), values->end()) : std::vector<T>();
}

/// The corners of each face.
inline Polygons facesOf(Veldrin::Object const& mesh)
{
    auto const corners = valuesIn<unsigned int>(mesh, Veldrin::Geometry::sFaceVertex);
    auto const offsets = valuesIn<unsigned int>(mesh, Veldrin::Geometry::sFaceOffset);
    Polygons faces;
    for (std::size_t face = 0; face + 1 < offsets.size(); ++face)
        faces.emplace_back(corners.begin() + offsets[face], corners.begin() + offsets[face + 1]);
    return faces;
}

inline std::vector<std::string> names(Nexil::Array<Nexil::String> const& list)
{
    std::vector<std::string> result;
    for (Nexil::String const& name : list)
        result.emplace_back(name.view());
    return result;
}

/// The object's debug dump.
inline std::string dump(Veldrin::Object const& object, unsigned long long maxElements = 8)
{
    struct Sink : Veldrin::Geometry::Internal::DebugDumpInterface {
        void write(char const* bytes, std::uint64_t length) override { text.append(bytes, length); }
        std::string text;
    } sink;
    Veldrin::Geometry::Internal::debugDumpToStream(sink, object, maxElements);
    return sink.text;
}

} // namespace support
