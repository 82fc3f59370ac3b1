#pragma once

#include <nexil/Export.h>

#include <cstdint>
#include <string_view>

namespace Nexil::Internal {

/// SipHash-1-3 (Aumasson and Bernstein, "SipHash: a fast short-input PRF", 2012) under a key drawn once per process.
///
/// For tables whose keys come from files: nobody outside the process can choose names that collide. Differs from run to
/// run, so it is never stored and never decides an order.
[[nodiscard]] VELDRIN_PLATFORM_API std::uint64_t seededHash(std::string_view text) noexcept;

} // namespace Nexil::Internal
