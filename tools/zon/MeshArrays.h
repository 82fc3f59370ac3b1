#pragma once

#include "GeoValues.h"

#include <nexil/Array.h>
#include <nexil/Ptr.h>
#include <veldrin/math/Vector.h>
#include <veldrin/object/Object.h>

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

/// What mesh files and objects have in common: the arrays of one mesh or point cloud.
namespace Zon {

struct MeshArrays {
    std::optional<std::string> name;
    Nexil::Array<Veldrin::Math::float3> positions;
    Nexil::Array<unsigned int> corners;
    /// One entry more than there are faces; a mesh without faces is a point cloud.
    Nexil::Array<unsigned int> offsets{0};
    std::optional<CornerValues<Veldrin::Math::float3>> cornerNormals;
    std::optional<CornerValues<Veldrin::Math::float2>> cornerUVs;
    /// One per point, or none.
    Nexil::Array<Veldrin::Math::float3> pointNormals;

    [[nodiscard]] std::uint64_t faceCount() const noexcept { return offsets.size() - 1; }
};

/// Most elements of a kind: counts have 32 bits, and the two largest indices have meanings of their own.
inline constexpr std::uint64_t kMostElements = 0xFFFFFFFDu;

/// The object of these arrays: a mesh when there is a face, else a point cloud; null without points. The arrays are
/// moved, not copied.
///
/// Corner normals and texture coordinates become data ("face_vertex_normal", "face_vertex_uv") behind a range of their
/// indices; point normals become "point_normal"; the name a String under "name".
[[nodiscard]] Nexil::Ptr<Veldrin::Object> makeObject(MeshArrays&& arrays);

/// What a mesh file held: its objects, and what of it was left out, one text each.
struct MeshFile {
    std::vector<MeshArrays> parts;
    std::vector<std::string> leftOut;
};

// Readers of the formats, from the bytes of a file to its parts. Errors: Failure with the line and the reason; path is
// only named in it.
[[nodiscard]] MeshFile readObj(std::string const& path, std::string_view bytes);
[[nodiscard]] MeshFile readOff(std::string const& path, std::string_view bytes);
[[nodiscard]] MeshFile readPly(std::string const& path, std::string_view bytes);
[[nodiscard]] MeshFile readStl(std::string const& path, std::string_view bytes);

/// The parts as an OBJ text. Reading it gives the same parts, bit for bit.
[[nodiscard]] std::string writeObj(std::vector<MeshArrays> const& parts);

} // namespace Zon
