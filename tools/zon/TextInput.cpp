#include "TextInput.h"

#include "Command.h"

#include <fmt/format.h>

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <charconv>
#include <cmath>
#include <cstdlib>

namespace Zon {

namespace {

    bool isBlank(char c) noexcept
    {
        return c == ' ' || c == '\t' || c == '\r' || c == '\v' || c == '\f';
    }

    struct Descriptor {
        int number;
        ~Descriptor()
        {
            if (number >= 0)
                close(number);
        }
    };

} // namespace

std::string readWholeFile(std::string const& path)
{
    auto const fail = [&](int errorNumber) {
        throw Failure(fmt::format("{}: cannot be read: {}", path, errorText(errorNumber)));
    };
    Descriptor const file{open(path.c_str(), O_RDONLY | O_CLOEXEC)};
    struct stat status {};
    if (file.number < 0 || fstat(file.number, &status) != 0)
        fail(errno);
    std::string bytes;
    std::size_t used = 0;
    // Pipes have no size; one byte more than the size shows the end of an ordinary file at once.
    bytes.resize(static_cast<std::size_t>(status.st_size) + 1);
    for (;;) {
        ssize_t const got = read(file.number, bytes.data() + used, bytes.size() - used);
        if (got < 0) {
            if (errno == EINTR)
                continue;
            fail(errno);
        }
        if (got == 0)
            break;
        used += static_cast<std::size_t>(got);
        if (used == bytes.size())
            bytes.resize(used + used / 2 + 4096);
    }
    bytes.resize(used);
    return bytes;
}

void failAtLine(std::string const& path, std::uint64_t line, std::string_view reason)
{
    throw Failure(fmt::format("{}:{}: {}", path, line, reason));
}

std::optional<float> parseFloat(std::string_view text)
{
    if (text.size() > 1 && text[0] == '+' && text[1] != '-')
        text.remove_prefix(1);
    float value = 0;
    auto const [end, status] = std::from_chars(text.data(), text.data() + text.size(), value);
    if (end != text.data() + text.size() || text.empty())
        return std::nullopt;
    if (status == std::errc::result_out_of_range) {
        // Too small is a denormal or zero, which strtof rounds rightly; too large is no float.
        value = std::strtof(std::string(text).c_str(), nullptr);
        if (std::isinf(value))
            return std::nullopt;
    } else if (status != std::errc()) {
        return std::nullopt;
    }
    return value;
}

std::optional<std::int64_t> parseInteger(std::string_view text)
{
    if (text.size() > 1 && text[0] == '+' && text[1] != '-')
        text.remove_prefix(1);
    std::int64_t value = 0;
    auto const [end, status] = std::from_chars(text.data(), text.data() + text.size(), value);
    if (status != std::errc() || end != text.data() + text.size())
        return std::nullopt;
    return value;
}

std::string_view takeWord(std::string_view& rest)
{
    std::size_t begin = 0;
    while (begin < rest.size() && isBlank(rest[begin]))
        ++begin;
    std::size_t end = begin;
    while (end < rest.size() && !isBlank(rest[end]))
        ++end;
    auto const word = rest.substr(begin, end - begin);
    rest.remove_prefix(end);
    return word;
}

std::string inQuotes(std::string_view text)
{
    constexpr std::size_t kMost = 40;
    std::string result = "'";
    for (char const c : text.substr(0, kMost))
        result += c >= 0 && (c < 32 || c == 127) ? '?' : c;
    return result + (text.size() > kMost ? "...'" : "'");
}

bool Lines::next()
{
    if (position_ >= text_.size())
        return false;
    auto const end = text_.find('\n', position_);
    auto const stop = end == std::string_view::npos ? text_.size() : end;
    current_ = text_.substr(position_, stop - position_);
    if (!current_.empty() && current_.back() == '\r')
        current_.remove_suffix(1);
    position_ = end == std::string_view::npos ? text_.size() : end + 1;
    ++number_;
    return true;
}

std::string_view Words::next()
{
    for (;;) {
        if (auto const word = takeWord(rest_); !word.empty())
            return word;
        if (!lines_.next())
            return {};
        progress_.update(lines_.position());
        rest_ = lines_.current();
        if (hasComments_)
            rest_ = rest_.substr(0, rest_.find('#'));
    }
}

float Words::number(std::string_view what)
{
    auto const word = next();
    if (word.empty())
        fail(fmt::format("the file ends before {}", what));
    auto const value = parseFloat(word);
    if (!value)
        fail(fmt::format("{} is no number that a float holds, where {} belongs", inQuotes(word), what));
    return *value;
}

std::uint32_t Words::count(std::string_view what, std::uint64_t most)
{
    auto const word = next();
    if (word.empty())
        fail(fmt::format("the file ends before {}", what));
    auto const value = parseInteger(word);
    if (!value)
        fail(fmt::format("{} is no whole number, where {} belongs", inQuotes(word), what));
    if (*value < 0 || static_cast<std::uint64_t>(*value) > most)
        fail(fmt::format("{} is {}, outside of 0 to {}", what, *value, most));
    return static_cast<std::uint32_t>(*value);
}

} // namespace Zon
