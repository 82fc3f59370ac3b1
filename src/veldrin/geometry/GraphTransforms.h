#pragma once

#include <veldrin/math/Matrix.h>

namespace Veldrin::Geometry::Transform {

/// Where something stands: relative to its parent, and in the world. Both are the identity by default.
struct GraphTransforms {
    Math::float4x4 local = Math::float4x4::identity();
    Math::float4x4 world = Math::float4x4::identity();

    friend constexpr bool operator==(GraphTransforms const&, GraphTransforms const&) = default;
};

} // namespace Veldrin::Geometry::Transform
