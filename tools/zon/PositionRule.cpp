#include "PositionRule.h"

#include "Command.h"
#include "Console.h"
#include "TextInput.h"

#include <veldrin/geometry/GeoProperties.h>
#include <veldrin/math/Vector.h>
#include <veldrin/object/Properties.h>

#include <fmt/format.h>

#include <algorithm>
#include <cmath>

namespace Zon {

namespace {

    void skipBlanks(std::string_view text, std::size_t& place)
    {
        while (place < text.size() && (text[place] == ' ' || (text[place] >= '\t' && text[place] <= '\r')))
            ++place;
    }

} // namespace

PositionRule::PositionRule(std::string_view text)
{
    std::size_t place = 0;
    while (true) {
        terms_.push_back(readTerm(text, place));
        skipBlanks(text, place);
        if (place == text.size())
            return;
        if (text[place] != '&')
            failAt("--where", text, place, "expecting '&' or the end");
        ++place;
    }
}

PositionRule::Term PositionRule::readTerm(std::string_view text, std::size_t& place)
{
    static constexpr std::pair<std::string_view, Comparison> kComparisons[] = {
        {"<=", Comparison::LessOrEqual}, {">=", Comparison::GreaterOrEqual},
        {"==", Comparison::Equal},       {"!=", Comparison::NotEqual},
        {"<", Comparison::Less},         {">", Comparison::Greater}};
    Term term{};
    skipBlanks(text, place);
    auto const axis = place < text.size() ? std::string_view("xyz").find(text[place]) : std::string_view::npos;
    if (axis == std::string_view::npos)
        failAt("--where", text, place, "expecting x, y or z");
    term.axis = static_cast<int>(axis);
    skipBlanks(text, ++place);
    auto const* const comparison = std::ranges::find_if(
        kComparisons, [&](auto const& entry) { return text.substr(place).starts_with(entry.first); });
    if (comparison == std::end(kComparisons))
        failAt("--where", text, place, "expecting <, <=, >, >=, == or !=");
    term.comparison = comparison->second;
    place += comparison->first.size();
    skipBlanks(text, place);
    std::size_t const end = std::min(text.find_first_of(" \t\n\v\f\r&", place), text.size());
    auto const number = parseFloat(text.substr(place, end - place));
    if (!number || !std::isfinite(*number))
        failAt("--where", text, place, "expecting a number within the range of float");
    term.number = *number;
    place = end;
    return term;
}

bool PositionRule::holds(Term const& term, float coordinate) noexcept
{
    switch (term.comparison) {
    case Comparison::Less: return coordinate < term.number;
    case Comparison::LessOrEqual: return coordinate <= term.number;
    case Comparison::Greater: return coordinate > term.number;
    case Comparison::GreaterOrEqual: return coordinate >= term.number;
    case Comparison::Equal: return coordinate == term.number;
    case Comparison::NotEqual: break;
    }
    return coordinate != term.number;
}

Nexil::Ptr<Nexil::Array<bool>> PositionRule::select(Veldrin::Object const& geometry) const
{
    using namespace Veldrin;
    auto const property = Geometry::getDataGeoProperty(geometry, Geometry::sPointPosition);
    if (!property)
        return nullptr;
    auto const positions = getPropertyAs<Nexil::Ptr<Nexil::Array<Math::float3>>>(*property, Geometry::sData);
    Nexil::Array<bool> mask;
    mask.resize(Geometry::getElementCount(geometry, Geometry::sPointComp));
    auto const count = positions ? std::min(positions->size(), mask.size()) : 0;
    for (std::uint64_t i = 0; i < count; ++i)
        mask[i] =
            std::ranges::all_of(terms_, [&](Term const& term) { return holds(term, (*positions)[i][term.axis]); });
    return Nexil::makePtr<Nexil::Array<bool>>(std::move(mask));
}

void failAt(std::string_view what, std::string_view text, std::size_t offset, std::string_view message)
{
    // One column per character, however many bytes it takes.
    auto const isFirstByte = [](char byte) { return (static_cast<unsigned char>(byte) & 0xC0) != 0x80; };
    auto const column = std::ranges::count_if(text.substr(0, offset), isFirstByte);
    throw Failure(fmt::format("{}: {}\n    {}\n    {:>{}}", what, message, printable(text), '^', column + 1));
}

} // namespace Zon
