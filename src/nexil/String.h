#pragma once

#include <concepts>
#include <cstddef>
#include <functional>
#include <ostream>
#include <string>
#include <string_view>
#include <utility>

namespace Nexil {

/// An owned string of bytes; UTF-8 by convention, never checked. Up to 15 bytes need no heap.
///
/// Order and equality are by byte. Embedded zero bytes are kept; `c_str()` ends in a further one.
class String {
public:
    static constexpr std::size_t npos = std::string::npos;

    String() noexcept = default;
    String(char const* text) : text_(text) {}
    String(char const* text, std::size_t length) : text_(text, length) {}
    explicit String(std::string_view text) : text_(text) {}
    explicit String(std::string&& text) noexcept : text_(std::move(text)) {}

    // A template, so that `text = {}` means the empty string and not a null pointer.
    template <std::convertible_to<char const*> Text>
    String& operator=(Text const& text)
    {
        text_ = static_cast<char const*>(text);
        return *this;
    }

    String& assign(String const& text)
    {
        text_ = text.text_;
        return *this;
    }
    String& assign(String&& text) noexcept
    {
        text_ = std::move(text.text_);
        return *this;
    }
    String& assign(char const* text)
    {
        text_.assign(text);
        return *this;
    }
    String& assign(char const* text, std::size_t length)
    {
        text_.assign(text, length);
        return *this;
    }

    [[nodiscard]] char const* c_str() const noexcept { return text_.c_str(); }
    [[nodiscard]] bool empty() const noexcept { return text_.empty(); }
    [[nodiscard]] std::size_t size() const noexcept { return text_.size(); }
    [[nodiscard]] std::size_t length() const noexcept { return text_.size(); }
    [[nodiscard]] std::string_view view() const noexcept { return text_; }

    /// Byte offset of the first `text` at or behind `position`, or npos.
    [[nodiscard]] std::size_t find(String const& text, std::size_t position = 0) const noexcept
    {
        return text_.find(text.text_, position);
    }
    /// Byte offset of the last `text` that starts at or before `position`, or npos.
    [[nodiscard]] std::size_t rfind(String const& text, std::size_t position = npos) const noexcept
    {
        return text_.rfind(text.text_, position);
    }
    /// Up to `count` bytes from `position` on; the empty string when `position` lies behind the end.
    [[nodiscard]] String substr(std::size_t position, std::size_t count = npos) const
    {
        return String(position > size() ? std::string_view() : view().substr(position, count));
    }
    /// Compares up to `count` bytes from `position` on with `text`: negative, 0 or positive, by byte. A `position`
    /// behind the end compares the empty string.
    [[nodiscard]] int compare(std::size_t position, std::size_t count, String const& text) const noexcept
    {
        return (position > size() ? std::string_view() : view().substr(position, count)).compare(text.view());
    }

    String& operator+=(String const& text)
    {
        text_ += text.text_;
        return *this;
    }
    String& operator+=(char const* text)
    {
        text_ += text;
        return *this;
    }

    friend String operator+(String left, String const& right)
    {
        left += right;
        return left;
    }
    friend String operator+(String left, char const* right)
    {
        left += right;
        return left;
    }

    friend bool operator==(String const& a, String const& b) noexcept { return a.text_ == b.text_; }
    friend bool operator==(String const& a, char const* b) noexcept { return a.text_ == b; }
    friend bool operator<(String const& a, String const& b) noexcept { return a.text_ < b.text_; }
    friend std::ostream& operator<<(std::ostream& stream, String const& text) { return stream << text.text_; }

private:
    std::string text_;
};

} // namespace Nexil

template <>
struct std::hash<Nexil::String> {
    std::size_t operator()(Nexil::String const& text) const noexcept
    {
        return std::hash<std::string_view>()(text.view());
    }
};
