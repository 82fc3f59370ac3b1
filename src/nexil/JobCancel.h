#pragma once

#include <nexil/Export.h>

namespace Nexil {

/// Installs the host's answer to "has the user cancelled this job?"; null, the initial state, means never.
///
/// hook: called often and from worker threads at once, so it must be thread-safe and quick; it must not throw.
VELDRIN_PLATFORM_API void setJobCancelHook(bool (*hook)()) noexcept;

/// True when the current job should stop. Long loops ask once per chunk of work and leave by std::runtime_error with
/// the text of `VLD::exceptionMessage`. Safe from any thread.
[[nodiscard]] VELDRIN_PLATFORM_API bool isJobCancelled() noexcept;

namespace Internal {

    /// The text of every cancellation.
    inline constexpr char kJobCancelledText[] = "Job cancelled";

    /// Whether a host has installed an answer: without one nothing can interrupt a computation.
    [[nodiscard]] VELDRIN_PLATFORM_API bool hasJobCancelHook() noexcept;

    /// Throws std::runtime_error(kJobCancelledText) when the job is cancelled.
    VELDRIN_PLATFORM_API void throwIfJobCancelled();

} // namespace Internal

} // namespace Nexil
