#pragma once

#include <cstdlib>

namespace support {

/// An environment variable for as long as this lives.
class EnvironmentVariable {
public:
    EnvironmentVariable(char const* name, char const* value) : name_(name) { setenv(name, value, 1); }
    EnvironmentVariable(EnvironmentVariable const&) = delete;
    EnvironmentVariable& operator=(EnvironmentVariable const&) = delete;
    ~EnvironmentVariable() { unsetenv(name_); }

private:
    char const* name_;
};

} // namespace support
