#include <veldrin/tags/TagToken.h>

namespace VLD::Utils::Internal {

namespace {

    using Traits = std::istream::traits_type;

    bool isAtEnd(std::istream& stream)
    {
        return Traits::eq_int_type(stream.peek(), Traits::eof());
    }

    // Not std::isspace, whose answer hangs on the locale that the host has set.
    constexpr bool isWhitespace(char character) noexcept
    {
        return character == ' ' || (character >= '\t' && character <= '\r');
    }

    TokenKind kindOfSymbol(char character) noexcept
    {
        switch (character) {
        case '+': return TokenKind::Plus;
        case '-': return TokenKind::Minus;
        case '^': return TokenKind::Caret;
        case '!': return TokenKind::Bang;
        case '(': return TokenKind::LeftParen;
        case ')': return TokenKind::RightParen;
        default: return TokenKind::Invalid;
        }
    }

    Token readName(std::istream& stream, char first)
    {
        Token token{TokenKind::Name, std::string(1, first)};
        while (!isAtEnd(stream) && isNameChar(Traits::to_char_type(stream.peek())))
            token.text += Traits::to_char_type(stream.get());
        if (token.text.find('*') != std::string::npos)
            token.kind = TokenKind::Pattern;
        return token;
    }

} // namespace

void skipWhitespace(std::istream& stream)
{
    while (!isAtEnd(stream) && isWhitespace(Traits::to_char_type(stream.peek())))
        stream.get();
}

Token nextToken(std::istream& stream)
{
    skipWhitespace(stream);
    if (isAtEnd(stream))
        return {TokenKind::End, {}};
    char const character = Traits::to_char_type(stream.get());
    if (character == '\0')
        return {TokenKind::Invalid, {}};
    if (auto const kind = kindOfSymbol(character); kind != TokenKind::Invalid)
        return {kind, {}};
    if (isNameChar(character))
        return readName(stream, character);
    return {TokenKind::Invalid, std::string("Invalid Character: ") + character};
}

} // namespace VLD::Utils::Internal
