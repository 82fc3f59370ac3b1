#include <vld/ChannelParser.h>

#include <string_view>

namespace VLD::Utils {

namespace {

    // On a mismatch only the latest star needs to take one character more: what an earlier star could take instead, the
    // latest one can take as well.
    bool matchesGlob(std::string_view name, std::string_view pattern)
    {
        constexpr auto kNone = std::string_view::npos;
        std::size_t n = 0;
        std::size_t p = 0;
        std::size_t star = kNone;
        std::size_t nameAtStar = 0;
        while (n < name.size()) {
            if (p < pattern.size() && pattern[p] == '*') {
                star = p++;
                nameAtStar = n;
            } else if (p < pattern.size() && (pattern[p] == '?' || pattern[p] == name[n])) {
                ++p;
                ++n;
            } else if (star != kNone) {
                p = star + 1;
                n = ++nameAtStar;
            } else {
                return false;
            }
        }
        while (p < pattern.size() && pattern[p] == '*')
            ++p;
        return p == pattern.size();
    }

} // namespace

bool ChannelParser::parses(Nexil::String const& pattern)
{
    pattern_ = pattern;
    return !pattern_.empty();
}

bool ChannelParser::accepts(Nexil::String const& name) const
{
    return !pattern_.empty() && (name == pattern_ || matchesGlob(name.view(), pattern_.view()));
}

} // namespace VLD::Utils
