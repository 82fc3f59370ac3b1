#pragma once

#include <nexil/Array.h>
#include <nexil/Ptr.h>
#include <veldrin/object/Object.h>
#include <veldrin/tags/TagExpression.h>
#include <veldrin/tags/internal/ComponentRank.h>

#include <string>

namespace Veldrin::Geometry::Internal {

/// Works out an expression on a geometry: each visit leaves the node's selection in `data` and `rank`.
///
/// Operands are visited by visitors of their own, which share the geometry and nothing else. A mask that a stored tag or
/// another operand also holds is never written: a result in its place is a new mask, filled in one pass.
class TagExpressionVisitor : public VLD::Utils::Internal::ExpressionVisitor {
public:
    /// nestingOfNode: how many operands within each other the visited node stands in.
    explicit TagExpressionVisitor(Object const& geometryToRead, int nestingOfNode = 0);
    ~TagExpressionVisitor() override;

    using VLD::Utils::Internal::ExpressionVisitor::visit;
    void visit(VLD::Utils::Internal::FuncOp& function) override;
    void visit(VLD::Utils::Internal::NegateExpression& complement) override;
    void visit(VLD::Utils::Internal::BinaryOp& operation) override;
    void visit(VLD::Utils::Internal::Literal& literal) override;

    Object const& geometry;
    /// Empty, and never null, where nothing resolved.
    Nexil::Ptr<Nexil::Array<bool>> data;
    ComponentRank rank = ComponentRank::None;

private:
    struct Selection;

    [[nodiscard]] Selection operand(VLD::Utils::Internal::Expression& expression) const;
    [[nodiscard]] Selection joined(VLD::Utils::Internal::BinaryOp::Op op, Selection left, Selection right) const;
    [[nodiscard]] Selection tagNamed(Nexil::String const& name) const;
    [[nodiscard]] Selection tagsLike(std::string const& pattern) const;
    [[nodiscard]] Selection allPoints() const;
    void carry(Selection& selection, ComponentRank target) const;
    void take(Selection&& selection) noexcept;

    int nesting_;
};

} // namespace Veldrin::Geometry::Internal
