#pragma once

#include <nexil/Export.h>
#include <nexil/String.h>

namespace VLD::Utils {

/// Patterns over channel names: '*' stands for any run of characters, '?' for exactly one; anything else for itself.
///
///     ChannelParser parser;
///     if (parser.parses("voxel_fuel*"))
///         parser.accepts("voxel_fuel_ethane"); // true
///
/// There are no separators and no escapes; a name equal to the whole pattern always matches. "Character" is a byte.
class VELDRIN_PLATFORM_API ChannelParser {
public:
    /// Takes the pattern; false only for the empty one, and the parser then accepts nothing.
    bool parses(Nexil::String const& pattern);

    /// True when the name matches; false before a successful `parses`.
    /// Cost: at most the name's length times the pattern's; no recursion, no memory.
    [[nodiscard]] bool accepts(Nexil::String const& name) const;

private:
    Nexil::String pattern_;
};

} // namespace VLD::Utils
