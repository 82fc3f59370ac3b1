#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>

namespace Veldrin::IO {

/// XXH3 64-bit (Yann Collet, xxHash), over bytes that come in pieces.
class Hash {
public:
    Hash();
    ~Hash();
    Hash(Hash const&) = delete;
    Hash& operator=(Hash const&) = delete;

    void restart(std::uint64_t seed) noexcept;
    void add(void const* bytes, std::size_t byteCount) noexcept;
    [[nodiscard]] std::uint64_t digest() const noexcept;

private:
    struct State;
    std::unique_ptr<State> state_;
};

} // namespace Veldrin::IO
