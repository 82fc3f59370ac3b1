#include <vld/ChannelParser.h>

#include <gtest/gtest.h>

#include <algorithm>
#include <regex>
#include <string>
#include <vector>

namespace {

using VLD::Utils::ChannelParser;

std::vector<std::string> wordsUpTo(std::size_t length, std::string const& letters)
{
    std::vector<std::string> words{""};
    for (std::size_t first = 0, round = 0; round < length; ++round) {
        std::size_t const last = words.size();
        for (; first < last; ++first)
            for (char letter : letters)
                words.push_back(words[first] + letter);
    }
    return words;
}

std::regex regexOf(std::string const& pattern)
{
    std::string text;
    for (char c : pattern)
        text += c == '*' ? "[^]*" : c == '?' ? "[^]" : c == '.' || c == '[' ? std::string("\\") + c : std::string(1, c);
    return std::regex(text);
}

TEST(ChannelParser, AcceptsWhatTheEqualRegularExpressionAccepts)
{
    auto const names = wordsUpTo(3, "ab.[\n");
    // From the longest to the empty one, each in the place of the one before.
    auto patterns = wordsUpTo(4, "a.*?[");
    std::reverse(patterns.begin(), patterns.end());
    ChannelParser parser;
    EXPECT_FALSE(parser.accepts("a"));
    for (std::string const& pattern : patterns) {
        ASSERT_EQ(parser.parses(pattern.c_str()), !pattern.empty());
        auto const regex = regexOf(pattern);
        for (std::string const& name : names)
            ASSERT_EQ(parser.accepts(name.c_str()), !pattern.empty() && std::regex_match(name, regex))
                << "'" << pattern << "' on '" << name << "'";
    }
}

TEST(ChannelParser, ManyStarsAgainstALongNameEnd)
{
    std::string stars;
    for (int i = 0; i < 40; ++i)
        stars += "*a";
    std::string const name(50000, 'a');
    ChannelParser parser;
    parser.parses(stars.c_str());
    EXPECT_TRUE(parser.accepts(name.c_str()));
    parser.parses((stars + "b").c_str());
    EXPECT_FALSE(parser.accepts(name.c_str()));
}

} // namespace
