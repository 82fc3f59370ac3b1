#include "Working.h"

#include "Console.h"

#include <fmt/format.h>

#include <chrono>
#include <cstdio>
#include <string>

namespace Zon {

namespace {

    using namespace std::chrono_literals;
    using Clock = std::chrono::steady_clock;

    constexpr std::size_t kBarWidth = 40;
    constexpr std::size_t kBlockWidth = 8;

    /// A block that runs to and fro.
    std::string barAt(std::size_t step)
    {
        std::size_t const turn = kBarWidth - kBlockWidth;
        std::size_t const at = step % (2 * turn);
        std::string bar(kBarWidth, ' ');
        bar.replace(at < turn ? at : 2 * turn - at, kBlockWidth, kBlockWidth, '=');
        return bar;
    }

} // namespace

Working::Working(std::string_view label)
{
    if (isTerminal(stderr))
        thread_ = std::thread([this, text = std::string(label)] { show(text); });
}

Working::~Working()
{
    if (!thread_.joinable())
        return;
    {
        std::lock_guard const lock(mutex_);
        hasEnded_ = true;
    }
    ended_.notify_one();
    thread_.join();
}

void Working::show(std::string_view label)
{
    auto const start = Clock::now();
    std::unique_lock lock(mutex_);
    auto const hasEnded = [this] { return hasEnded_; };
    if (ended_.wait_for(lock, 1s, hasEnded))
        return;
    for (std::size_t step = 0; !ended_.wait_for(lock, 100ms, hasEnded); ++step) {
        auto const seconds = std::chrono::duration_cast<std::chrono::seconds>(Clock::now() - start).count();
        fmt::print(stderr, "\r{} [{}] {} s", label, barAt(step), seconds);
        std::fflush(stderr);
    }
    fmt::print(stderr, "\r\033[K");
}

} // namespace Zon
