#pragma once

#include <nexil/JobCancel.h>

#include <atomic>

namespace support {

/// Cancels the running job for as long as it lives, from the question after `count` further ones on.
class CancelAfter {
public:
    explicit CancelAfter(int count = 0)
    {
        questionsLeft = count;
        questionCount = 0;
        Nexil::setJobCancelHook([] { return ++questionCount > questionsLeft; });
    }
    CancelAfter(CancelAfter const&) = delete;
    CancelAfter& operator=(CancelAfter const&) = delete;
    ~CancelAfter() { Nexil::setJobCancelHook(nullptr); }

    /// How often the job asked.
    static inline std::atomic<int> questionCount = 0;

private:
    static inline std::atomic<int> questionsLeft = 0;
};

} // namespace support
