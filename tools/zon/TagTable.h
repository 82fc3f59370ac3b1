#pragma once

#include <veldrin/object/Object.h>

#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

/// The tags that objects carry, for the subcommands that show and make them.
namespace Zon {

struct Tag {
    std::string name; ///< the full name
    std::string component;
    Nexil::Ptr<Nexil::Array<bool>> mask;
};

/// All tags of an object, in its order. Looks at no flag.
[[nodiscard]] std::vector<Tag> tagsOf(Veldrin::Object const& object);

/// How many flags are set.
[[nodiscard]] std::uint64_t countSelected(Nexil::Array<bool> const& mask);

/// "50.0 %"; "-" of no elements.
[[nodiscard]] std::string shareText(std::uint64_t selected, std::uint64_t elements);

/// Up to three of the tags' names, the likest to `name` first, by the number of characters to change. What a full name
/// has around the name that the user gave it does not count.
[[nodiscard]] std::vector<std::string> nearestNames(std::string_view name, std::vector<Tag> const& tags);

} // namespace Zon
