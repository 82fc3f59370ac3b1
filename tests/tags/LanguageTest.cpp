#include "Tables.h"
#include "TreeText.h"

#include <veldrin/tags/TagParser.h>
#include <veldrin/tags/TagResolver.h>

#include <gtest/gtest.h>

#include <pthread.h>

#include <memory>
#include <tuple>

namespace {

using namespace trees;

std::string repeated(std::string const& text, int count)
{
    std::string result;
    for (int i = 0; i < count; ++i)
        result += text;
    return result;
}

TEST(TagLanguage, TextsGiveTheirTreesAndTheDumpGivesThemAgain)
{
    auto const lines = tables::lines("trees.txt");
    for (std::size_t i = 0; i + 1 < lines.size(); i += 2) {
        auto const tree = parseTagExpression(tables::unescaped(lines[i]));
        EXPECT_EQ("    " + treeOf(*tree), lines[i + 1]) << lines[i];
        EXPECT_EQ(treeOf(*parseTagExpression(dumpOf(*tree))), treeOf(*tree)) << lines[i];
    }
    EXPECT_EQ(dumpOf(*parseTagExpression(" ( a+b)-v((c ))^!(-d* - (e -f))")), "a + b - v(c) ^ !(!d* - (e - f))");
}

TEST(TagLanguage, WrongTextsFailWithTheirMessageAtTheirByte)
{
    std::string message;
    int count = 0;
    for (auto const& line : tables::lines("errors.txt")) {
        if (line.starts_with("message: ")) {
            message = line.substr(9);
            continue;
        }
        auto const bar = line.find('|');
        auto const text = tables::unescaped(line.substr(bar + 1, line.rfind('|') - bar - 1));
        Veldrin::Geometry::TagResolver resolver;
        auto const status = resolver.parses(Nexil::String(std::string_view(text)));
        EXPECT_FALSE(status) << line;
        EXPECT_EQ(status.message.view(), message) << line;
        EXPECT_EQ(status.byteOffset, std::stoul(line)) << line;
        ++count;
    }
    EXPECT_GE(count, 60);
}

TEST(TagLanguage, NestingIsLimitedToAThousand)
{
    struct Shape {
        char const* opening;
        char const* closing;
    };
    for (auto const& [opening, closing] : {Shape{"!", ""}, Shape{"-", ""}, Shape{"(", ")"}, Shape{"v(", ")"},
                                           Shape{"a+(", ")"}, Shape{"a+(b-", ")^c"}}) {
        auto const nested = [&](int depth) { return repeated(opening, depth) + "a" + repeated(closing, depth); };
        auto const tree = parseTagExpression(nested(1000));
        EXPECT_EQ(treeOf(*parseTagExpression(dumpOf(*tree))), treeOf(*tree));
        auto const status = Veldrin::Geometry::TagResolver().parses(nested(1001).c_str());
        EXPECT_EQ(status.message, "Expression Invalid") << opening;
        EXPECT_EQ(status.byteOffset,
                  std::string_view(opening).size() * 1000 + std::string_view(opening).find_first_of("!-("));
    }
    // The depth counts, not the number.
    EXPECT_TRUE(parseTagExpression("a" + repeated(" + (!b - v(c))", 2000)));
}

/// Runs `work` on a thread with a stack of 1 MiB, or more where code is not optimised.
void onSmallStack(void (*work)())
{
#if defined(NDEBUG)
    constexpr std::size_t kStackBytes = std::size_t(1) << 20;
#else
    constexpr std::size_t kStackBytes = std::size_t(1) << 22;
#endif
    pthread_attr_t attributes;
    pthread_attr_init(&attributes);
    pthread_attr_setstacksize(&attributes, kStackBytes);
    pthread_t thread;
    auto const run = [](void* argument) -> void* {
        (*static_cast<void (**)()>(argument))();
        return nullptr;
    };
    ASSERT_EQ(pthread_create(&thread, &attributes, run, &work), 0);
    pthread_join(thread, nullptr);
    pthread_attr_destroy(&attributes);
}

TEST(TagLanguage, ChainsOfAnyLengthNeedNoStack)
{
    onSmallStack([] {
        std::string const text = "a0" + repeated(" + a1 - !b ^ (c - d)", 33'334);
        auto const tree = parseTagExpression(text);
        EXPECT_EQ(dumpOf(*tree), text);
        EXPECT_EQ(leftChain(dynamic_cast<BinaryOp&>(*tree)).size(), 100'002u);
        Veldrin::Geometry::TagResolver resolver;
        EXPECT_TRUE(resolver.parses(Nexil::String(text.c_str())));
        Nexil::String component = "unset";
        EXPECT_TRUE(resolver.resolve(*Veldrin::createObject(), component)->empty());
        EXPECT_EQ(component, "");
    });
}

TEST(TagLanguage, TheDeepestNestingNeedsLittleStack)
{
    onSmallStack([] {
        for (auto const& [opening, closing, depth] : {std::tuple{"!", "", 1000},
                                                      {"v(", ")", 1000},
                                                      {"*^(", ")", 1000},
                                                      {"(", "+*)", 1000},
                                                      {"(!* - a*)^v(", ")", 999},
                                                      {"(* + !a)^!(", ")", 499}}) {
            Veldrin::Geometry::TagResolver resolver;
            ASSERT_TRUE(
                resolver.parses(Nexil::String((repeated(opening, depth) + "*" + repeated(closing, depth)).c_str())));
            Nexil::String component;
            (void)resolver.resolve(*Veldrin::createObject(), component);
            EXPECT_EQ(component, "point_component");
        }
    });
}

TEST(TagLanguage, AResolverKeepsTheLastExpressionThatParsed)
{
    using Veldrin::Geometry::TagResolver;
    auto const geometry = Veldrin::createObject();
    TagResolver resolver;
    Nexil::String component = "unset";
    EXPECT_FALSE(resolver.parses("a +"));
    EXPECT_EQ(resolver.resolve(*geometry, component), nullptr);
    EXPECT_EQ(component, "unset");
    auto const status = resolver.parses("*");
    EXPECT_TRUE(status && status.message.empty() && TagResolver::Status());
    EXPECT_FALSE(resolver.parses("a b"));
    TagResolver const moved = std::move(resolver);
    EXPECT_NE(moved.resolve(*geometry, component), nullptr);
    EXPECT_EQ(component, "point_component");
}

} // namespace
