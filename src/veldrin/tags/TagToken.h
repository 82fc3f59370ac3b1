#pragma once

#include <veldrin/geometry/Export.h>

#include <cstdint>
#include <istream>
#include <string>

/// The words of tag expressions.
///
///     std::istringstream text("top ^ !border*");
///     nextToken(text); // Name "top", then Caret, Bang, Pattern "border*", End
namespace VLD::Utils::Internal {

/// What a token is. 9 is taken by none.
enum class TokenKind : std::int32_t {
    Invalid = 0, ///< a character outside the language, a zero byte among them
    Name = 1,    ///< a run of name characters without '*'
    Pattern = 2, ///< a run of name characters with at least one '*'
    Plus = 3,
    Minus = 4,
    Caret = 5,
    Bang = 6,
    LeftParen = 7,
    RightParen = 8,
    End = 10 ///< the end of the text
};

struct Token {
    TokenKind kind = TokenKind::Invalid;
    /// The run of a `Name` or `Pattern`, the message of an `Invalid` one made from a character; empty for all others.
    std::string text;
};

/// Whether a name or pattern may hold this byte: an ASCII letter or digit, '*', '.', ':' or '_'.
[[nodiscard]] constexpr bool isNameChar(char character) noexcept
{
    return (character >= 'a' && character <= 'z') || (character >= 'A' && character <= 'Z') ||
           (character >= '0' && character <= '9') || character == '*' || character == '.' || character == ':' ||
           character == '_';
}

/// Reads and drops blanks, tabs, line feeds, vertical tabs, form feeds and carriage returns.
VELDRIN_API void skipWhitespace(std::istream& stream);

/// Reads one token and the white space before it; `End` at the end of the stream, however often it is asked.
/// Cost: linear in what it reads. Errors: std::bad_alloc.
[[nodiscard]] VELDRIN_API Token nextToken(std::istream& stream);

} // namespace VLD::Utils::Internal
