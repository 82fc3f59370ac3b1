#include "Tables.h"

#include <veldrin/tags/TagParser.h>
#include <veldrin/tags/TagResolver.h>

#include <gtest/gtest.h>

#include <sstream>

namespace {

using namespace VLD::Utils::Internal;
using Veldrin::Geometry::TagResolver;

std::string dumpOf(std::string const& text)
{
    std::ostringstream stream;
    parseTagExpression(text)->dump(stream);
    return stream.str();
}

std::string repeated(std::string const& text, int count)
{
    std::string result;
    for (int i = 0; i < count; ++i)
        result += text;
    return result;
}

TEST(TagLanguage, TextsGiveTheirTreesAsTheDumpWritesThem)
{
    auto const lines = tables::lines("trees.txt");
    for (std::size_t i = 0; i + 1 < lines.size(); i += 2) {
        auto const text = tables::unescaped(lines[i]);
        EXPECT_EQ("    " + dumpOf(text), lines[i + 1]) << lines[i];
        EXPECT_EQ(dumpOf(dumpOf(text)), dumpOf(text)) << lines[i];
    }
    EXPECT_EQ(dumpOf(" ( a+b)-v((c ))^!(-d* - (e -f))"), "a + b - v(c) ^ !(!d* - (e - f))");
}

TEST(TagLanguage, WrongTextsFailWithTheirMessageAtTheirByte)
{
    std::string message;
    for (auto const& line : tables::lines("errors.txt")) {
        if (line.starts_with("message: ")) {
            message = line.substr(9);
            continue;
        }
        auto const bar = line.find('|');
        auto const text = tables::unescaped(line.substr(bar + 1, line.rfind('|') - bar - 1));
        auto const status = TagResolver().parses(Nexil::String(std::string_view(text)));
        EXPECT_FALSE(status) << line;
        EXPECT_EQ(status.message.view(), message) << line;
        EXPECT_EQ(status.byteOffset, std::stoul(line)) << line;
    }
}

TEST(TagLanguage, NestingIsLimitedToAThousand)
{
    struct {
        std::string opening, closing;
    } const rows[] = {{"!", ""}, {"-", ""}, {"(", ")"}, {"v(", ")"}, {"*^(", ")"}, {"a+(*-", ")^b"}};
    for (auto const& [opening, closing] : rows) {
        TagResolver resolver;
        ASSERT_TRUE(resolver.parses((repeated(opening, 1000) + "*" + repeated(closing, 1000)).c_str()));
        Nexil::String component;
        (void)resolver.resolve(*Veldrin::createObject(), component);
        EXPECT_EQ(component, "point_component");
        auto const status = resolver.parses((repeated(opening, 1001) + "*" + repeated(closing, 1001)).c_str());
        EXPECT_EQ(status.message, "Expression Invalid") << opening;
        EXPECT_EQ(status.byteOffset, opening.size() * 1000 + opening.find_first_of("!-("));
    }
    // The depth counts, not the number.
    EXPECT_TRUE(parseTagExpression("a" + repeated(" + (!b - v(c))", 2000)));
}

TEST(TagLanguage, ChainsOfAnyLengthNeedNoStack)
{
    std::string const text = "a0" + repeated(" + a1 - !b ^ (c - d)", 100'000);
    EXPECT_EQ(dumpOf(text), text);
    TagResolver resolver;
    EXPECT_TRUE(resolver.parses(text.c_str()));
    Nexil::String component;
    EXPECT_TRUE(resolver.resolve(*Veldrin::createObject(), component)->empty());
}

TEST(TagLanguage, AResolverKeepsTheLastExpressionThatParsed)
{
    auto const geometry = Veldrin::createObject();
    TagResolver resolver;
    Nexil::String component = "unset";
    EXPECT_FALSE(resolver.parses("a +"));
    EXPECT_EQ(resolver.resolve(*geometry, component), nullptr);
    EXPECT_EQ(component, "unset");
    EXPECT_TRUE(resolver.parses("*"));
    EXPECT_FALSE(resolver.parses("a b"));
    TagResolver const moved = std::move(resolver);
    EXPECT_NE(moved.resolve(*geometry, component), nullptr);
    EXPECT_EQ(component, "point_component");
}

} // namespace
