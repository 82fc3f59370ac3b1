#pragma once

#include <veldrin/geometry/Export.h>
#include <veldrin/tags/TagToken.h>

#include <memory>
#include <ostream>
#include <string>
#include <vector>

/// The tree of a tag expression, and how to walk it.
///
///     auto const tree = parseTagExpression("v(top) ^ !border");
///     tree->dump(std::cout); // v(top) ^ !border
///
/// A node owns what stands below it; whoever holds the root holds the whole tree.
/// Chains: 'a + b + c' leans to the left, and nothing limits its length, so that a walk that calls itself for `left()`
/// overflows the stack one day. `leftChain` gives the chain as a list; dumping and destruction go by it. All other
/// nesting of a parsed tree is at most 1000 deep.
/// Threads: a tree that nobody changes may be read by many at once; none of the nodes can be changed.
namespace VLD::Utils::Internal {

class BinaryOp;
class FuncOp;
class ListExpression;
class Literal;
class NegateExpression;

class Expression;

/// Something to do for each kind of node; `Expression::visit` picks the right one.
class VELDRIN_API ExpressionVisitor {
public:
    virtual ~ExpressionVisitor();
    /// Lets the node pick; a visitor may do more around it.
    virtual void visitExpression(Expression& expression);
    /// Does nothing: there are no lists among tag expressions.
    virtual void visit(ListExpression& list);
    virtual void visit(FuncOp& function) = 0;
    virtual void visit(NegateExpression& complement) = 0;
    virtual void visit(BinaryOp& operation) = 0;
    virtual void visit(Literal& literal) = 0;
};

/// A node. The three operations keep their places in the virtual table.
class VELDRIN_API Expression {
public:
    Expression() = default;
    Expression(Expression const&) = delete;
    Expression& operator=(Expression const&) = delete;
    virtual ~Expression();

    /// Calls the visitor's operation for this node's class.
    virtual void visit(ExpressionVisitor& visitor) = 0;
    /// Writes text that parses to an equal tree, with no more parentheses than that takes and one blank on either side
    /// of an operator.
    virtual void dump(std::ostream& stream) const = 0;
};

/// A name or a pattern.
class VELDRIN_API Literal : public Expression {
public:
    /// token: of kind `Name` or `Pattern`.
    explicit Literal(Token token);
    ~Literal() override;
    void visit(ExpressionVisitor& visitor) override;
    void dump(std::ostream& stream) const override;

    [[nodiscard]] std::string id() const { return token_.text; }
    [[nodiscard]] TokenKind kind() const noexcept { return token_.kind; }

private:
    Token token_;
};

/// Two operands, neither null, and what to do with them.
class VELDRIN_API BinaryOp : public Expression {
public:
    /// The kind of the operator's token less 3.
    enum class Op : std::int32_t { Union = 0, Difference = 1, Intersection = 2 };

    BinaryOp(Op op, std::unique_ptr<Expression> left, std::unique_ptr<Expression> right);
    ~BinaryOp() override;
    void visit(ExpressionVisitor& visitor) override;
    void dump(std::ostream& stream) const override;

    [[nodiscard]] Op op() const noexcept { return op_; }
    [[nodiscard]] Expression& left() const noexcept { return *left_; }
    [[nodiscard]] Expression& right() const noexcept { return *right_; }

private:
    Op op_;
    std::unique_ptr<Expression> left_;
    std::unique_ptr<Expression> right_;
};

/// Everything but its operand, which is not null.
class VELDRIN_API NegateExpression : public Expression {
public:
    explicit NegateExpression(std::unique_ptr<Expression> operand);
    ~NegateExpression() override;
    void visit(ExpressionVisitor& visitor) override;
    void dump(std::ostream& stream) const override;

    [[nodiscard]] Expression& expr() const noexcept { return *operand_; }

private:
    std::unique_ptr<Expression> operand_;
};

/// A function of one operand, which is not null.
class VELDRIN_API FuncOp : public Expression {
public:
    /// name: of kind `Name`.
    FuncOp(Token name, std::unique_ptr<Expression> operand);
    ~FuncOp() override;
    void visit(ExpressionVisitor& visitor) override;
    void dump(std::ostream& stream) const override;

    [[nodiscard]] std::string id() const { return name_.text; }
    [[nodiscard]] Expression& expr() const noexcept { return *operand_; }

private:
    Token name_;
    std::unique_ptr<Expression> operand_;
};

/// The operations that follow each other along the left operands, the one to be done first in front and `last` at the
/// end. The first one's left operand is no `BinaryOp`.
/// Cost: linear in their number. Errors: std::bad_alloc.
[[nodiscard]] VELDRIN_API std::vector<BinaryOp const*> leftChain(BinaryOp const& last);

} // namespace VLD::Utils::Internal
