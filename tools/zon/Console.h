#pragma once

#include <cstdint>
#include <cstdio>
#include <string>
#include <string_view>

/// Texts for people. Reports go to stdout, everything else to stderr.
namespace Zon {

enum class Color { Green, Red, Yellow, Bold };

/// Whether a person looks at it who can be shown more than lines: a terminal, and TERM is not "dumb".
[[nodiscard]] bool isTerminal(std::FILE* stream);

/// `text` in colour when `stream` is a terminal and NO_COLOR is not set, else as it is.
[[nodiscard]] std::string colored(std::FILE* stream, Color color, std::string_view text);

/// One line on stderr, `printable` but for line ends in it.
void error(std::string_view text);
void warn(std::string_view text);

/// The system's text for an error number.
[[nodiscard]] std::string errorText(int errorNumber);

/// Text from a file as a terminal may have it: '?' for each byte of a control character, line ends among them unless they
/// are kept.
[[nodiscard]] std::string printable(std::string_view text, bool keepsLineEnds = false);

/// "1 face", "2 faces".
[[nodiscard]] std::string counted(std::uint64_t count, std::string_view noun);

/// A number of bytes as a person reads it: "812 B", "1.3 MiB".
[[nodiscard]] std::string byteText(std::uint64_t bytes);

/// A bar on stderr while something lasts; nothing when stderr is no terminal.
class Progress {
public:
    Progress(std::string_view label, std::uint64_t total);
    Progress(Progress const&) = delete;
    Progress& operator=(Progress const&) = delete;
    ~Progress();

    /// done: out of `total`. Cheap when nothing visible changes.
    void update(std::uint64_t done);

private:
    std::string label_;
    std::uint64_t total_;
    std::uint64_t nextUpdate_ = 0;
    bool isVisible_;
};

} // namespace Zon
