#pragma once

#include "Console.h"

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

/// Reading mesh files: the whole file, its lines, its words and its numbers.
namespace Zon {

/// The bytes of a file. Errors: Failure with the file's name and the system's reason.
[[nodiscard]] std::string readWholeFile(std::string const& path);

/// Throws Failure "path:line: reason".
[[noreturn]] void failAtLine(std::string const& path, std::uint64_t line, std::string_view reason);

/// The float nearest to what the text says, ties to even, for the whole text or nothing. "nan" and "inf" are numbers;
/// what is too large for a float is none.
[[nodiscard]] std::optional<float> parseFloat(std::string_view text);

/// The whole number that the text says; nothing when it is none or does not fit 64 bits.
[[nodiscard]] std::optional<std::int64_t> parseInteger(std::string_view text);

/// Cuts the first word off `rest`; "" when only blanks are left. Blanks are ' ', '\t', '\r', '\v' and '\f'.
[[nodiscard]] std::string_view takeWord(std::string_view& rest);

/// A word or line in quotes for a message, cut to a bearable length, with unprintable bytes replaced.
[[nodiscard]] std::string inQuotes(std::string_view text);

/// Lines of a text, counted from 1.
class Lines {
public:
    explicit Lines(std::string_view text) : text_(text) {}

    /// Moves to the next line; false at the end of the text.
    bool next();
    /// The current line without its end.
    [[nodiscard]] std::string_view current() const noexcept { return current_; }
    [[nodiscard]] std::uint64_t number() const noexcept { return number_; }
    /// Byte offset behind the current line.
    [[nodiscard]] std::size_t position() const noexcept { return position_; }

private:
    std::string_view text_;
    std::string_view current_;
    std::size_t position_ = 0;
    std::uint64_t number_ = 0;
};

/// The words of a text one after the other, across lines; '#' starts a comment where `comment` says so.
class Words {
public:
    /// skippedLines: so many lines at the start are passed over.
    Words(std::string const& path, std::string_view text, bool hasComments, std::uint64_t skippedLines = 0)
        : path_(path), lines_(text), progress_("reading", text.size()), hasComments_(hasComments)
    {
        while (lines_.number() < skippedLines && lines_.next()) {
        }
    }

    /// The next word; "" at the end of the text.
    [[nodiscard]] std::string_view next();
    /// The next word of the current line; "" at its end.
    [[nodiscard]] std::string_view nextInLine() { return takeWord(rest_); }
    [[nodiscard]] std::uint64_t line() const noexcept { return lines_.number(); }
    [[nodiscard]] std::size_t position() const noexcept { return lines_.position(); }

    /// The next number; fails at its line when there is none. what: "a coordinate of point 5".
    [[nodiscard]] float number(std::string_view what);
    /// The next whole number from 0 to `most`.
    [[nodiscard]] std::uint32_t count(std::string_view what, std::uint64_t most = 0xFFFFFFFFu);
    [[noreturn]] void fail(std::string_view reason) const { failAtLine(path_, lines_.number(), reason); }

private:
    std::string const& path_;
    Lines lines_;
    std::string_view rest_;
    Progress progress_;
    bool hasComments_;
};

} // namespace Zon
