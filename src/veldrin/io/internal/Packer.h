#pragma once

#include <veldrin/io/internal/ByteSink.h>
#include <veldrin/io/internal/Msgpack.h>

#include <bit>
#include <cstdint>

namespace Veldrin::IO {

/// The MessagePack library's packer onto a sink.
class Packer : public msgpack::packer<ByteSink> {
public:
    explicit Packer(ByteSink& sink) : msgpack::packer<ByteSink>(sink), sink_(sink) {}

    // The library's own pack_float and pack_double turn whole numbers into integers; a stream keeps them what they are.
    void packFloat(float value) { packBits(0xCA, std::bit_cast<std::uint32_t>(value)); }
    void packDouble(double value) { packBits(0xCB, std::bit_cast<std::uint64_t>(value)); }

private:
    template <class Bits>
    void packBits(unsigned char kind, Bits bits)
    {
        char bytes[1 + sizeof(Bits)] = {static_cast<char>(kind)};
        for (std::size_t i = sizeof(Bits); i >= 1; --i) {
            bytes[i] = static_cast<char>(bits & 0xFF);
            bits = static_cast<Bits>(bits >> 8);
        }
        sink_.write(bytes, sizeof(bytes));
    }

    ByteSink& sink_;
};

} // namespace Veldrin::IO
