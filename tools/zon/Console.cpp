#include "Console.h"

#include <fmt/format.h>

#include <unistd.h>

#include <cstdlib>
#include <system_error>

namespace Zon {

namespace {

    bool hasColor(std::FILE* stream)
    {
        char const* const noColor = std::getenv("NO_COLOR");
        return !(noColor && *noColor) && isTerminal(stream);
    }

    constexpr std::uint64_t kBarWidth = 40;

} // namespace

bool isTerminal(std::FILE* stream)
{
    char const* const terminal = std::getenv("TERM");
    return !(terminal && std::string_view(terminal) == "dumb") && isatty(fileno(stream)) == 1;
}

std::string colored(std::FILE* stream, Color color, std::string_view text)
{
    if (!hasColor(stream))
        return std::string(text);
    int const code = color == Color::Green ? 32 : color == Color::Red ? 31 : color == Color::Yellow ? 33 : 1;
    return fmt::format("\033[{}m{}\033[0m", code, text);
}

void error(std::string_view text)
{
    fmt::print(stderr, "zon: {} {}\n", colored(stderr, Color::Red, "error:"), printable(text, true));
}

void warn(std::string_view text)
{
    fmt::print(stderr, "zon: {} {}\n", colored(stderr, Color::Yellow, "warning:"), printable(text, true));
}

std::string errorText(int errorNumber)
{
    return std::generic_category().message(errorNumber);
}

std::string printable(std::string_view text, bool keepsLineEnds)
{
    std::string result(text);
    for (std::size_t i = 0; i < result.size(); ++i) {
        auto const byte = static_cast<unsigned char>(result[i]);
        auto const next = static_cast<unsigned char>(i + 1 < result.size() ? result[i + 1] : 0);
        // U+0080 to U+009F are control characters of two bytes.
        if (byte == 0xC2 && next >= 0x80 && next < 0xA0)
            result[i] = result[i + 1] = '?';
        else if ((byte < 32 && !(keepsLineEnds && byte == '\n')) || byte == 127)
            result[i] = '?';
    }
    return result;
}

std::string counted(std::uint64_t count, std::string_view noun)
{
    return fmt::format("{} {}{}", count, noun, count == 1 ? "" : "s");
}

std::string byteText(std::uint64_t bytes)
{
    if (bytes < 1024)
        return fmt::format("{} B", bytes);
    double value = static_cast<double>(bytes) / 1024;
    char const* const units[] = {"KiB", "MiB", "GiB", "TiB"};
    std::size_t unit = 0;
    for (; value >= 1024 && unit + 1 < std::size(units); ++unit)
        value /= 1024;
    return fmt::format("{:.1f} {}", value, units[unit]);
}

Progress::Progress(std::string_view label, std::uint64_t total)
    : label_(label), total_(total), isVisible_(total > 0 && isTerminal(stderr))
{
}

Progress::~Progress()
{
    if (isVisible_ && nextUpdate_ > 0)
        fmt::print(stderr, "\r\033[K");
}

void Progress::update(std::uint64_t done)
{
    if (!isVisible_ || done < nextUpdate_)
        return;
    std::uint64_t const percent = total_ < 100 ? done * 100 / total_ : done / (total_ / 100);
    std::uint64_t const shown = percent < 100 ? percent : 100;
    nextUpdate_ = done + total_ / 100 + 1;
    std::string const bar(shown * kBarWidth / 100, '=');
    fmt::print(stderr, "\r{} [{:<40}] {:3}%", label_, bar, shown);
    std::fflush(stderr);
}

} // namespace Zon
