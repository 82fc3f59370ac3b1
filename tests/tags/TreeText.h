#pragma once

#include <veldrin/tags/TagParser.h>

#include <sstream>
#include <string>

/// Trees of tag expressions as text.
namespace trees {

using namespace VLD::Utils::Internal;

/// The tree as the tables write it.
class Writer : public ExpressionVisitor {
public:
    using ExpressionVisitor::visit;
    void visit(Literal& literal) override
    {
        text += literal.kind() == TokenKind::Pattern ? "/" + literal.id() + "/" : literal.id();
    }
    void visit(NegateExpression& complement) override { write("(! ", complement.expr()); }
    void visit(FuncOp& function) override { write("(" + function.id() + ": ", function.expr()); }
    void visit(BinaryOp& operation) override
    {
        text += std::string("(") + "+-^"[static_cast<int>(operation.op())] + " ";
        visitExpression(operation.left());
        text += " ";
        visitExpression(operation.right());
        text += ")";
    }

    std::string text;

private:
    void write(std::string const& head, Expression& operand)
    {
        text += head;
        visitExpression(operand);
        text += ")";
    }
};

inline std::string treeOf(Expression& expression)
{
    Writer writer;
    writer.visitExpression(expression);
    return writer.text;
}

inline std::string dumpOf(Expression const& expression)
{
    std::ostringstream stream;
    expression.dump(stream);
    return stream.str();
}

} // namespace trees
