#pragma once

#include <veldrin/geometry/Export.h>
#include <veldrin/tags/TagExpression.h>

#include <cstddef>
#include <memory>
#include <stdexcept>
#include <string>
#include <string_view>

/// From the text of a tag expression to its tree.
///
///     auto const tree = parseTagExpression("a - b ^ e"); // (a - b) ^ e
///
/// An expression is an operand followed by any number of pairs of operator ('+', '-', '^') and operand; operators are of
/// one rank and group to the left. An operand is '!' or '-' and an operand, an expression in parentheses, a name with or
/// without an expression in parentheses behind it, or a pattern.
namespace VLD::Utils::Internal {

/// Why a text is no tag expression, and where: at which byte of the text the token starts that cannot stand there, which
/// is the text's length when something is missing at its end.
class VELDRIN_API ParseError : public std::runtime_error {
public:
    ParseError(char const* message, std::size_t byteOffset);
    ~ParseError() override;

    [[nodiscard]] std::size_t byteOffset() const noexcept { return byteOffset_; }

private:
    std::size_t byteOffset_;
};

/// The tree of the text, never null.
///
/// Parentheses and complements within each other may be 1000 deep, chains of operators of any length.
/// Cost: linear in the text; memory for a token and a node per word.
/// Errors: ParseError, whose message is one of five fixed texts; std::bad_alloc.
[[nodiscard]] VELDRIN_API std::unique_ptr<Expression> parseTagExpression(std::string_view text);

} // namespace VLD::Utils::Internal
