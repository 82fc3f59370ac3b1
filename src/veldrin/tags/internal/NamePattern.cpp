#include <veldrin/tags/internal/NamePattern.h>

// Pieces between stars are taken at their leftmost places one after the other, which leaves the most for what follows.
// Each is found without going back in the name: D. Knuth, J. Morris, V. Pratt, Fast pattern matching in strings, 1977.
namespace Veldrin::Geometry {

NamePattern::Piece::Piece(std::string_view pieceText) : text(pieceText), shorterBeginnings(text.size() + 1)
{
    std::size_t length = 0;
    for (std::size_t i = 1; i < text.size(); ++i) {
        while (length > 0 && text[i] != text[length])
            length = shorterBeginnings[length];
        if (text[i] == text[length])
            ++length;
        shorterBeginnings[i + 1] = length;
    }
}

std::size_t NamePattern::Piece::findEnd(std::string_view name, std::size_t from) const noexcept
{
    std::size_t matched = 0;
    for (std::size_t i = from; i < name.size(); ++i) {
        while (matched > 0 && name[i] != text[matched])
            matched = shorterBeginnings[matched];
        if (name[i] == text[matched])
            ++matched;
        if (matched == text.size())
            return i + 1;
    }
    return std::string_view::npos;
}

NamePattern::NamePattern(std::string_view pattern)
    : hasStar_(pattern.find('*') != std::string_view::npos), beginning_(pattern.substr(0, pattern.find('*')))
{
    if (!hasStar_)
        return;
    std::size_t const lastStar = pattern.rfind('*');
    ending_ = pattern.substr(lastStar + 1);
    for (std::size_t star = beginning_.size(); star < lastStar;) {
        std::size_t const next = pattern.find('*', star + 1);
        if (next > star + 1)
            pieces_.emplace_back(pattern.substr(star + 1, next - star - 1));
        star = next;
    }
}

bool NamePattern::matches(std::string_view name) const noexcept
{
    if (!hasStar_)
        return name == beginning_;
    if (name.size() < beginning_.size() + ending_.size() || !name.starts_with(beginning_) || !name.ends_with(ending_) ||
        name.find_first_of("\n\r") != std::string_view::npos)
        return false;
    std::size_t place = beginning_.size();
    name.remove_suffix(ending_.size());
    for (Piece const& piece : pieces_) {
        place = piece.findEnd(name, place);
        if (place == std::string_view::npos)
            return false;
    }
    return true;
}

} // namespace Veldrin::Geometry
