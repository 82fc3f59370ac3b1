#pragma once

#include <nexil/Array.h>
#include <nexil/DefaultClass.h>
#include <nexil/Export.h>
#include <nexil/SerializationData.h>

#include <cstdint>

/// Animation curves: one number over time.
///
///     Math::FCurve curve;
///     curve.setKey({.time = 0, .value = 1, .interpolation = Math::FCurve::Interpolation::Linear});
///     curve.setKey({.time = 2, .value = 5});
///     curve.evaluate(1); // 3
namespace Veldrin::Math {

/// A piecewise curve through keys in increasing time.
///
/// Times and values are doubles in the unit of the caller's choice (seconds or frames).
/// Threads: reading from many threads at once is safe.
class VELDRIN_PLATFORM_API FCurve {
public:
    /// How the curve runs from a key to the next one; the numbers are stored in files.
    enum class Interpolation : unsigned int {
        Constant = 0, ///< stays at the key's value
        Linear = 1,   ///< straight line
        Bezier = 2,   ///< cubic through the two keys' tangent ends
    };

    /// How the curve runs before its first and behind its last key; the numbers are stored in files.
    enum class Extrapolation : unsigned int {
        Constant = 0,    ///< the end key's value
        Linear = 1,      ///< straight on with the slope at the end key
        Cycle = 2,       ///< repeats
        CycleOffset = 3, ///< repeats, each round starting where the one before ended
        Oscillate = 4,   ///< repeats, every second round backwards
    };

    /// End of a tangent, relative to its key.
    struct Tangent {
        double time = 0;
        double value = 0;
        friend bool operator==(Tangent const&, Tangent const&) = default;
    };

    struct Key {
        double time = 0;
        double value = 0;
        Tangent in{};  ///< towards the previous key: time <= 0
        Tangent out{}; ///< towards the next key: time >= 0
        Interpolation interpolation = Interpolation::Linear;
        friend bool operator==(Key const&, Key const&) = default;
    };

    FCurve();
    FCurve(FCurve const&);
    FCurve(FCurve&&) noexcept;
    FCurve& operator=(FCurve const&);
    FCurve& operator=(FCurve&&) noexcept;
    ~FCurve();

    /// Inserts the key at its place in time, replacing one at exactly the same time. False, and the curve unchanged,
    /// when its time is not finite. Cost: linear in the keys behind it, constant at the end.
    bool setKey(Key const& key);
    /// Removes the key at `index`; false when there is none.
    bool eraseKey(std::uint64_t index);

    [[nodiscard]] Nexil::Array<Key> const& keys() const noexcept { return keys_; }

    [[nodiscard]] Extrapolation preExtrapolation() const noexcept { return preExtrapolation_; }
    [[nodiscard]] Extrapolation postExtrapolation() const noexcept { return postExtrapolation_; }
    void setPreExtrapolation(Extrapolation mode) noexcept { preExtrapolation_ = mode; }
    void setPostExtrapolation(Extrapolation mode) noexcept { postExtrapolation_ = mode; }

    /// The curve's value at `time`; 0 without keys, the key's value with one. A time that is no number reads as the first
    /// key's, and one too far away to have a place in a round as the end key's.
    ///
    /// Within a Bezier segment tangent times are clamped to the segment, so that the curve stays a function of time.
    /// Cost: logarithmic in the number of keys.
    [[nodiscard]] double evaluate(double time) const noexcept;

    /// Equal keys, bit for bit in meaning (a NaN value equals nothing), and equal extrapolation.
    friend bool operator==(FCurve const& a, FCurve const& b)
    {
        return a.preExtrapolation_ == b.preExtrapolation_ && a.postExtrapolation_ == b.postExtrapolation_ &&
               a.keys_ == b.keys_;
    }

private:
    [[nodiscard]] double evaluateInside(double time) const noexcept;
    [[nodiscard]] double evaluateOutside(double time, bool isBefore) const noexcept;

    Nexil::Array<Key> keys_;
    Extrapolation preExtrapolation_ = Extrapolation::Constant;
    Extrapolation postExtrapolation_ = Extrapolation::Constant;
};

} // namespace Veldrin::Math

namespace Nexil {

/// Describes the curve as a composite: "pre_extrapolation", "post_extrapolation" and "keys", a sequence of composites
/// "time", "value", "in_tangent", "out_tangent" (sequences of time and value) and "interpolation".
VELDRIN_PLATFORM_API void serializeFCurve(Veldrin::Math::FCurve const& curve, SerializationData& data);

/// Rebuilds a curve from `serializeFCurve`'s tree: equal to the one it was made from. False, and `curve` untouched, when
/// something is missing, of the wrong kind, an unknown mode, or when key times do not increase.
VELDRIN_PLATFORM_API bool deserializeFCurve(SerializationData const& data, Veldrin::Math::FCurve& curve);

template <>
VELDRIN_PLATFORM_API Ptr<Veldrin::Math::FCurve> const& Internal::getDefaultClass<Veldrin::Math::FCurve>();

} // namespace Nexil
