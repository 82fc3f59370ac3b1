#pragma once

#include <nexil/Array.h>
#include <nexil/Ptr.h>
#include <nexil/String.h>
#include <veldrin/geometry/Export.h>
#include <veldrin/object/Object.h>
#include <veldrin/tags/TagExpression.h>

#include <cstddef>
#include <memory>

/// Selections by expression.
///
///     Geometry::TagResolver resolver;
///     if (auto const status = resolver.parses("point_top_tag ^ !point_border_tag"); !status)
///         std::cerr << status.message << "\n";
///     Nexil::String component;
///     auto const mask = resolver.resolve(mesh, component); // one flag per point, "point_component"
///
/// Names are full names of tags, as `createTagName` gives them. '+' is union, '^' intersection, '-' difference; all group
/// to the left and none binds stronger. '!' or '-' before an operand is its complement. v(), f(), fv() and s() carry a
/// selection over to points, faces, face vertices and strands, where an element is selected when all that it is made of
/// is. A name with '*', which stands for any run of characters, is the union of all tags that match; stars alone select
/// every point.
/// Selections of two components meet on the later one of faces, face vertices, strands, points.
/// A name that is no tag resolves to nothing, and an operation ignores an operand that resolves to nothing.
namespace Veldrin::Geometry {

class VELDRIN_API TagResolver {
public:
    /// Whether a text is an expression; true when it is.
    struct Status {
        /// What is wrong; "" when nothing is.
        Nexil::String message;
        bool ok = true;
        /// Where in the text, in bytes: the text's length when something is missing at its end; 0 when nothing is wrong.
        std::size_t byteOffset = 0;

        explicit operator bool() const noexcept { return ok; }
    };

    TagResolver();
    TagResolver(TagResolver&&) noexcept;
    TagResolver& operator=(TagResolver&&) noexcept;
    ~TagResolver();

    /// Takes an expression. When the text is none, the one taken before stays.
    /// Cost: linear in the text. Errors: std::bad_alloc.
    [[nodiscard]] Status parses(Nexil::String const& expression);

    /// The selection that the expression makes on a geometry: its mask, and in `component` the component that it is of.
    ///
    /// When nothing resolves, the mask is empty and the component "". Before an expression was taken the result is null
    /// and `component` stays as it is. Masks of one component but of different sizes combine over the shorter one.
    /// A single tag's mask is that of the tag, shared; no stored tag is ever changed.
    /// Cost: a pass over the masks for each operation, a conversion where components differ; a pattern looks at every
    /// property. Operands of an operation are worked out at the same time. 1 MiB of stack is enough for any expression.
    /// Errors: std::bad_alloc, and std::runtime_error when the job is cancelled; `component` is unchanged then.
    /// Threads: same result for every thread count; many threads may resolve one expression at once.
    [[nodiscard]] Nexil::Ptr<Nexil::Array<bool>> resolve(Object const& geometry, Nexil::String& component) const;

private:
    std::unique_ptr<VLD::Utils::Internal::Expression> expression_;
};

} // namespace Veldrin::Geometry
