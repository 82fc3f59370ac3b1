#pragma once

#include <nexil/Array.h>
#include <nexil/Ptr.h>

#include <cstddef>
#include <cstdint>
#include <limits>
#include <string_view>

/// Numbers for fuzz drivers, taken one byte each from the input, so that mutations of bytes are mutations of numbers.
namespace fuzz {

class InputBytes {
public:
    InputBytes(std::uint8_t const* data, std::size_t size) : data_(data), size_(size) {}

    /// 0 behind the end.
    std::uint8_t byte()
    {
        if (size_ == 0)
            return 0;
        --size_;
        return *data_++;
    }

    /// Mostly as it is; the largest values and powers of two besides.
    unsigned int index()
    {
        unsigned int const b = byte();
        return b < 224 ? b : b < 240 ? 0xFFFFFFFFu - (b - 224) : 1u << (b - 224);
    }

    /// Mostly near `expected`.
    unsigned int count(std::uint64_t expected)
    {
        unsigned int const b = byte();
        if (b < 128)
            return static_cast<unsigned int>(expected);
        if (b < 160)
            return static_cast<unsigned int>(expected) + (b - 144);
        return b < 224 ? b - 160 : b < 232 ? 0xFFFFFFFFu - (b - 224) : 1u << (b - 224);
    }

    float number()
    {
        using Limits = std::numeric_limits<float>;
        constexpr float kSpecial[] = {Limits::quiet_NaN(), Limits::infinity(), -Limits::infinity(),  Limits::max(),
                                      Limits::lowest(),    Limits::min(),      Limits::denorm_min(), -0.0f};
        unsigned int const b = byte();
        return b < 240 ? static_cast<float>(static_cast<int>(b) - 120) * 0.25f : kSpecial[b % 8];
    }

    /// An array of a length and so many values of read().
    template <class Read>
    auto array(Read const& read)
    {
        using T = decltype(read());
        Nexil::Array<T> values;
        unsigned int const length = byte();
        for (unsigned int i = 0; i < length && size_ > 0; ++i)
            values.push_back(read());
        return Nexil::makePtr<Nexil::Array<T>>(std::move(values));
    }

    /// What is left.
    [[nodiscard]] std::string_view rest() const { return {reinterpret_cast<char const*>(data_), size_}; }

private:
    std::uint8_t const* data_;
    std::size_t size_;
};

} // namespace fuzz
