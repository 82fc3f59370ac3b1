#include <veldrin/tags/TagResolver.h>

#include <veldrin/tags/TagParser.h>
#include <veldrin/tags/internal/TagExpressionVisitor.h>

#include <utility>

namespace Veldrin::Geometry {

TagResolver::TagResolver() = default;
TagResolver::TagResolver(TagResolver&&) noexcept = default;
TagResolver& TagResolver::operator=(TagResolver&&) noexcept = default;
TagResolver::~TagResolver() = default;

TagResolver::Status TagResolver::parses(Nexil::String const& expression)
{
    try {
        expression_ = VLD::Utils::Internal::parseTagExpression(expression.view());
    } catch (VLD::Utils::Internal::ParseError const& error) {
        return {error.what(), false, error.byteOffset()};
    }
    return {};
}

Nexil::Ptr<Nexil::Array<bool>> TagResolver::resolve(Object const& geometry, Nexil::String& component) const
{
    if (!expression_)
        return nullptr;
    Internal::TagExpressionVisitor visitor(geometry);
    expression_->visit(visitor);
    component = componentOf(visitor.rank);
    return std::move(visitor.data);
}

} // namespace Veldrin::Geometry
