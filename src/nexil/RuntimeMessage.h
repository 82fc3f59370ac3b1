#pragma once

#include <nexil/Export.h>
#include <nexil/String.h>

namespace Nexil {

/// What a message is about; the numbers are fixed.
enum class RuntimeMessageCategory : unsigned int { Info = 0, Error = 1, Warning = 2 };

/// A text for the user, with its category.
class RuntimeMessage {
public:
    RuntimeMessage(RuntimeMessageCategory category, String text) : category_(category), text_(std::move(text)) {}

    [[nodiscard]] RuntimeMessageCategory category() const noexcept { return category_; }
    [[nodiscard]] String const& text() const noexcept { return text_; }

private:
    RuntimeMessageCategory category_;
    String text_;
};

/// Where functions that can fail for reasons of the outside world leave their messages. Hosts derive from it and pass
/// a pointer, which may be null wherever one is taken.
class VELDRIN_PLATFORM_API RuntimeServices {
public:
    RuntimeServices() = default;
    RuntimeServices(RuntimeServices const&) = default;
    RuntimeServices& operator=(RuntimeServices const&) = default;
    virtual ~RuntimeServices();

    /// Takes one message; the base drops it. Called on the thread that called the reporting function.
    virtual void logMessage(RuntimeMessage message) const;
};

} // namespace Nexil
