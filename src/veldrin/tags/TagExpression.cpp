#include <veldrin/tags/TagExpression.h>

#include <algorithm>
#include <cassert>
#include <utility>

namespace VLD::Utils::Internal {

namespace {

    char symbolOf(BinaryOp::Op op) noexcept
    {
        return op == BinaryOp::Op::Union ? '+' : op == BinaryOp::Op::Difference ? '-' : '^';
    }

    /// Where one operand alone is asked for, an operation needs parentheses.
    void dumpOperand(Expression const& operand, std::ostream& stream)
    {
        bool const needsParentheses = dynamic_cast<BinaryOp const*>(&operand) != nullptr;
        if (needsParentheses)
            stream << '(';
        operand.dump(stream);
        if (needsParentheses)
            stream << ')';
    }

} // namespace

// Out of line, so that each class has its virtual table in this library alone.
ExpressionVisitor::~ExpressionVisitor() = default;
Expression::~Expression() = default;
Literal::~Literal() = default;
NegateExpression::~NegateExpression() = default;
FuncOp::~FuncOp() = default;

void ExpressionVisitor::visitExpression(Expression& expression)
{
    expression.visit(*this);
}

void ExpressionVisitor::visit(ListExpression&) {}

Literal::Literal(Token token) : token_(std::move(token)) {}

void Literal::visit(ExpressionVisitor& visitor)
{
    visitor.visit(*this);
}

void Literal::dump(std::ostream& stream) const
{
    stream << token_.text;
}

BinaryOp::BinaryOp(Op op, std::unique_ptr<Expression> left, std::unique_ptr<Expression> right)
    : op_(op), left_(std::move(left)), right_(std::move(right))
{
    assert(left_ && right_);
}

BinaryOp::~BinaryOp()
{
    // Takes a chain apart from its end: each operation goes when it has lost its left operand.
    while (auto* const next = dynamic_cast<BinaryOp*>(left_.get())) {
        auto rest = std::move(next->left_);
        left_ = std::move(rest);
    }
}

void BinaryOp::visit(ExpressionVisitor& visitor)
{
    visitor.visit(*this);
}

void BinaryOp::dump(std::ostream& stream) const
{
    auto const chain = leftChain(*this);
    chain.front()->left().dump(stream);
    for (BinaryOp const* operation : chain) {
        stream << ' ' << symbolOf(operation->op_) << ' ';
        dumpOperand(*operation->right_, stream);
    }
}

NegateExpression::NegateExpression(std::unique_ptr<Expression> operand) : operand_(std::move(operand))
{
    assert(operand_);
}

void NegateExpression::visit(ExpressionVisitor& visitor)
{
    visitor.visit(*this);
}

void NegateExpression::dump(std::ostream& stream) const
{
    stream << '!';
    dumpOperand(*operand_, stream);
}

FuncOp::FuncOp(Token name, std::unique_ptr<Expression> operand) : name_(std::move(name)), operand_(std::move(operand))
{
    assert(operand_);
}

void FuncOp::visit(ExpressionVisitor& visitor)
{
    visitor.visit(*this);
}

void FuncOp::dump(std::ostream& stream) const
{
    stream << name_.text << '(';
    operand_->dump(stream);
    stream << ')';
}

std::vector<BinaryOp const*> leftChain(BinaryOp const& last)
{
    std::vector<BinaryOp const*> chain;
    for (auto const* operation = &last; operation; operation = dynamic_cast<BinaryOp const*>(&operation->left()))
        chain.push_back(operation);
    std::ranges::reverse(chain);
    return chain;
}

} // namespace VLD::Utils::Internal
