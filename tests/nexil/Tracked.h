#pragma once

#include <stdexcept>
#include <utility>

namespace support {

/// A value that counts itself and whose copies can be made to fail. Moving leaves -1 behind.
struct Tracked {
    static inline int alive = 0;
    static inline int copiesUntilFailure = -1; // below 0 none fails
    int value;

    Tracked(int number = 0) : value(number) { ++alive; }
    Tracked(Tracked const& other) : value(other.value)
    {
        if (copiesUntilFailure == 0)
            throw std::runtime_error("this copy fails");
        --copiesUntilFailure;
        ++alive;
    }
    Tracked(Tracked&& other) noexcept : value(std::exchange(other.value, -1)) { ++alive; }
    Tracked& operator=(Tracked const&) = default;
    ~Tracked() { --alive; }
    friend bool operator==(Tracked const&, Tracked const&) = default;
};

/// Lets the copy after `count` further ones fail while it lives.
struct FailingCopies {
    explicit FailingCopies(int count) { Tracked::copiesUntilFailure = count; }
    ~FailingCopies() { Tracked::copiesUntilFailure = -1; }
};

} // namespace support
