#include "TagTable.h"

#include <veldrin/geometry/GeoProperties.h>
#include <veldrin/tags/TagData.h>

#include <fmt/format.h>

#include <algorithm>
#include <numeric>

namespace Zon {

namespace {

    // Names from files may be of any length; what tells names apart stands near their beginnings.
    constexpr std::size_t kMostCompared = 64;
    constexpr std::size_t kMostNearest = 3;

    /// How many characters to insert, remove or replace to get from one text to the other.
    /// (V. Levenshtein, Binary codes capable of correcting deletions, insertions and reversals, 1966.)
    std::size_t editDistance(std::string_view from, std::string_view to)
    {
        from = from.substr(0, kMostCompared);
        to = to.substr(0, kMostCompared);
        std::vector<std::size_t> row(to.size() + 1);
        std::iota(row.begin(), row.end(), std::size_t(0));
        for (char const character : from) {
            std::size_t diagonal = row[0]++;
            for (std::size_t i = 0; i < to.size(); ++i) {
                std::size_t const replaced = diagonal + (character == to[i] ? 0 : 1);
                diagonal = row[i + 1];
                row[i + 1] = std::min({replaced, row[i] + 1, row[i + 1] + 1});
            }
        }
        return row.back();
    }

    /// A full name without what `createTagName` puts around the name given to it.
    std::string_view givenName(Tag const& tag)
    {
        std::string_view name = tag.name;
        auto const stem = std::string_view(tag.component).substr(0, tag.component.rfind('_') + 1);
        std::string_view const suffix = Veldrin::Geometry::sComponentTagSuffix;
        if (name.starts_with(stem))
            name.remove_prefix(stem.size());
        if (name.ends_with(suffix))
            name.remove_suffix(suffix.size());
        return name;
    }

} // namespace

std::vector<Tag> tagsOf(Veldrin::Object const& object)
{
    std::vector<Tag> tags;
    Nexil::Ptr<Nexil::Array<bool>> mask;
    Nexil::String component;
    for (auto const& name : object.keys())
        if (Veldrin::Geometry::getTagData(object, name, mask, component))
            tags.push_back({std::string(name.view()), std::string(component.view()), mask});
    return tags;
}

std::uint64_t countSelected(Nexil::Array<bool> const& mask)
{
    return static_cast<std::uint64_t>(std::count(mask.begin(), mask.end(), true));
}

std::string shareText(std::uint64_t selected, std::uint64_t elements)
{
    if (elements == 0)
        return "-";
    return fmt::format("{:.1f} %", 100 * static_cast<double>(selected) / static_cast<double>(elements));
}

std::vector<std::string> nearestNames(std::string_view name, std::vector<Tag> const& tags)
{
    std::vector<std::pair<std::size_t, std::string>> byDistance;
    for (auto const& tag : tags)
        byDistance.emplace_back(std::min(editDistance(name, tag.name), editDistance(name, givenName(tag))), tag.name);
    std::ranges::stable_sort(byDistance, {}, [](auto const& entry) { return entry.first; });
    std::vector<std::string> nearest;
    for (std::size_t i = 0; i < std::min(kMostNearest, byDistance.size()); ++i)
        nearest.push_back(std::move(byDistance[i].second));
    return nearest;
}

} // namespace Zon
