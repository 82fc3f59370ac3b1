#pragma once

#include <cstdint>

namespace support {

/// How many times this program has called operator new.
std::uint64_t allocationCount();

} // namespace support
