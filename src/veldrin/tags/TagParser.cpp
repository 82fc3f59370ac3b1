#include <veldrin/tags/TagParser.h>

#include <sstream>
#include <utility>
#include <vector>

namespace VLD::Utils::Internal {

namespace {

    using ExpressionPtr = std::unique_ptr<Expression>;

    constexpr int kMostNesting = 1000;

    constexpr char kInvalid[] = "Expression Invalid";
    constexpr char kExpectingRight[] = "Expecting Expression at the right of operator";
    constexpr char kExpectingComplement[] = "Expecting expression after unary !";
    constexpr char kExpectingParen[] = "Expecting a ')'";
    constexpr char kExpectingOperand[] =
        "Expecting:  (-<Expression>| (<Expression>) | <Literal> | <Literal>(<Expression>)";

    struct PlacedToken {
        Token token;
        std::size_t byteOffset;
    };

    /// All tokens up to the `End` one, invalid ones included.
    std::vector<PlacedToken> tokensOf(std::string_view text)
    {
        std::istringstream stream{std::string(text)};
        std::vector<PlacedToken> tokens;
        do {
            skipWhitespace(stream);
            // The buffer is asked, because a stream at its end no longer tells its position.
            auto const position = stream.rdbuf()->pubseekoff(0, std::ios::cur, std::ios::in);
            tokens.push_back({nextToken(stream), static_cast<std::size_t>(std::streamoff(position))});
        } while (tokens.back().token.kind != TokenKind::End);
        return tokens;
    }

    /// A place among the tokens. Behind the last one stands an invalid one, at the end of the text.
    class Cursor {
    public:
        explicit Cursor(std::string_view text) : tokens_(tokensOf(text)), textSize_(text.size()) {}

        [[nodiscard]] TokenKind peek() const noexcept
        {
            return isAtEnd() ? TokenKind::Invalid : tokens_[place_].token.kind;
        }
        [[nodiscard]] bool isAtEnd() const noexcept { return place_ == tokens_.size(); }

        /// The token here, given away; moves on.
        Token consume() { return isAtEnd() ? Token() : std::move(tokens_[place_++].token); }

        [[noreturn]] void fail(char const* message) const
        {
            throw ParseError(message, isAtEnd() ? textSize_ : tokens_[place_].byteOffset);
        }

        void enter()
        {
            if (++nesting_ > kMostNesting)
                fail(kInvalid);
        }
        void leave() noexcept { --nesting_; }

    private:
        std::vector<PlacedToken> tokens_;
        std::size_t textSize_;
        std::size_t place_ = 0;
        int nesting_ = 0;
    };

    ExpressionPtr parsePrimary(Cursor& cursor);

    bool isOperator(TokenKind kind) noexcept
    {
        return kind == TokenKind::Plus || kind == TokenKind::Minus || kind == TokenKind::Caret;
    }

    BinaryOp::Op operationOf(TokenKind kind) noexcept
    {
        return static_cast<BinaryOp::Op>(static_cast<int>(kind) - static_cast<int>(TokenKind::Plus));
    }

    /// Null for an expression that is not there, which uses up the end of the text.
    ExpressionPtr parseExpression(Cursor& cursor)
    {
        if (cursor.peek() == TokenKind::End) {
            cursor.consume();
            return nullptr;
        }
        auto left = parsePrimary(cursor);
        while (isOperator(cursor.peek())) {
            auto const op = operationOf(cursor.consume().kind);
            auto right = parsePrimary(cursor);
            if (!right)
                cursor.fail(kExpectingRight);
            left = std::make_unique<BinaryOp>(op, std::move(left), std::move(right));
        }
        if (cursor.peek() == TokenKind::End)
            cursor.consume();
        return left;
    }

    ExpressionPtr parseComplement(Cursor& cursor)
    {
        cursor.enter();
        cursor.consume();
        auto operand = parsePrimary(cursor);
        if (!operand)
            cursor.fail(kExpectingComplement);
        cursor.leave();
        return std::make_unique<NegateExpression>(std::move(operand));
    }

    ExpressionPtr parseGroup(Cursor& cursor)
    {
        cursor.enter();
        cursor.consume();
        auto inner = parseExpression(cursor);
        if (cursor.peek() != TokenKind::RightParen)
            cursor.fail(kExpectingParen);
        cursor.consume();
        cursor.leave();
        return inner;
    }

    ExpressionPtr parsePrimary(Cursor& cursor)
    {
        switch (cursor.peek()) {
        case TokenKind::Minus:
        case TokenKind::Bang: return parseComplement(cursor);
        case TokenKind::LeftParen: return parseGroup(cursor);
        case TokenKind::Name: {
            Token name = cursor.consume();
            if (cursor.peek() == TokenKind::LeftParen)
                return std::make_unique<FuncOp>(std::move(name), parsePrimary(cursor));
            return std::make_unique<Literal>(std::move(name));
        }
        case TokenKind::Pattern: return std::make_unique<Literal>(cursor.consume());
        default: cursor.fail(kExpectingOperand);
        }
    }

} // namespace

ParseError::ParseError(char const* message, std::size_t byteOffset)
    : std::runtime_error(message), byteOffset_(byteOffset)
{
}

ParseError::~ParseError() = default;

std::unique_ptr<Expression> parseTagExpression(std::string_view text)
{
    Cursor cursor(text);
    auto expression = parseExpression(cursor);
    if (!cursor.isAtEnd() || !expression)
        cursor.fail(kInvalid);
    return expression;
}

} // namespace VLD::Utils::Internal
