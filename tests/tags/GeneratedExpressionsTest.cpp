#include "TagSample.h"

#include <veldrin/tags/TagParser.h>
#include <veldrin/tags/TagResolver.h>

#include <gtest/gtest.h>

#include <random>
#include <sstream>

namespace {

/// A random expression over tags of points, and what it selects, worked out flag by flag.
struct Generated {
    std::string text, flags;

    Generated(std::mt19937& random, TagSample const& sample, int depth)
    {
        if (depth == 0 || random() % 8 == 0) {
            auto const& tag = sample.tags[random() % sample.tags.size()];
            text = tag.name;
            flags = tag.flags;
            return;
        }
        *this = Generated(random, sample, depth - 1);
        auto const choice = random() % 5;
        if (choice == 3) {
            text = "!(" + text + ")";
            for (char& flag : flags)
                flag = flag == '1' ? '0' : '1';
        } else if (choice == 4) {
            text = "v(" + text + ")";
        } else {
            combine("+-^"[choice], Generated(random, sample, depth - 1));
        }
    }

    void combine(char operation, Generated const& right)
    {
        text = "(" + text + ")" + operation + "(" + right.text + ")";
        for (std::size_t i = 0; i < flags.size(); ++i) {
            bool const a = flags[i] == '1';
            bool const b = right.flags[i] == '1';
            flags[i] = (operation == '+' ? a || b : operation == '-' ? a && !b : a && b) ? '1' : '0';
        }
    }
};

void expectSelected(std::string const& text, Veldrin::Object const& geometry, std::string const& flags)
{
    Veldrin::Geometry::TagResolver resolver;
    ASSERT_TRUE(resolver.parses(Nexil::String(std::string_view(text)))) << text;
    Nexil::String component;
    EXPECT_TRUE(flagsOf(resolver.resolve(geometry, component)) == flags) << text;
    EXPECT_EQ(component, "point_component");
}

void checkExpressions(std::size_t pointCount, int expressionCount, int operandCount)
{
    std::mt19937 random(5);
    TagSample sample;
    sample.pointCount = pointCount;
    for (char const* name : {"a", "b", "c", "d"}) {
        std::string flags(pointCount, '0');
        for (char& flag : flags)
            flag = random() % 3 != 0 ? '1' : '0';
        sample.tags.push_back({name, "point_component", flags});
    }
    sample.tags.push_back({"same", "point_component", sample.tags[0].flags, "a"});
    auto const geometry = sample.build();
    for (int i = 0; i < expressionCount; ++i) {
        Generated expression(random, sample, 5);
        for (int k = 0; k < operandCount; ++k)
            expression.combine("+-^"[k % 3], Generated(random, sample, 2));
        expectSelected(expression.text, *geometry, expression.flags);
        // The dump has fewer parentheses and the same meaning.
        std::ostringstream dump;
        VLD::Utils::Internal::parseTagExpression(expression.text)->dump(dump);
        expectSelected(dump.str(), *geometry, expression.flags);
    }
    for (auto const& tag : sample.tags)
        EXPECT_EQ(flagsOf(support::arrayIn<bool>(*geometry, tag.name.c_str())), tag.flags);
}

TEST(GeneratedExpressions, SelectWhatTheOracleSelectsOnAnyNumberOfThreads)
{
    support::onThreadCounts([] {
        checkExpressions(12, 300, 0);
        checkExpressions(9, 1, 400);
        checkExpressions(150'000, 3, 0);
    });
}

} // namespace
