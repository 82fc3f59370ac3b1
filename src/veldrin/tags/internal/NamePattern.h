#pragma once

#include <cstddef>
#include <string>
#include <string_view>
#include <vector>

namespace Veldrin::Geometry {

/// A name in which '*' stands for any run of bytes but line feeds and carriage returns; everything else stands for
/// itself. A name matches as a whole.
///
/// Cost: linear in the name and the pattern together, whatever they are. (`VLD::Utils::ChannelParser` knows '?' too and
/// takes up to their product.)
class NamePattern {
public:
    explicit NamePattern(std::string_view pattern);

    [[nodiscard]] bool matches(std::string_view name) const noexcept;

private:
    /// A text between two stars.
    struct Piece {
        explicit Piece(std::string_view pieceText);
        /// Where its first occurrence in `name` at or behind `from` ends; npos when there is none.
        [[nodiscard]] std::size_t findEnd(std::string_view name, std::size_t from) const noexcept;

        std::string text;
        /// For each length of a matched beginning, the length of the longest shorter one that is its ending too.
        std::vector<std::size_t> shorterBeginnings;
    };

    bool hasStar_;
    std::string beginning_; // before the first star
    std::string ending_;    // behind the last one
    std::vector<Piece> pieces_;
};

} // namespace Veldrin::Geometry
