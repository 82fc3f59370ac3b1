#pragma once

#include <condition_variable>
#include <mutex>
#include <string_view>
#include <thread>

namespace Zon {

/// A moving bar with the seconds so far on stderr, for work that cannot tell how far it is. It shows after one second, on a
/// terminal only, and is wiped when the work ends.
class Working {
public:
    explicit Working(std::string_view label);
    Working(Working const&) = delete;
    Working& operator=(Working const&) = delete;
    ~Working();

private:
    void show(std::string_view label);

    std::mutex mutex_;
    std::condition_variable ended_;
    bool hasEnded_ = false;
    std::thread thread_;
};

} // namespace Zon
