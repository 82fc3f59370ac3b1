#include <veldrin/io/internal/Hash.h>

// The state is kept by value, which the library allows who is linked statically or builds against one fixed version; it is
// part of the interface of all 0.8 releases.
#define XXH_STATIC_LINKING_ONLY
#include <xxhash.h>
#if defined(__x86_64__)
// Replaces the calls by ones that choose the widest instructions of the machine; the values are the same.
#    include <xxh_x86dispatch.h>
#endif

namespace Veldrin::IO {

struct Hash::State {
    XXH3_state_t xxh3;
};

Hash::Hash() : state_(std::make_unique<State>())
{
    restart(0);
}

Hash::~Hash() = default;

void Hash::restart(std::uint64_t seed) noexcept
{
    XXH3_64bits_reset_withSeed(&state_->xxh3, seed);
}

void Hash::add(void const* bytes, std::size_t byteCount) noexcept
{
    XXH3_64bits_update(&state_->xxh3, bytes, byteCount);
}

std::uint64_t Hash::digest() const noexcept
{
    return XXH3_64bits_digest(&state_->xxh3);
}

} // namespace Veldrin::IO
