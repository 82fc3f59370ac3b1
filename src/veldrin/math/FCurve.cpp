#include <veldrin/math/FCurve.h>

#include <algorithm>
#include <cmath>

namespace Veldrin::Math {

namespace {

    // The control points between two keys. Times are fractions of the segment, so that keys far from time 0 lose no
    // precision; since both inner ones lie within 0 and 1, time grows with the parameter even where they cross.
    struct BezierSegment {
        double t1, t2;
        double v0, v1, v2, v3;
    };

    double bezier(double a, double b, double c, double d, double u) noexcept
    {
        double const w = 1 - u;
        return w * w * w * a + 3 * w * w * u * b + 3 * w * u * u * c + u * u * u * d;
    }

    BezierSegment bezierSegment(FCurve::Key const& from, FCurve::Key const& to) noexcept
    {
        double const span = to.time - from.time;
        auto const fraction = [span](double time) { return time > 0 ? std::min(time / span, 1.0) : 0.0; };
        return {fraction(from.out.time),     1 - fraction(-to.in.time), from.value,
                from.value + from.out.value, to.value + to.in.value,    to.value};
    }

    double evaluateBezier(BezierSegment const& s, double fraction) noexcept
    {
        // Halving finds the parameter to the last bit whatever the tangents are.
        double low = 0;
        double high = 1;
        for (;;) {
            double const middle = low + (high - low) / 2;
            if (middle <= low || middle >= high)
                break;
            (bezier(0, s.t1, s.t2, 1, middle) <= fraction ? low : high) = middle;
        }
        return bezier(s.v0, s.v1, s.v2, s.v3, low);
    }

    double evaluateSegment(FCurve::Key const& from, FCurve::Key const& to, double time) noexcept
    {
        // A key's own value comes back exactly, next to an infinite one too.
        if (time == from.time)
            return from.value;
        double const span = to.time - from.time;
        // Halves keep keys at both ends of the range of numbers apart.
        double const fraction = std::isfinite(span) ? (time - from.time) / span
                                                    : (time / 2 - from.time / 2) / (to.time / 2 - from.time / 2);
        switch (from.interpolation) {
        case FCurve::Interpolation::Constant: return from.value;
        case FCurve::Interpolation::Linear: return from.value + (to.value - from.value) * fraction;
        case FCurve::Interpolation::Bezier: return evaluateBezier(bezierSegment(from, to), fraction);
        }
        return from.value;
    }

    // The slope at a key points to the first control point that lies at another time.
    double slopeAtStart(FCurve::Key const& from, FCurve::Key const& to) noexcept
    {
        double const span = to.time - from.time;
        if (from.interpolation == FCurve::Interpolation::Constant)
            return 0;
        if (from.interpolation == FCurve::Interpolation::Bezier) {
            auto const s = bezierSegment(from, to);
            if (s.t1 > 0)
                return (s.v1 - s.v0) / (s.t1 * span);
            if (s.t2 > 0)
                return (s.v2 - s.v0) / (s.t2 * span);
        }
        return (to.value - from.value) / span;
    }

    double slopeAtEnd(FCurve::Key const& from, FCurve::Key const& to) noexcept
    {
        double const span = to.time - from.time;
        if (from.interpolation == FCurve::Interpolation::Constant)
            return 0;
        if (from.interpolation == FCurve::Interpolation::Bezier) {
            auto const s = bezierSegment(from, to);
            if (s.t2 < 1)
                return (s.v3 - s.v2) / ((1 - s.t2) * span);
            if (s.t1 < 1)
                return (s.v3 - s.v1) / ((1 - s.t1) * span);
        }
        return (to.value - from.value) / span;
    }

} // namespace

FCurve::FCurve() = default;
FCurve::FCurve(FCurve const&) = default;
FCurve::FCurve(FCurve&&) noexcept = default;
FCurve& FCurve::operator=(FCurve const&) = default;
FCurve& FCurve::operator=(FCurve&&) noexcept = default;
FCurve::~FCurve() = default;

bool FCurve::setKey(Key const& key)
{
    if (!std::isfinite(key.time))
        return false;
    auto* const place = std::lower_bound(keys_.begin(), keys_.end(), key.time,
                                         [](Key const& present, double time) { return present.time < time; });
    if (place != keys_.end() && place->time == key.time) {
        *place = key;
        return true;
    }
    auto const index = place - keys_.begin();
    keys_.push_back(key);
    std::rotate(keys_.begin() + index, keys_.end() - 1, keys_.end());
    return true;
}

bool FCurve::eraseKey(std::uint64_t index)
{
    if (index >= keys_.size())
        return false;
    std::move(keys_.begin() + index + 1, keys_.end(), keys_.begin() + index);
    keys_.resize(keys_.size() - 1);
    return true;
}

double FCurve::evaluate(double time) const noexcept
{
    if (keys_.empty())
        return 0;
    Key const& first = keys_[0];
    Key const& last = keys_[keys_.size() - 1];
    if (keys_.size() == 1 || std::isnan(time))
        return first.value;
    if (time < first.time)
        return evaluateOutside(time, true);
    if (time > last.time)
        return evaluateOutside(time, false);
    return evaluateInside(time);
}

double FCurve::evaluateInside(double time) const noexcept
{
    auto const* const next =
        std::upper_bound(keys_.begin(), keys_.end(), time, [](double t, Key const& key) { return t < key.time; });
    if (next == keys_.begin())
        return keys_[0].value;
    if (next == keys_.end())
        return keys_[keys_.size() - 1].value;
    return evaluateSegment(*(next - 1), *next, time);
}

double FCurve::evaluateOutside(double time, bool isBefore) const noexcept
{
    Key const& first = keys_[0];
    Key const& last = keys_[keys_.size() - 1];
    Key const& end = isBefore ? first : last;
    auto const mode = isBefore ? preExtrapolation_ : postExtrapolation_;
    if (mode == Extrapolation::Constant)
        return end.value;
    if (mode == Extrapolation::Linear) {
        double const rate = isBefore ? slopeAtStart(first, keys_[1]) : slopeAtEnd(keys_[keys_.size() - 2], last);
        return rate == 0 ? end.value : end.value + rate * (time - end.time);
    }
    double const span = last.time - first.time;
    double const rounds = std::floor((time - first.time) / span);
    if (!std::isfinite(rounds * span))
        return end.value;
    double const phase = std::clamp(time - rounds * span, first.time, last.time);
    switch (mode) {
    case Extrapolation::Constant:
    case Extrapolation::Linear: break;
    case Extrapolation::Cycle: return evaluateInside(phase);
    case Extrapolation::CycleOffset: return evaluateInside(phase) + rounds * (last.value - first.value);
    case Extrapolation::Oscillate:
        return evaluateInside(std::fmod(rounds, 2) == 0 ? phase : first.time + (last.time - phase));
    }
    return end.value;
}

} // namespace Veldrin::Math

namespace Nexil {

namespace {

    using Veldrin::Math::FCurve;

    SequenceSerializationData describeTangent(FCurve::Tangent const& tangent)
    {
        SequenceSerializationData pair;
        pair.push_back(tangent.time);
        pair.push_back(tangent.value);
        return pair;
    }

    bool readNumber(SerializationData const* data, double& number)
    {
        auto const* literal = data ? data->asLiteral() : nullptr;
        if (!literal || literal->isNothing())
            return false;
        number = literal->asDouble();
        return true;
    }

    bool readTangent(SerializationData const* data, FCurve::Tangent& tangent)
    {
        auto const* pair = data ? data->asSequence() : nullptr;
        return pair && pair->size() == 2 && readNumber(pair->begin(), tangent.time) &&
               readNumber(pair->begin() + 1, tangent.value);
    }

    template <class Mode>
    bool readMode(SerializationData const* data, Mode last, Mode& mode)
    {
        auto const* literal = data ? data->asLiteral() : nullptr;
        if (!literal || !literal->isInt() || literal->asInt() > static_cast<unsigned int>(last))
            return false;
        mode = static_cast<Mode>(literal->asInt());
        return true;
    }

    bool readKey(SerializationData const& data, FCurve::Key& key)
    {
        auto const* fields = data.asComposite();
        return fields && readNumber(fields->find("time"), key.time) && readNumber(fields->find("value"), key.value) &&
               readTangent(fields->find("in_tangent"), key.in) && readTangent(fields->find("out_tangent"), key.out) &&
               readMode(fields->find("interpolation"), FCurve::Interpolation::Bezier, key.interpolation);
    }

} // namespace

void serializeFCurve(FCurve const& curve, SerializationData& data)
{
    SequenceSerializationData keys;
    for (FCurve::Key const& key : curve.keys()) {
        CompositeSerializationData fields;
        fields["time"] = key.time;
        fields["value"] = key.value;
        fields["in_tangent"] = describeTangent(key.in);
        fields["out_tangent"] = describeTangent(key.out);
        fields["interpolation"] = static_cast<unsigned int>(key.interpolation);
        keys.push_back(std::move(fields));
    }
    CompositeSerializationData tree;
    tree["pre_extrapolation"] = static_cast<unsigned int>(curve.preExtrapolation());
    tree["post_extrapolation"] = static_cast<unsigned int>(curve.postExtrapolation());
    tree["keys"] = std::move(keys);
    data = std::move(tree);
}

bool deserializeFCurve(SerializationData const& data, FCurve& curve)
{
    auto const* tree = data.asComposite();
    auto const* keysNode = tree ? tree->find("keys") : nullptr;
    auto const* keys = keysNode ? keysNode->asSequence() : nullptr;
    FCurve::Extrapolation before{};
    FCurve::Extrapolation after{};
    if (!keys || !readMode(tree->find("pre_extrapolation"), FCurve::Extrapolation::Oscillate, before) ||
        !readMode(tree->find("post_extrapolation"), FCurve::Extrapolation::Oscillate, after))
        return false;
    FCurve result;
    result.setPreExtrapolation(before);
    result.setPostExtrapolation(after);
    for (SerializationData const& node : *keys) {
        FCurve::Key key;
        bool const isBehindLast =
            readKey(node, key) && (result.keys().empty() || result.keys()[result.keys().size() - 1].time < key.time);
        if (!isBehindLast || !result.setKey(key))
            return false;
    }
    curve = std::move(result);
    return true;
}

template <>
Ptr<FCurve> const& Internal::getDefaultClass<FCurve>()
{
    static Ptr<FCurve> const instance = makePtr<FCurve>();
    return instance;
}

} // namespace Nexil
