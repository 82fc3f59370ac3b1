#include <nexil/SeededHash.h>

#include <bit>
#include <chrono>
#include <cstring>
#include <random>

namespace Nexil::Internal {

namespace {

    struct Key {
        std::uint64_t low;
        std::uint64_t high;
    };

    Key drawKey() noexcept
    {
        try {
            std::random_device device;
            auto draw = [&device] { return std::uint64_t(device()) << 32 | device(); };
            return {draw(), draw()};
        } catch (...) {
            // Without a random source the clock and the load address are what an outsider knows least.
            auto const ticks = std::chrono::high_resolution_clock::now().time_since_epoch().count();
            return {static_cast<std::uint64_t>(ticks), reinterpret_cast<std::uint64_t>(&drawKey)};
        }
    }

    struct SipState {
        std::uint64_t v0, v1, v2, v3;

        void round() noexcept
        {
            v0 += v1;
            v1 = std::rotl(v1, 13) ^ v0;
            v0 = std::rotl(v0, 32);
            v2 += v3;
            v3 = std::rotl(v3, 16) ^ v2;
            v0 += v3;
            v3 = std::rotl(v3, 21) ^ v0;
            v2 += v1;
            v1 = std::rotl(v1, 17) ^ v2;
            v2 = std::rotl(v2, 32);
        }

        void absorb(std::uint64_t word) noexcept
        {
            v3 ^= word;
            round();
            v0 ^= word;
        }
    };

} // namespace

std::uint64_t seededHash(std::string_view text) noexcept
{
    static Key const key = drawKey();
    SipState state{key.low ^ 0x736f6d6570736575, key.high ^ 0x646f72616e646f6d, key.low ^ 0x6c7967656e657261,
                   key.high ^ 0x7465646279746573};
    char const* byte = text.data();
    std::size_t rest = text.size();
    for (; rest >= 8; byte += 8, rest -= 8) {
        std::uint64_t word;
        std::memcpy(&word, byte, 8);
        state.absorb(word);
    }
    std::uint64_t last = 0;
    if (rest != 0)
        std::memcpy(&last, byte, rest);
    state.absorb(last | std::uint64_t(text.size()) << 56);
    state.v2 ^= 0xff;
    state.round();
    state.round();
    state.round();
    return state.v0 ^ state.v1 ^ state.v2 ^ state.v3;
}

} // namespace Nexil::Internal
