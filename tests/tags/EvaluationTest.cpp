#include "Tables.h"
#include "TagSample.h"

#include <veldrin/tags/TagData.h>
#include <veldrin/tags/TagResolver.h>

#include <gtest/gtest.h>

#include <random>
#include <regex>
#include <sstream>

namespace {

using namespace Veldrin;
using namespace Veldrin::Geometry;

std::string orEmpty(std::string const& word)
{
    return word == "-" ? "" : word;
}

/// "COMPONENT FLAGS" as the tables say it.
std::string answerTo(std::string const& expression, Object const& geometry)
{
    TagResolver resolver;
    if (auto const status = resolver.parses(Nexil::String(std::string_view(expression))); !status)
        return status.message.c_str();
    Nexil::String component;
    auto const flags = flagsOf(resolver.resolve(geometry, component));
    if (component.empty())
        return flags.empty() ? "nothing" : "flags without a component";
    return component.c_str() + (" " + (flags.empty() ? "-" : flags));
}

TagSample::Tag tagFrom(std::istringstream& words)
{
    TagSample::Tag tag;
    words >> tag.name >> tag.component >> tag.flags;
    tag.component = orEmpty(tag.component);
    if (tag.flags.starts_with('='))
        tag.sameAs = tag.flags.substr(1);
    else
        tag.flags = orEmpty(tag.flags);
    return tag;
}

std::vector<unsigned int> numbersFrom(std::string text)
{
    std::vector<unsigned int> numbers;
    std::ranges::replace(text, ',', ' ');
    std::istringstream words(text);
    for (unsigned int number = 0; words >> number;)
        numbers.push_back(number);
    return numbers;
}

/// The masks of all tags: where they are and what they hold.
std::vector<std::pair<bool const*, std::string>> masksIn(Object const& geometry)
{
    std::vector<std::pair<bool const*, std::string>> masks;
    for (auto const& key : geometry.keys())
        if (auto const mask = support::arrayIn<bool>(geometry, key.c_str()))
            masks.emplace_back(mask->data(), flagsOf(mask));
    return masks;
}

TEST(TagEvaluation, ExpressionsSelectWhatTheTableSays)
{
    TagSample sample;
    Nexil::Ptr<Object> geometry;
    std::string expression;
    for (auto const& line : tables::lines("evaluation.txt")) {
        std::istringstream words(line);
        std::string word;
        words >> word;
        if (word == "geometry") {
            sample = {};
            geometry = nullptr;
        } else if (word == "points") {
            words >> sample.pointCount;
        } else if (word == "faces") {
            while (words >> word)
                sample.faces.push_back(numbersFrom(orEmpty(word)));
        } else if (word == "strands") {
            for (unsigned int size = 0; words >> size;)
                sample.strandSizes.push_back(size);
        } else if (word == "tag") {
            sample.tags.push_back(tagFrom(words));
        } else if (word == "expression") {
            expression = line.substr(word.size() + 1);
        } else {
            if (!geometry)
                geometry = sample.build();
            auto const before = masksIn(*geometry);
            EXPECT_EQ("  " + answerTo(expression, *geometry), line) << expression;
            EXPECT_EQ(masksIn(*geometry), before) << expression;
        }
    }
}

TEST(TagEvaluation, ASingleTagIsHandedOutAsItIsStored)
{
    auto const geometry = TagSample{2, {}, {}, {{"a", "point_component", "10"}}}.build();
    TagResolver resolver;
    Nexil::String component;
    for (char const* text : {"a", "(a)", "v(a)", "a + missing", "missing ^ a", "a*"}) {
        EXPECT_TRUE(resolver.parses(text));
        EXPECT_EQ(resolver.resolve(*geometry, component), support::arrayIn<bool>(*geometry, "a")) << text;
    }
}

TEST(TagEvaluation, PatternsMatchAsTheRegularExpressionDoes)
{
    std::mt19937 random(7);
    auto const textOf = [&](std::string const& characters) {
        std::string text(1 + random() % 9, ' ');
        for (char& character : text)
            character = characters[random() % characters.size()];
        return text;
    };
    for (int round = 0; round < 60; ++round) {
        // Few characters, so that much matches; dots and line ends, which a regular expression takes in its own way.
        TagSample sample{60, {}, {}, {}};
        for (std::size_t i = 0; i < sample.pointCount; ++i) {
            std::string flags(sample.pointCount, '0');
            flags[i] = '1';
            auto name = textOf(round % 3 == 0 ? std::string("ab.\n\r\0\xff", 7) : "ab.");
            if (std::ranges::none_of(sample.tags, [&](auto const& tag) { return tag.name == name; }))
                sample.tags.push_back({std::move(name), "point_component", std::move(flags)});
        }
        auto const geometry = sample.build();
        for (int i = 0; i < 40; ++i) {
            auto const pattern = textOf("a*b*.") + "*a" + (i % 2 == 0 ? textOf("ab.*") : "");
            std::regex const expression(
                std::regex_replace(std::regex_replace(pattern, std::regex("\\."), "\\."), std::regex("\\*"), ".*"));
            std::string expected(sample.pointCount, '0');
            for (auto const& tag : sample.tags)
                if (std::regex_match(tag.name, expression))
                    expected[tag.flags.find('1')] = '1';
            bool const hasMatch = expected.find('1') != std::string::npos;
            EXPECT_EQ(answerTo(pattern, *geometry), hasMatch ? "point_component " + expected : "nothing") << pattern;
        }
    }
}

TEST(TagEvaluation, LongNamesAndManyStarsTakeNoLongerThanTheirLength)
{
    std::string const name(1'000'000, 'a');
    auto const geometry = TagSample{1, {}, {}, {{name, "point_component", "1"}}}.build();
    std::string stars;
    for (int i = 0; i < 50'000; ++i)
        stars += "*a";
    auto const half = name.substr(0, name.size() / 2);
    EXPECT_EQ(answerTo(stars, *geometry), "point_component 1");
    EXPECT_EQ(answerTo(stars + "b*", *geometry), "nothing");
    EXPECT_EQ(answerTo("*" + half + "*", *geometry), "point_component 1");
    EXPECT_EQ(answerTo("*" + half + "b*", *geometry), "nothing");
}

} // namespace
